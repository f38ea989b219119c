#include "measure/MeasureOptions.h"

#include <sstream>
#include <string>

#include <gtest/gtest.h>

namespace {

TEST(MeasureOptions, AreWrittenWhereGiven) {
    NerovaMeasureParams params;
    EXPECT_EQ(measure::optionsText(params), "-pwd\n\"\"\n");
    params.forceWhiteFlood = "False";
    params.unassigned = "x";
    params.pwd = "a \"b\"";
    params.apnm = L"\u00e4 \\ \"\xdcff\"";
    EXPECT_EQ(measure::optionsText(params),
              "-apnm\n\xc3\xa4 \\ \"\xff\"\n-pwd\n\"a \"b\"\"\n-forceWhiteFlood\nFalse\n");
}

TEST(MeasureOptions, HaveTheOrderOfTheirFields) {
    std::istringstream names(
        "apnm l s user pwd i j m chart chartwidth chartheight paper width height o patch "
        "patchname testmode ncolorref optdevlink opJPFile showjpuialltimes "
        "nomeasureshowdata measit8 createchart4meas forcemeasure previewjpgfile "
        "previewheightratio chartsonly chartspath completepagesize nosettingspage "
        "iterationcount path2copyinputit8 givebackpatchinfo lcanonic isnerovakzserver "
        "kzlogintype eplpath automatic wfid jobname visualchart taglinefile showpdfwfpatch "
        "unassigned showOnly918patch warmupcopiescount add2it8 disablechartsize "
        "measuresetcount showils knownpatch appmetajson showalphaindicators "
        "ismeasdeviceils mediapresetname outputdevicename iteration outputprofile "
        "colorspace outputprofileid dontshowtc1617chart xorigin yorigin forceWhiteFlood");
    NerovaMeasureParams params;
    static_assert(sizeof params == 66 * sizeof(wxString));
    std::string expected;
    int number = 0;
    for (std::string name; names >> name; ++number) {
        const std::string value = std::to_string(number);
        reinterpret_cast<wxString*>(&params)[number] = value;
        if (name != "unassigned") {
            expected += "-" + name + "\n" + (name == "pwd" ? "\"4\"" : value) + "\n";
        }
    }
    EXPECT_EQ(number, 66);
    EXPECT_EQ(measure::optionsText(params), expected);
}

} // namespace
