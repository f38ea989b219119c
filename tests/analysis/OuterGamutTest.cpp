// SPDX-License-Identifier: Apache-2.0
#include "analysis/OuterGamut.h"

#include <array>
#include <cmath>
#include <limits>
#include <optional>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "Csv.h"

namespace {

using Inks = std::array<double, 4>;

std::optional<std::size_t> entry(const Inks& inks) {
    return analysis::outerGamutEntry(inks.data());
}

/// The published list. Its first row names the columns.
std::set<Inks> published() {
    std::set<Inks> list;
    for (const auto& row : support::readCsv("analysis/outer-gamut-226.csv")) {
        if (row.at(0) != "no") {
            list.insert({std::stod(row.at(1)), std::stod(row.at(2)), std::stod(row.at(3)),
                         std::stod(row.at(4))});
        }
    }
    return list;
}

} // namespace

// The rules in the source yield exactly the list. Each entry accepts 0.5 percent of deviation.
TEST(OuterGamut, IsThePublishedList) {
    const std::set<Inks> list = published();
    ASSERT_EQ(list.size(), analysis::outerGamutCount);
    std::set<std::size_t> places;
    for (const Inks& inks : list) {
        SCOPED_TRACE(testing::PrintToString(inks));
        const auto place = entry(inks);
        ASSERT_TRUE(place);
        places.insert(*place);
        for (std::size_t ink = 0; ink < inks.size(); ++ink) {
            for (const double shift : {-0.5, 0.5, -0.501, 0.501}) {
                Inks shifted = inks;
                shifted[ink] += shift;
                EXPECT_EQ(entry(shifted),
                          std::abs(shift) <= 0.5 ? place : std::optional<std::size_t>());
            }
        }
    }
    EXPECT_EQ(places.size(), list.size());

    constexpr double tones[] = {0, 3, 7, 10, 15, 20, 25, 30, 40, 50, 55, 60, 70, 75, 80, 90, 100};
    std::size_t found = 0;
    for (const double c : tones) {
        for (const double m : tones) {
            for (const double y : tones) {
                for (const double k : tones) {
                    found += entry({c, m, y, k}) ? 1 : 0;
                }
            }
        }
    }
    EXPECT_EQ(found, list.size());
    EXPECT_FALSE(entry({-1e300, 0, 0, 0}));
    EXPECT_FALSE(entry({1e300, 0, 0, 0}));
    EXPECT_FALSE(entry({std::numeric_limits<double>::quiet_NaN(), 0, 0, 0}));
}
