// SPDX-License-Identifier: Apache-2.0
#include "colour/Spectra.h"

#include <cmath>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/CgatsText.h"
#include "colour/Difference.h"

using namespace colour;

namespace {

/// Smooth reflectances like those of inks: a base, a hump and an edge that move with `patch`.
double reflectance(int patch, int wavelength) {
    const double hump = std::exp(-std::pow((wavelength - 400 - 11 * patch) / 45.0, 2));
    const double edge = 1 / (1 + std::exp((650 - 9 * patch - wavelength) / 18.0));
    return 0.03 + 0.02 * (patch % 5) + 0.4 * hump + 0.45 * edge;
}

std::vector<double> reflectances(int patch, const SpectralAxis& axis) {
    std::vector<double> values;
    for (int i = 0; i < axis.length; ++i) {
        values.push_back(reflectance(patch, axis.base + i * axis.step));
    }
    return values;
}

/// Colours of some spectra by spec2cie, with one value per nm.
std::vector<Lab> askSpec2cie(int patches) {
    const SpectralAxis axis{360, 1, 471};
    std::ostringstream text;
    text << "CTI3\n\nDEVICE_CLASS \"OUTPUT\"\nCOLOR_REP \"RGB_XYZ\"\nSPECTRAL_BANDS \"471\"\n"
         << "SPECTRAL_START_NM \"360\"\nSPECTRAL_END_NM \"830\"\nNUMBER_OF_FIELDS 478\n"
         << "BEGIN_DATA_FORMAT\nSAMPLE_ID RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z";
    for (int nm = 360; nm <= 830; ++nm) {
        text << " SPEC_" << nm;
    }
    text << "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " << patches << "\nBEGIN_DATA\n";
    text.precision(12);
    for (int patch = 0; patch < patches; ++patch) {
        text << patch + 1 << " 0 0 0 0 0 0";
        for (const double value : reflectances(patch, axis)) {
            text << ' ' << 100 * value;
        }
        text << '\n';
    }
    const support::ScratchFolder folder;
    const auto outcome =
        support::run({"spec2cie", "-n", folder.write("in.ti3", text.str() + "END_DATA\n"),
                      folder.path("out.ti3")});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;

    DataSet set;
    EXPECT_EQ(readCgats(support::contentsOf(folder.path("out.ti3")), {false}, set), Failure::None);
    return set.lab;
}

} // namespace

// On every axis, the perfect diffuser is the white point of ASTM E308, and spectra agree with
// spec2cie at 1 nm. It interpolates D50 linearly, which differs by up to a hundredth. The edges
// here are 18 nm wide, so 20 nm must lose some detail.
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
    const int unusable[][3] = {{380, 10, 0},  {410, 10, 30},        {400, 10, 30},
                               {360, 25, 20}, {2147483647, 1, 400}, {0, 20, 2147483647}};
    for (const auto& [base, step, length] : unusable) {
        EXPECT_FALSE(spectraUsable({base, step, length})) << base << ' ' << step;
    }
}
