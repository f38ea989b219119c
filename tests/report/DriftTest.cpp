// SPDX-License-Identifier: Apache-2.0
#include <cmath>
#include <limits>
#include <random>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "report/Drift.h"

namespace {

using namespace report;
using testing::ElementsAre;

constexpr double none = std::numeric_limits<double>::quiet_NaN();

// The example of the NIST/SEMATECH e-Handbook of Statistical Methods, 6.3.2.4.
TEST(Drift, AveragesAsTheHandbookDoes) {
    const std::vector<double> data = {52.0, 47.0, 53.0, 49.3, 50.1, 47.0, 51.0, 50.1, 51.2, 50.5,
                                      49.6, 47.6, 49.9, 51.3, 47.8, 51.2, 52.6, 52.4, 53.6, 52.1};
    const std::vector<double> published = {50.60, 49.52, 50.56, 50.18, 50.16, 49.21, 49.75,
                                           49.85, 50.26, 50.33, 50.11, 49.36, 49.52, 50.05,
                                           49.38, 49.92, 50.73, 51.23, 51.94, 51.99};
    const std::vector<double> averages = movingAverage(data, 50, 0.3);
    ASSERT_EQ(averages.size(), published.size());
    for (std::size_t i = 0; i < published.size(); ++i) {
        EXPECT_NEAR(averages[i], published[i], 0.006) << i;
    }
    EXPECT_THAT(movingAverage({1, none, 1}, 0, 0.5), ElementsAre(0.5, 0.5, 0.75));
}

TEST(Drift, SeesASlowMoveAndRarelyAnythingElse) {
    std::mt19937 random(7);
    std::normal_distribution<double> noise(0, 0.3);
    constexpr int rounds = 1000;
    int false_alarms = 0;
    int seen = 0;
    double scatter = 0;
    for (int round = 0; round < rounds; ++round) {
        std::vector<double> still, moving;
        for (int i = 0; i < 60; ++i) {
            still.push_back(noise(random));
            moving.push_back(noise(random) + (i > 20 ? 1.0 * (i - 20) / 40 : 0));
        }
        moving[30] = none;
        false_alarms += driftOf(still).significant;
        seen += driftOf(moving).significant;
        scatter += scatterOf(moving) / rounds;
    }
    EXPECT_LT(false_alarms, rounds / 50);
    EXPECT_GT(seen, rounds * 95 / 100);
    EXPECT_NEAR(scatter, 0.3, 0.02); // Drift does not count as scatter.

    EXPECT_FALSE(driftOf({0, 0, 0, 0, 0, 5, 5, 5, 5}).significant); // Too few values.
    EXPECT_TRUE(driftOf({0, 0, 0, 0, 0, 5, 5, 5, 5, 5}).significant);
    EXPECT_TRUE(std::isnan(driftOf({none, none}).began));
}

} // namespace
