#include "colour/Profile.h"

#include <cmath>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <lcms2.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/Difference.h"

using namespace colour;
using support::contentsOf;

namespace {

const std::string iccFolder = "/usr/share/color/icc/";
constexpr cmsCIEXYZ paper{0.8448, 0.8762, 0.7457};

/// A press on which every ink takes its share off, so that any interpolation gives the exact
/// colour.
Lab relativeLab(const double* inks) {
    const double c = inks[0] / 100, m = inks[1] / 100, y = inks[2] / 100, k = inks[3] / 100;
    return {100 - 16 * c - 22 * m - 5 * y - 50 * k, -30 * c + 60 * m - 5 * y - 2 * k,
            -40 * c - 4 * m + 80 * y + 3 * k};
}

Lab absoluteLab(const double* inks) {
    const Xyz relative = xyzFromLab(relativeLab(inks));
    const cmsCIEXYZ* d50 = cmsD50_XYZ();
    return labFromXyz({relative.X * paper.X / d50->X, relative.Y * paper.Y / d50->Y,
                       relative.Z * paper.Z / d50->Z});
}

struct Made {
    double version = 4.3;
    bool floating = false; ///< A table of floats (D2B1) instead of one of 16 bits (A2B1).
    bool withWhite = true;
    bool withTable = true;
    cmsProfileClassSignature profileClass = cmsSigOutputClass;
};

/// Bytes of a profile of that press with a table of two steps for each ink.
std::string makeProfile(const Made& made) {
    cmsContext context = cmsCreateContext(nullptr, nullptr);
    cmsHPROFILE profile = cmsCreateProfilePlaceholder(context);
    cmsSetProfileVersion(profile, made.version);
    cmsSetDeviceClass(profile, made.profileClass);
    cmsSetColorSpace(profile, cmsSigCmykData);
    cmsSetPCS(profile, cmsSigLabData);
    cmsMLU* text = cmsMLUalloc(context, 1);
    cmsMLUsetWide(text, "en", "US", L"Press \u00e9");
    cmsWriteTag(profile, cmsSigProfileDescriptionTag, text);
    cmsMLUfree(text);
    if (made.withWhite)
        cmsWriteTag(profile, cmsSigMediaWhitePointTag, &paper);

    // The Lab encodings of 16 bits (ICC.1, 6.3.4.2 and 10.10) differ by 65280/65535.
    const double scale = made.version < 4 ? 65280 : 65535;
    std::vector<cmsUInt16Number> words;
    std::vector<cmsFloat32Number> floats;
    for (int node = 0; node < 16; ++node) {
        const double inks[] = {node & 8 ? 100. : 0, node & 4 ? 100. : 0, node & 2 ? 100. : 0,
                               node & 1 ? 100. : 0};
        const Lab lab = relativeLab(inks);
        for (const double value : {lab.L / 100, (lab.a + 128) / 255, (lab.b + 128) / 255}) {
            words.push_back(static_cast<cmsUInt16Number>(std::lround(value * scale)));
            floats.push_back(static_cast<cmsFloat32Number>(value));
        }
    }
    cmsPipeline* table = cmsPipelineAlloc(context, 4, 3);
    if (!made.floating && made.version >= 4) // The layout of version 4 wants curves on both sides.
        cmsPipelineInsertStage(table, cmsAT_END, cmsStageAllocToneCurves(context, 4, nullptr));
    cmsPipelineInsertStage(table, cmsAT_END,
                           made.floating ? cmsStageAllocCLutFloat(context, 2, 4, 3, floats.data())
                                         : cmsStageAllocCLut16bit(context, 2, 4, 3, words.data()));
    if (!made.floating && made.version >= 4)
        cmsPipelineInsertStage(table, cmsAT_END, cmsStageAllocToneCurves(context, 3, nullptr));
    if (made.floating) { // Tables of floats give L*, a*, b* as such.
        const double stretch[] = {100, 0, 0, 0, 255, 0, 0, 0, 255};
        const double shift[] = {0, -128, -128};
        cmsPipelineInsertStage(table, cmsAT_END,
                               cmsStageAllocMatrix(context, 3, 3, stretch, shift));
    }
    if (made.withTable)
        cmsWriteTag(profile, made.floating ? cmsSigDToB3Tag : cmsSigAToB1Tag, table);
    cmsPipelineFree(table);

    cmsUInt32Number size = 0;
    EXPECT_TRUE(cmsSaveProfileToMem(profile, nullptr, &size));
    std::string bytes(size, '\0');
    cmsSaveProfileToMem(profile, bytes.data(), &size);
    cmsCloseProfile(profile);
    cmsDeleteContext(context);
    return bytes;
}

std::vector<double> someInks(std::size_t count) {
    std::mt19937 engine(4); // NOLINT: the same patches each time
    std::uniform_real_distribution<double> percent(0, 100);
    std::vector<double> inks = {0, 0, 0,   0, 100, 0, 0, 0,   0,   100, 0,   0,
                                0, 0, 100, 0, 0,   0, 0, 100, 100, 100, 100, 100};
    while (inks.size() < 4 * count)
        inks.push_back(percent(engine));
    return inks;
}

/// The colours that a command prints, fed with the inks one patch a line.
std::vector<Lab> ask(const std::string& command, const std::vector<double>& inks, double scale) {
    const support::ScratchFolder folder;
    std::ostringstream lines;
    lines.precision(12);
    for (std::size_t i = 0; i < inks.size(); ++i)
        lines << inks[i] * scale << (i % 4 == 3 ? '\n' : ' ');
    const auto outcome =
        support::run({"sh", "-c", command + " < " + folder.write("inks", lines.str())});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
    std::istringstream answers(outcome.output);
    std::vector<Lab> labs;
    for (Lab lab; answers >> lab.L >> lab.a >> lab.b;)
        labs.push_back(lab);
    return labs;
}

} // namespace

TEST(Profile, EncodingsAndMediaWhite) {
    const std::vector<double> inks = someInks(1200); // more than LittleCMS is given at a time
    for (const Made& made : {Made{2.1}, Made{2.4}, Made{4.3}, Made{4.4, true}}) {
        SCOPED_TRACE(std::to_string(made.version) + (made.floating ? " floating" : ""));
        Profile profile;
        ASSERT_EQ(profile.open(makeProfile(made)), Failure::None);
        EXPECT_EQ(profile.description(), "Press \u00e9");
        std::vector<Lab> labs(1200);
        ASSERT_EQ(profile.evaluate(inks.data(), labs.size(), 4, labs.data()), Failure::None);
        for (std::size_t i = 0; i < labs.size(); ++i)
            ASSERT_LE(deltaE76(labs[i], absoluteLab(&inks[4 * i])), 0.01) << i;

        // Further channels behind the four are skipped, and inks beyond 0 and 100 are cut.
        const double wide[] = {-3, 130, 0, 0, 55, 99, 0, 0, 40, 0, 55, 99};
        const double cut[] = {0, 100, 0, 0};
        profile.evaluate(wide, 2, 6, labs.data());
        EXPECT_LE(deltaE76(labs[0], absoluteLab(cut)), 0.01);
        EXPECT_LE(deltaE76(labs[1], absoluteLab(wide + 6)), 0.01);
    }
}

// The two tools interpolate in different ways, so that icclu is asked for nodes of the table alone.
TEST(Profile, AgreesWithTransiccAndIcclu) {
    const std::string path = iccFolder + "ghostscript/default_cmyk.icc";
    const std::vector<double> inks = someInks(500);
    Profile profile;
    ASSERT_EQ(profile.open(contentsOf(path)), Failure::None);
    std::vector<Lab> labs(500);
    profile.evaluate(inks.data(), labs.size(), 4, labs.data());
    const auto transicc = ask("transicc -n -t3 '-o*Lab4' -i" + path, inks, 1);
    const auto icclu = ask("icclu -v0 -ff -ia -pl " + path, inks, 0.01);
    ASSERT_EQ(transicc.size(), labs.size());
    ASSERT_EQ(icclu.size(), labs.size());
    for (std::size_t i = 0; i < labs.size(); ++i) {
        EXPECT_LE(deltaE76(labs[i], transicc[i]), 0.01) << i;
        EXPECT_LE(deltaE76(labs[i], icclu[i]), i < 6 ? 0.01 : 0.5) << i;
    }
}

TEST(Profile, OneFailureForOneCause) {
    const std::string good = makeProfile({});
    std::string shortened = good, lies = good, noSignature = good;
    shortened.pop_back();
    lies[0] = '\x7F';
    noSignature[36] = 'x';
    const struct {
        std::string bytes;
        Failure failure;
    } cases[] = {
        {"", Failure::ProfileDamaged},
        {"CGATS.17\n" + std::string(200, ' '), Failure::ProfileDamaged},
        {noSignature, Failure::ProfileDamaged},
        {shortened, Failure::ProfileDamaged},
        {good.substr(0, 128), Failure::ProfileDamaged},
        {lies, Failure::ProfileDamaged},
        {contentsOf(iccFolder + "sRGB.icc"), Failure::ProfileColourSpace},
        {makeProfile({4.3, false, true, true, cmsSigLinkClass}), Failure::ProfileClass},
        {makeProfile({4.3, false, false}), Failure::ProfileUnusable},       // no media white
        {makeProfile({4.3, false, true, false}), Failure::ProfileUnusable}, // no table
        {good + std::string(64, '\0'), Failure::None},
    };
    for (std::size_t i = 0; i < std::size(cases); ++i)
        EXPECT_EQ(Profile().open(cases[i].bytes), cases[i].failure) << i;
    // A failed open leaves an open profile as it was.
    Profile profile;
    ASSERT_EQ(profile.open(good), Failure::None);
    EXPECT_EQ(profile.open(noSignature), Failure::ProfileDamaged);
    EXPECT_FALSE(profile.description().empty());
}
