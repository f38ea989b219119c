#include "colour/Spectra.h"

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

std::string number(int wavelength) {
    return std::to_string(wavelength);
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
        EXPECT_NEAR(xyz.X, table[i][0], 0.0006) << 400 + 10 * i;
        EXPECT_NEAR(xyz.Y, table[i][1], 0.0006) << 400 + 10 * i;
        EXPECT_NEAR(xyz.Z, table[i][2], 0.0006) << 400 + 10 * i;
    }
}

// Whatever the axis, the perfect diffuser is the white point of ASTM E308, and a smooth spectrum
// gives nearly the colour that it gives at 1 nm: the edges here are 18 nm wide, so that sampling
// every 20 nm must cost something.
TEST(Spectra, AllAxesAgree) {
    const struct {
        SpectralAxis axis;
        double tolerance; ///< In CIE76 against the spectrum at 1 nm.
    } cases[] = {{{360, 1, 471}, 0},    {{360, 5, 95}, 0.001}, {{300, 5, 131}, 0.001},
                 {{360, 10, 48}, 0.02}, {{340, 10, 40}, 0.02}, {{380, 10, 36}, 0.02},
                 {{375, 10, 38}, 0.02}, {{360, 20, 24}, 0.25}, {{400, 20, 16}, 0.25},
                 {{400, 10, 31}, 0.1}};
    const SpectralAxis fine{360, 1, 471};
    const SpectralWeights fineWeights(fine);
    for (const auto& c : cases) {
        SCOPED_TRACE(number(c.axis.base) + " by " + number(c.axis.step));
        ASSERT_TRUE(spectraUsable(c.axis));
        const SpectralWeights weights(c.axis);
        const Xyz white = weights.xyz(std::vector<double>(c.axis.length, 1.0).data());
        EXPECT_NEAR(white.X, 96.422, 0.001);
        EXPECT_NEAR(white.Y, 100.000, 0.001);
        EXPECT_NEAR(white.Z, 82.521, 0.001);
        for (int patch = 0; patch < 30; ++patch) {
            const Xyz xyz = weights.xyz(reflectances(patch, c.axis).data());
            const Xyz expected = fineWeights.xyz(reflectances(patch, fine).data());
            EXPECT_LE(deltaE76(labFromXyz(xyz), labFromXyz(expected)), c.tolerance) << patch;
        }
    }
}

// spec2cie integrates with D50 drawn in straight lines between the entries of its table, which
// accounts for the hundredth.
TEST(Spectra, AgreesWithSpec2cie) {
    const support::ScratchFolder folder;
    const int patches = 30;
    for (const SpectralAxis axis : {SpectralAxis{360, 1, 471}, SpectralAxis{360, 10, 48},
                                    SpectralAxis{380, 10, 36}, SpectralAxis{400, 10, 31}}) {
        SCOPED_TRACE(number(axis.base) + " by " + number(axis.step));
        std::ostringstream input;
        const int end = axis.base + axis.step * (axis.length - 1);
        input << "CTI3\n\nKEYWORD \"DEVICE_CLASS\"\nDEVICE_CLASS \"OUTPUT\"\n"
              << "KEYWORD \"COLOR_REP\"\nCOLOR_REP \"RGB_XYZ\"\n"
              << "KEYWORD \"SPECTRAL_BANDS\"\nSPECTRAL_BANDS \"" << axis.length << "\"\n"
              << "KEYWORD \"SPECTRAL_START_NM\"\nSPECTRAL_START_NM \"" << axis.base << "\"\n"
              << "KEYWORD \"SPECTRAL_END_NM\"\nSPECTRAL_END_NM \"" << end << "\"\n";
        std::string names = "SAMPLE_ID RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z";
        for (int i = 0; i < axis.length; ++i) {
            const std::string name = "SPEC_" + number(axis.base + i * axis.step);
            input << "KEYWORD \"" << name << "\"\n";
            names += ' ' + name;
        }
        input << "NUMBER_OF_FIELDS " << axis.length + 7 << "\nBEGIN_DATA_FORMAT\n"
              << names << "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " << patches << "\nBEGIN_DATA\n";
        input.precision(12);
        for (int patch = 0; patch < patches; ++patch) {
            input << patch + 1 << " 0 0 0 0 0 0";
            for (const double value : reflectances(patch, axis))
                input << ' ' << 100 * value;
            input << '\n';
        }
        input << "END_DATA\n";
        const auto outcome = support::run(
            {"spec2cie", "-n", folder.write("in.ti3", input.str()), folder.path("out.ti3")});
        ASSERT_EQ(outcome.exitCode, 0) << outcome.error;

        std::istringstream output(support::contentsOf(folder.path("out.ti3")));
        std::string line;
        while (std::getline(output, line) && line != "BEGIN_DATA") {
        }
        const SpectralWeights weights(axis);
        for (int patch = 0; patch < patches; ++patch) {
            double id, rgb;
            Xyz xyz;
            Lab lab;
            ASSERT_TRUE(output >> id >> rgb >> rgb >> rgb >> xyz.X >> xyz.Y >> xyz.Z >> lab.L >>
                        lab.a >> lab.b);
            const Lab ours = labFromXyz(weights.xyz(reflectances(patch, axis).data()));
            EXPECT_LE(deltaE76(ours, lab), 0.03) << patch;
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
