// SPDX-License-Identifier: Apache-2.0
#include "measure/MeasureOptions.h"

#include <sstream>
#include <string>

#include <gtest/gtest.h>

namespace {

TEST(MeasureOptions, AreWrittenWhereGivenInTheOrderOfTheirFields) {
    NerovaMeasureParams params;
    EXPECT_EQ(measure::optionsText(params), "-pwd\n\"\"\n");
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
    static_assert(sizeof params == 66 * sizeof(wxString));
    std::string expected;
    auto* field = reinterpret_cast<wxString*>(&params);
    for (std::string name; names >> name; ++field) {
        *field = L"\u00e4 \\ \"\xdcff\" " + name;
        if (name != "unassigned") {
            const std::string value = "\xc3\xa4 \\ \"\xff\" " + name;
            expected += "-" + name + "\n" + (name == "pwd" ? "\"" + value + "\"" : value) + "\n";
        }
    }
    EXPECT_EQ(measure::optionsText(params), expected);
}

} // namespace
