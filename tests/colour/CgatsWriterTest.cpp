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

void expectSame(const DataSet& left, const DataSet& right) {
    EXPECT_EQ(left.patchCount, right.patchCount);
    EXPECT_EQ(left.ids, right.ids);
    EXPECT_EQ(left.names, right.names);
    EXPECT_EQ(left.deviceSpace, right.deviceSpace);
    EXPECT_EQ(left.channels, right.channels);
    EXPECT_EQ(left.device, right.device);
    EXPECT_EQ(left.spectra, right.spectra);
    EXPECT_EQ(left.axis.base, right.axis.base);
    EXPECT_EQ(left.axis.step, right.axis.step);
    EXPECT_EQ(left.axis.length, right.axis.length);
    EXPECT_EQ(left.originator, right.originator);
    EXPECT_EQ(left.descriptor, right.descriptor);
    EXPECT_EQ(left.created, right.created);
    EXPECT_EQ(left.instrumentation, right.instrumentation);
    EXPECT_EQ(left.conditions, right.conditions);
    ASSERT_EQ(left.lab.size(), right.lab.size());
    ASSERT_EQ(left.xyz.size(), right.xyz.size());
    for (std::size_t i = 0; i < left.lab.size(); ++i) {
        EXPECT_EQ(left.lab[i].L, right.lab[i].L);
        EXPECT_EQ(left.lab[i].a, right.lab[i].a);
        EXPECT_EQ(left.lab[i].b, right.lab[i].b);
        EXPECT_EQ(left.xyz[i].X, right.xyz[i].X);
        EXPECT_EQ(left.xyz[i].Y, right.xyz[i].Y);
        EXPECT_EQ(left.xyz[i].Z, right.xyz[i].Z);
    }
}

DataSet readBack(const DataSet& set) {
    DataSet back;
    EXPECT_EQ(readCgats(writeCgats(set), {}, back), Failure::None) << writeCgats(set);
    for (const std::string& note : back.notes)
        EXPECT_THAT(note,
                    HasSubstr("other conditions than D50")); // nothing assumed, nothing mended
    return back;
}

/// Patches with values of full length.
DataSet randomSet(std::size_t patches, bool withSpectra) {
    std::mt19937_64 engine(11);
    std::uniform_real_distribution<double> unit(0, 1);
    DataSet set;
    set.patchCount = patches;
    set.deviceSpace = DeviceSpace::Cmyk;
    set.channels = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    if (withSpectra)
        set.axis = {380, 10, 36};
    for (std::size_t i = 0; i < patches; ++i) {
        set.ids.push_back(std::to_string(i + 1));
        for (int k = 0; k < 4; ++k)
            set.device.push_back(100 * unit(engine));
        set.lab.push_back({100 * unit(engine), 120 * unit(engine) - 60, 120 * unit(engine) - 60});
        set.xyz.push_back(xyzFromLab(set.lab.back()));
        for (int k = 0; k < set.axis.length; ++k)
            set.spectra.push_back(unit(engine));
    }
    return set;
}

} // namespace

TEST(CgatsWriter, IsReadBackToTheLastBit) {
    DataSet set = randomSet(200, true);
    set.originator = "Müller \"& Co\"";
    set.descriptor = "a\ttab, a # and 5\"";
    set.created = "2024-05-03T10:11:12+02:00";
    set.instrumentation = "none";
    set.conditions = {"F11", "10", "M2"};
    set.names.assign(200, "plain");
    set.names[1] = "";
    set.names[2] = "Paper white";
    set.names[3] = "#1 \"quoted\"";
    set.names[4] = "Größe";
    set.ids[5] = "END_DATA";
    set.ids[6] = set.ids[7];
    set.ids[8] = "a,b;c";
    expectSame(readBack(set), set);
}

// Sets that don't show their own scale.
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
    expectSame(readBack(dark), dark);

    DataSet device = dark;
    device.spectra.clear();
    device.axis = {};
    device.xyz.clear();
    device.lab.clear();
    device.deviceSpace = DeviceSpace::Rgb;
    device.channels = {"RGB_R", "RGB_G", "RGB_B"};
    device.device = {0.5, 1, 0};
    expectSame(readBack(device), device);
}

// ArgyllCMS as a second reader: it finds no difference between a text of ours and one of its own,
// and makes a profile's input of it.
TEST(CgatsWriter, IsReadByArgyll) {
    const support::ScratchFolder folder;
    DataSet fogra;
    ASSERT_EQ(readCgats(support::contentsOf("/usr/share/color/icc/FOGRA39L.ti3"), {}, fogra),
              Failure::None);
    const std::string ours = folder.write("ours.txt", writeCgats(fogra));
    const support::Outcome compared =
        support::run({"colverify", "-v", "/usr/share/color/icc/FOGRA39L.ti3", ours});
    EXPECT_EQ(compared.exitCode, 0) << compared.error;
    EXPECT_THAT(compared.output, HasSubstr("No of test patches = 1617"));
    EXPECT_THAT(compared.output, HasSubstr("peak = 0.000000, avg = 0.000000"));

    const std::string measured = folder.write("measured.txt", writeCgats(randomSet(50, true)));
    const support::Outcome converted = support::run({"txt2ti3", measured, folder.path("measured")});
    EXPECT_EQ(converted.exitCode, 0) << converted.error;
    DataSet back;
    ASSERT_EQ(readCgats(support::contentsOf(folder.path("measured.ti3")), {}, back), Failure::None);
    EXPECT_EQ(back.patchCount, 50U);
    EXPECT_EQ(back.axis.length, 36);
    const DataSet set = randomSet(50, true);
    for (std::size_t i = 0; i < 50; ++i) {
        EXPECT_NEAR(back.device[4 * i], set.device[4 * i], 1e-3);
        EXPECT_NEAR(back.spectra[36 * i + 7], set.spectra[36 * i + 7], 1e-5);
    }
}
