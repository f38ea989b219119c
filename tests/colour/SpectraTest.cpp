#include "colour/Spectra.h"

#include <algorithm>
#include <cmath>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/Difference.h"

using namespace colour;

namespace {

/// Smooth reflectances as inks have them: a base, a hump and an edge that wander with `patch`.
double reflectance(int patch, int wavelength) {
    const double hump = std::exp(-std::pow((wavelength - 400 - 11 * patch) / 45.0, 2));
    const double edge = 1 / (1 + std::exp((650 - 9 * patch - wavelength) / 18.0));
    return 0.03 + 0.02 * (patch % 5) + 0.4 * hump + 0.45 * edge;
}

std::vector<double> reflectances(int patch, const SpectralAxis& axis) {
    std::vector<double> values;
    for (int i = 0; i < axis.length; ++i)
        values.push_back(reflectance(patch, axis.base + i * axis.step));
    return values;
}

/// Colours of some spectra by spec2cie, which is given them every nm.
std::vector<Lab> askSpec2cie(int patches) {
    const SpectralAxis axis{360, 1, 471};
    std::ostringstream text;
    text << "CTI3\n\nDEVICE_CLASS \"OUTPUT\"\nCOLOR_REP \"RGB_XYZ\"\nSPECTRAL_BANDS \"471\"\n"
         << "SPECTRAL_START_NM \"360\"\nSPECTRAL_END_NM \"830\"\nNUMBER_OF_FIELDS 478\n"
         << "BEGIN_DATA_FORMAT\nSAMPLE_ID RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z";
    for (int nm = 360; nm <= 830; ++nm)
        text << " SPEC_" << nm;
    text << "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " << patches << "\nBEGIN_DATA\n";
    text.precision(12);
    for (int patch = 0; patch < patches; ++patch) {
        text << patch + 1 << " 0 0 0 0 0 0";
        for (const double value : reflectances(patch, axis))
            text << ' ' << 100 * value;
        text << '\n';
    }
    const support::ScratchFolder folder;
    const auto outcome =
        support::run({"spec2cie", "-n", folder.write("in.ti3", text.str() + "END_DATA\n"),
                      folder.path("out.ti3")});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;

    std::istringstream output(support::contentsOf(folder.path("out.ti3")));
    for (std::string line; line != "BEGIN_DATA" && std::getline(output, line);) {
    }
    std::vector<Lab> labs;
    double skipped = 0;
    for (Lab lab; output >> skipped >> skipped >> skipped >> skipped >> skipped >> skipped >>
                  skipped >> lab.L >> lab.a >> lab.b;)
        labs.push_back(lab);
    return labs;
}

} // namespace

// The table of ASTM E308 for D50 and the 1931 observer at 10 nm, 400 to 730 nm. With the ends of
// 360 to 830 nm on the axis, these weights have nothing folded into them.
TEST(Spectra, WeightsAreThoseOfAstmE308) {
    const double table[][3] = {
        {0.060, 0.002, 0.285},  {0.234, 0.006, 1.113},  {0.775, 0.023, 3.723},
        {1.610, 0.066, 7.862},  {2.453, 0.162, 12.309}, {2.777, 0.313, 14.647},
        {2.500, 0.514, 14.346}, {1.717, 0.798, 11.299}, {0.861, 1.239, 7.309},
        {0.283, 1.839, 4.128},  {0.040, 2.948, 2.466},  {0.088, 4.632, 1.447},
        {0.593, 6.587, 0.736},  {1.590, 8.308, 0.401},  {2.799, 9.197, 0.196},
        {4.207, 9.650, 0.085},  {5.657, 9.471, 0.037},  {7.132, 8.902, 0.020},
        {8.540, 8.112, 0.015},  {9.255, 6.829, 0.010},  {9.835, 5.838, 0.007},
        {9.469, 4.753, 0.004},  {8.009, 3.573, 0.002},  {5.926, 2.443, 0.001},
        {4.171, 1.629, 0.000},  {2.609, 0.984, 0.000},  {1.541, 0.570, 0.000},
        {0.855, 0.313, 0.000},  {0.434, 0.158, 0.000},  {0.194, 0.070, 0.000},
        {0.097, 0.035, 0.000},  {0.050, 0.018, 0.000},  {0.022, 0.008, 0.000},
        {0.012, 0.004, 0.000}};
    const SpectralAxis axis{360, 10, 48};
    const SpectralWeights weights(axis);
    for (int i = 0; i < 34; ++i) {
        std::vector<double> impulse(axis.length);
        impulse[4 + i] = 1;
        const Xyz xyz = weights.xyz(impulse.data());
        const double furthest =
            std::max({std::abs(xyz.X - table[i][0]), std::abs(xyz.Y - table[i][1]),
                      std::abs(xyz.Z - table[i][2])});
        EXPECT_LE(furthest, 0.0006) << 400 + 10 * i;
    }
}

// On every axis the perfect diffuser is the white point of ASTM E308, and spectra give what
// spec2cie makes of them at 1 nm. It draws D50 in straight lines between the entries of its table,
// which is good for a hundredth; the edges here are 18 nm wide, so that 20 nm must miss something.
TEST(Spectra, AllAxesAgreeWithSpec2cie) {
    const int patches = 30;
    const std::vector<Lab> expected = askSpec2cie(patches);
    ASSERT_EQ(expected.size(), patches);
    const struct {
        SpectralAxis axis;
        double tolerance;
    } cases[] = {{{360, 1, 471}, 0.02}, {{360, 5, 95}, 0.02},  {{300, 5, 131}, 0.02},
                 {{360, 10, 48}, 0.03}, {{340, 10, 40}, 0.03}, {{380, 10, 36}, 0.03},
                 {{375, 10, 38}, 0.03}, {{400, 10, 31}, 0.1},  {{360, 20, 24}, 0.25},
                 {{400, 20, 16}, 0.25}};
    for (const auto& c : cases) {
        SCOPED_TRACE(std::to_string(c.axis.base) + " by " + std::to_string(c.axis.step));
        ASSERT_TRUE(spectraUsable(c.axis));
        const SpectralWeights weights(c.axis);
        const Xyz white = weights.xyz(std::vector<double>(c.axis.length, 1.0).data());
        EXPECT_LE(std::hypot(white.X - 96.422, white.Y - 100.000, white.Z - 82.521), 0.001);
        for (int patch = 0; patch < patches; ++patch) {
            const Xyz xyz = weights.xyz(reflectances(patch, c.axis).data());
            EXPECT_LE(deltaE76(labFromXyz(xyz), expected[patch]), c.tolerance) << patch;
        }
    }
}

TEST(Spectra, AxesThatCannotServe) {
    const SpectralAxis unusable[] = {
        {},
        {380, 10, 0},
        {380, 0, 36},
        {380, -10, 36},
        {410, 10, 30},
        {400, 10, 30},
        {360, 25, 20},
        {-10, 10, 99},
        {2147483647, 1, 400},
        {0, 20, 2147483647},
    };
    for (const SpectralAxis& axis : unusable)
        EXPECT_FALSE(spectraUsable(axis)) << axis.base << ' ' << axis.step << ' ' << axis.length;
    EXPECT_TRUE(spectraUsable({400, 20, 16}));
    EXPECT_TRUE(spectraUsable({400, 10, 31}));
}
