// SPDX-License-Identifier: Apache-2.0
#include "colour/ToneValue.h"

#include <cmath>
#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "colour/Density.h"
#include "colour/Difference.h"
#include "colour/Spectra.h"

using namespace colour;

namespace {

/// The rows of a file in tests/data/colour, without comments and heading.
std::vector<std::vector<std::string>> rowsOf(const std::string& name) {
    std::ifstream file(TINTGATE_SOURCE_DIR "/tests/data/colour/" + name);
    std::vector<std::vector<std::string>> rows;
    for (std::string line; std::getline(file, line);) {
        if (line.starts_with('#')) {
            continue;
        }
        std::istringstream cells(line);
        rows.emplace_back();
        for (std::string cell; std::getline(cells, cell, ',');) {
            rows.back().push_back(cell);
        }
    }
    EXPECT_GT(rows.size(), 1U) << name;
    rows.erase(rows.begin());
    return rows;
}

} // namespace

TEST(ToneValue, AgreesWithFiguresOfFogra39) {
    struct Tint {
        double nominal;
        Xyz xyz;
        double sctv, tone;
    };
    std::map<char, std::vector<Tint>> ramps;
    for (const auto& row : rowsOf("tone-values-fogra39.csv")) {
        std::vector<double> values;
        for (std::size_t i = 1; i < row.size(); ++i) {
            values.push_back(std::stod(row[i]));
        }
        ramps[row[0][0]].push_back(
            {values[0], {values[1], values[2], values[3]}, values[4], values[5]});
    }
    const std::map<char, ProcessInk> inks = {{'C', ProcessInk::Cyan},
                                             {'M', ProcessInk::Magenta},
                                             {'Y', ProcessInk::Yellow},
                                             {'K', ProcessInk::Black}};
    ASSERT_EQ(ramps.size(), inks.size());
    for (const auto& [letter, ramp] : ramps) {
        const ProcessInk ink = inks.at(letter);
        const Xyz paper = ramp.front().xyz;
        const Xyz solid = ramp.back().xyz;
        // The figures are for white 96.422, 100, 82.521, of which Lab has the ICC's rounding.
        const auto lab = [](const Xyz& xyz) {
            return labFromXyz({xyz.X * 96.42 / 96.422, xyz.Y, xyz.Z * 82.49 / 82.521});
        };
        for (const Tint& tint : ramp) {
            SCOPED_TRACE(letter + std::to_string(tint.nominal));
            EXPECT_NEAR(*toneValue(colorimetricReflectance(ink, paper),
                                   colorimetricReflectance(ink, solid),
                                   colorimetricReflectance(ink, tint.xyz)),
                        tint.tone, 1e-6);
            EXPECT_NEAR(*spotToneValue(lab(paper), lab(solid), lab(tint.xyz)), tint.sctv, 1e-6);
        }
        EXPECT_FALSE(toneValue(paper.Y, paper.Y, 1));
        EXPECT_FALSE(spotToneValue(lab(paper), lab(paper), lab(solid)));
    }
}

TEST(ToneValue, HasTheCurvesOfPublishedSets) {
    for (const auto& row : rowsOf("tone-curves.csv")) {
        const double nominal = std::stod(row[0]);
        SCOPED_TRACE(nominal);
        EXPECT_NEAR(toneIncrease(ToneCurve::A, nominal), std::stod(row[1]), 0.07);
        EXPECT_NEAR(toneIncrease(ToneCurve::B, nominal), std::stod(row[2]), 0.21);
        EXPECT_NEAR(toneIncrease(ToneCurve::C, nominal), std::stod(row[3]), 0.25);
    }
    for (const double nominal : {-1.0, 0.0, 100.0, 101.0}) {
        EXPECT_EQ(toneIncrease(ToneCurve::A, nominal), 0);
    }
}

TEST(Density, AgreesWithSumsWrittenOut) {
    const DensityFilter filters[] = {DensityFilter::Red, DensityFilter::Green, DensityFilter::Blue,
                                     DensityFilter::Visual};
    for (const auto& row : rowsOf("densities.csv")) {
        std::istringstream cells(row[4]);
        std::vector<double> values;
        for (double value = 0; cells >> value;) {
            values.push_back(value);
        }
        ASSERT_EQ(values.size(), 36U);
        std::vector<double> everyOther; // 380, 400 .. 720: what 20 nm leave of a smooth spectrum
        for (std::size_t i = 0; i < values.size(); i += 2) {
            everyOther.push_back(values[i]);
        }
        for (std::size_t i = 0; i < 4; ++i) {
            const double expected = std::stod(row[i]);
            const DensityWeights fine({380, 10, 36}, filters[i]);
            const DensityWeights coarse({380, 20, 18}, filters[i]);
            EXPECT_NEAR(densityOf(fine.reflectance(values.data())), expected, 1e-7);
            EXPECT_NEAR(densityOf(coarse.reflectance(everyOther.data())), expected, 0.02);
            // Every 5 nm, straight lines between.
            std::vector<double> dense{values[0]};
            for (std::size_t k = 1; k < values.size(); ++k) {
                dense.push_back((values[k - 1] + values[k]) / 2);
                dense.push_back(values[k]);
            }
            const DensityWeights half({380, 5, 71}, filters[i]);
            EXPECT_NEAR(densityOf(half.reflectance(dense.data())), expected, 0.02);
        }
    }
    EXPECT_TRUE(std::isinf(densityOf(0)));
}
