#include "colour/Difference.h"

#include <algorithm>
#include <cmath>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <lcms2.h>

#include "Csv.h"

using namespace colour;

namespace {

struct Pair {
    Lab first;
    Lab second;
};

cmsCIELab peer(const Lab& lab) {
    return {lab.L, lab.a, lab.b};
}

/// Near and far pairs over all hues, greys among them; the same ones in every run.
std::vector<Pair> somePairs(std::size_t count) {
    std::mt19937 engine(20); // NOLINT: the same pairs each time
    std::uniform_real_distribution<double> lightness(0, 100);
    std::uniform_real_distribution<double> wide(-110, 110);
    std::normal_distribution<double> near(0, 2);
    std::vector<Pair> pairs;
    for (std::size_t i = 0; i < count; ++i) {
        const double spread = i % 4 == 0 ? 0.01 : 1; // a quarter of them nearly grey
        const Lab first{lightness(engine), spread * wide(engine), spread * wide(engine)};
        Lab second{lightness(engine), wide(engine), wide(engine)};
        if (i % 2 == 0)
            second = {first.L + near(engine), first.a + near(engine), first.b + near(engine)};
        pairs.push_back({first, second});
    }
    return pairs;
}

} // namespace

TEST(Difference, Ciede2000GivesThePublishedPairsBothWays) {
    int pairs = 0;
    for (const auto& row : support::readCsv("colour/ciede2000-pairs.csv")) {
        if (row[0] == "L1")
            continue;
        ++pairs;
        const auto cell = [&](int column) { return std::stod(row[column]); };
        const Lab first{cell(0), cell(1), cell(2)};
        const Lab second{cell(3), cell(4), cell(5)};
        EXPECT_NEAR(deltaE2000(first, second), cell(6), 0.00005) << pairs;
        EXPECT_NEAR(deltaE2000(second, first), cell(6), 0.00005) << pairs;
    }
    EXPECT_EQ(pairs, 34);
}

TEST(Difference, OtherFormulasGiveThePublishedFigures) {
    const Pair a{{0.9, 16.3, -2.22}, {0.7, 14.2, -1.80}};
    const Pair b{{69.417, -12.612, -11.271}, {83.386, 39.426, -17.525}};
    const struct {
        int number;
        const char* name;
        Pair pair;
        double expected;
    } cases[] = {
        {0, "CIE76", a, 2.151},      {1, "CIE76", a, 2.151},       {6, "CIE76", a, 2.151},
        {-1, "CIE76", a, 2.151},     {3, "CIE94", a, 1.249},       {2, "CIECMC", a, 1.482},
        {5, "CIECMC_2_1", a, 1.443}, {5, "CIECMC_2_1", b, 44.346},
    };
    for (const auto& c : cases) {
        const Formula formula = formulaFromNumber(c.number);
        EXPECT_STREQ(formulaName(formula), c.name);
        EXPECT_NEAR(difference(formula, c.pair.first, c.pair.second), c.expected, 0.0005)
            << c.number;
    }
    EXPECT_STREQ(formulaName(formulaFromNumber(4)), "CIE2000");
}

TEST(Difference, AgreesWithLittleCms) {
    double worst2000 = 0, worst76 = 0, worstCmc = 0, worstHue = 0;
    for (const Pair& pair : somePairs(20000)) {
        cmsCIELab first = peer(pair.first);
        cmsCIELab second = peer(pair.second);
        const auto gap = [&](Formula formula, double other) {
            return std::abs(difference(formula, pair.first, pair.second) - other);
        };
        worst2000 = std::max(worst2000,
                             gap(Formula::Ciede2000, cmsCIE2000DeltaE(&first, &second, 1, 1, 1)));
        worst76 = std::max(worst76, gap(Formula::Cie76, cmsDeltaE(&first, &second)));
        worstCmc = std::max({worstCmc, gap(Formula::Cmc11, cmsCMCdeltaE(&first, &second, 1, 1)),
                             gap(Formula::Cmc21, cmsCMCdeltaE(&first, &second, 2, 1))});

        const double dC = std::hypot(second.a, second.b) - std::hypot(first.a, first.b);
        const double dH = deltaH(pair.first, pair.second);
        const double dCh = deltaCh(pair.first, pair.second);
        worstHue = std::max(worstHue, std::abs(dH * dH + dC * dC - dCh * dCh));
    }
    EXPECT_LT(worst2000, 1e-9);
    EXPECT_LT(worst76, 1e-9);
    EXPECT_LT(worstCmc, 1e-9);
    EXPECT_LT(worstHue, 1e-9);
}

TEST(Difference, LabAndXyzAgreeWithLittleCms) {
    for (const Pair& pair : somePairs(1000)) {
        const cmsCIELab lab = peer(pair.first);
        cmsCIEXYZ other;
        cmsLab2XYZ(nullptr, &other, &lab);
        const Xyz xyz = xyzFromLab(pair.first);
        EXPECT_LE(std::hypot(xyz.X - other.X * 100, xyz.Y - other.Y * 100, xyz.Z - other.Z * 100),
                  1e-3);
        EXPECT_LE(deltaE76(labFromXyz(xyz), pair.first), 1e-9);
    }
}
