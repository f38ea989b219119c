// SPDX-License-Identifier: Apache-2.0
#include "colour/Difference.h"

#include <cmath>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <lcms2.h>

#include "Csv.h"

using namespace colour;

TEST(Difference, Ciede2000GivesThePublishedPairsBothWays) {
    const auto rows = support::readCsv("colour/ciede2000-pairs.csv");
    ASSERT_EQ(rows.size(), 35U); // the first one names the columns
    for (std::size_t i = 1; i < rows.size(); ++i) {
        const auto cell = [&](std::size_t column) { return std::stod(rows[i][column]); };
        const Lab first{cell(0), cell(1), cell(2)};
        const Lab second{cell(3), cell(4), cell(5)};
        EXPECT_NEAR(deltaE2000(first, second), cell(6), 0.00005) << i;
        EXPECT_NEAR(deltaE2000(second, first), cell(6), 0.00005) << i;
    }
}

TEST(Difference, OtherFormulasGiveThePublishedFigures) {
    const Lab near[] = {{0.9, 16.3, -2.22}, {0.7, 14.2, -1.80}};
    const Lab far[] = {{100, 21.57210357, 272.22819350}, {100, 426.67945353, 72.39590835}};
    const struct {
        int number;
        const char* name;
        const Lab* pair;
        double expected;
    } cases[] = {
        {0, "CIE76", near, 2.151},      {1, "CIE76", near, 2.151},  {6, "CIE76", near, 2.151},
        {-1, "CIE76", near, 2.151},     {2, "CIECMC", near, 1.482}, {3, "CIE94", near, 1.249},
        {5, "CIECMC_2_1", near, 1.443}, {3, "CIE94", far, 83.7792},
    };
    for (const auto& [number, name, pair, expected] : cases) {
        const Formula formula = formulaFromNumber(number);
        EXPECT_STREQ(formulaName(formula), name);
        EXPECT_NEAR(difference(formula, pair[0], pair[1]), expected, 0.0005) << number;
    }
    EXPECT_STREQ(formulaName(formulaFromNumber(4)), "CIE2000");
}

// Near and far pairs of all hues, including greys.
TEST(Difference, AgreesWithLittleCms) {
    std::mt19937 engine(20); // NOLINT: the same pairs each time
    std::uniform_real_distribution<double> lightness(0, 100);
    std::uniform_real_distribution<double> wide(-110, 110);
    std::normal_distribution<double> near(0, 2);
    for (int i = 0; i < 20'000; ++i) {
        const double spread = i % 4 == 0 ? 0.01 : 1; // a quarter of them nearly grey
        const Lab first{lightness(engine), spread * wide(engine), spread * wide(engine)};
        Lab second{lightness(engine), wide(engine), wide(engine)};
        if (i % 2 == 0) {
            second = {first.L + near(engine), first.a + near(engine), first.b + near(engine)};
        }
        cmsCIELab a{first.L, first.a, first.b};
        cmsCIELab b{second.L, second.a, second.b};
        const std::pair<Formula, double> peers[] = {
            {Formula::Cie76, cmsDeltaE(&a, &b)},
            {Formula::Ciede2000, cmsCIE2000DeltaE(&a, &b, 1, 1, 1)},
            {Formula::Cmc11, cmsCMCdeltaE(&a, &b, 1, 1)},
            {Formula::Cmc21, cmsCMCdeltaE(&a, &b, 2, 1)},
        };
        for (const auto& [formula, expected] : peers) {
            ASSERT_NEAR(difference(formula, first, second), expected, 1e-9) << formulaName(formula);
        }

        cmsCIEXYZ other;
        cmsLab2XYZ(nullptr, &other, &a);
        const Xyz xyz = xyzFromLab(first);
        ASSERT_LE(std::hypot(xyz.X - other.X * 100, xyz.Y - other.Y * 100, xyz.Z - other.Z * 100),
                  1e-3);
        ASSERT_LE(deltaE76(labFromXyz(xyz), first), 1e-9);
    }
}
