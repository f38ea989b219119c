#include "measure/MeasureOptions.h"

#include <cstddef>

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
    NerovaMeasureParams params;
    constexpr std::size_t count = sizeof params / sizeof(wxString);
    static_assert(count == 66);
    auto* const fields = reinterpret_cast<wxString*>(&params);
    for (std::size_t i = 0; i < count; ++i) {
        fields[i] << i;
    }
    const std::string text = measure::optionsText(params);
    const std::string expected =
        "-apnm\n0\n-l\n1\n-s\n2\n-user\n3\n-pwd\n\"4\"\n-i\n5\n-j\n6\n-m\n7\n-chart\n8\n"
        "-chartwidth\n9\n-chartheight\n10\n-paper\n11\n-width\n12\n-height\n13\n-o\n14\n"
        "-patch\n15\n-patchname\n16\n-testmode\n17\n-ncolorref\n18\n-optdevlink\n19\n"
        "-opJPFile\n20\n-showjpuialltimes\n21\n-nomeasureshowdata\n22\n-measit8\n23\n"
        "-createchart4meas\n24\n-forcemeasure\n25\n-previewjpgfile\n26\n-previewheightratio\n27\n"
        "-chartsonly\n28\n-chartspath\n29\n-completepagesize\n30\n-nosettingspage\n31\n"
        "-iterationcount\n32\n-path2copyinputit8\n33\n-givebackpatchinfo\n34\n-lcanonic\n35\n"
        "-isnerovakzserver\n36\n-kzlogintype\n37\n-eplpath\n38\n-automatic\n39\n-wfid\n40\n"
        "-jobname\n41\n-visualchart\n42\n-taglinefile\n43\n-showpdfwfpatch\n44\n"
        "-showOnly918patch\n46\n-warmupcopiescount\n47\n-add2it8\n48\n-disablechartsize\n49\n"
        "-measuresetcount\n50\n-showils\n51\n-knownpatch\n52\n-appmetajson\n53\n"
        "-showalphaindicators\n54\n-ismeasdeviceils\n55\n-mediapresetname\n56\n"
        "-outputdevicename\n57\n-iteration\n58\n-outputprofile\n59\n-colorspace\n60\n"
        "-outputprofileid\n61\n-dontshowtc1617chart\n62\n-xorigin\n63\n-yorigin\n64\n"
        "-forceWhiteFlood\n65\n";
    EXPECT_EQ(text, expected);
}

} // namespace
