// SPDX-License-Identifier: Apache-2.0
#include <random>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/CgatsText.h"
#include "colour/Difference.h"

using namespace colour;
using testing::HasSubstr;

namespace {

void expectReadBack(const DataSet& set) {
    DataSet back;
    ASSERT_EQ(readCgats(writeCgats(set), {}, back), Failure::None) << writeCgats(set);
    EXPECT_EQ(writeCgats(back), writeCgats(set));
    EXPECT_EQ(back.ids, set.ids);
    EXPECT_EQ(back.names, set.names);
    EXPECT_EQ(back.device, set.device);
    EXPECT_EQ(back.spectra, set.spectra);
    EXPECT_EQ(back.axis.base, set.axis.base);
    EXPECT_EQ(back.lab.back().b, set.lab.back().b);
    EXPECT_EQ(back.xyz.back().Z, set.xyz.back().Z);
    EXPECT_EQ(back.conditions, set.conditions);
    EXPECT_EQ(back.originator + back.created, set.originator + set.created);
    EXPECT_EQ(back.descriptor + back.instrumentation, set.descriptor + set.instrumentation);
    for (const std::string& note : back.notes) { // no assumptions, no repairs
        EXPECT_THAT(note, HasSubstr("other conditions than D50"));
    }
}

/// Patches with values of full length.
DataSet randomSet(std::size_t patches) {
    std::mt19937_64 engine(11);
    std::uniform_real_distribution<double> unit(0, 1);
    DataSet set;
    set.patchCount = patches;
    set.deviceSpace = DeviceSpace::Cmyk;
    set.channels = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    set.axis = {380, 10, 36};
    for (std::size_t i = 0; i < patches; ++i) {
        set.ids.push_back(std::to_string(i + 1));
        for (int k = 0; k < 4; ++k) {
            set.device.push_back(100 * unit(engine));
        }
        set.lab.push_back({100 * unit(engine), 120 * unit(engine) - 60, 120 * unit(engine) - 60});
        set.xyz.push_back(xyzFromLab(set.lab.back()));
        for (int k = 0; k < 36; ++k) {
            set.spectra.push_back(unit(engine));
        }
    }
    return set;
}

} // namespace

TEST(CgatsWriter, IsReadBackToTheLastBit) {
    DataSet set = randomSet(200);
    set.originator = "Müller \"& Co\"";
    set.descriptor = "a\ttab, a # and 5\"";
    set.created = "2024-05-03T10:11:12+02:00";
    set.instrumentation = "none";
    set.conditions = {"D50", "2", "M2"};
    set.names.assign(200, "plain");
    set.names[1] = "";
    set.names[2] = "Paper white";
    set.names[3] = "#1 \"quoted\"";
    set.names[4] = "Größe";
    set.ids[5] = "END_DATA";
    set.ids[6] = set.ids[7];
    set.ids[8] = "a,b;c";
    expectReadBack(set);
}

// A set whose values don't reveal its scales.
TEST(CgatsWriter, StatesItsScales) {
    DataSet dark;
    dark.patchCount = 1;
    dark.ids = {"1"};
    dark.deviceSpace = DeviceSpace::Cmyk;
    dark.channels = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "SPOT_1"};
    dark.device = {0.5, 0.25, 0, 0, 1};
    dark.axis = {400, 10, 31};
    dark.spectra.assign(31, 3.5);
    dark.xyz = {{0.5, 0.25, 0.125}};
    dark.lab = {labFromXyz(dark.xyz[0])};
    expectReadBack(dark);
}

// ArgyllCMS as a second reader, which converts our text to a profile's input.
TEST(CgatsWriter, IsReadByArgyll) {
    const support::ScratchFolder folder;
    const DataSet set = randomSet(50);
    const std::string measured = folder.write("measured.txt", writeCgats(set));
    const support::Outcome converted = support::run({"txt2ti3", measured, folder.path("measured")});
    EXPECT_EQ(converted.exitCode, 0) << converted.error;
    DataSet back;
    ASSERT_EQ(readCgats(support::contentsOf(folder.path("measured.ti3")), {}, back), Failure::None);
    EXPECT_THAT(back.device, testing::Pointwise(testing::DoubleNear(1e-3), set.device));
    EXPECT_THAT(back.spectra, testing::Pointwise(testing::DoubleNear(1e-5), set.spectra));
}
