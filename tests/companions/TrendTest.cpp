#include <cmath>
#include <limits>
#include <random>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "companions/report/Drift.h"
#include "companions/report/Trend.h"

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
    for (std::size_t i = 0; i < published.size(); ++i)
        EXPECT_NEAR(averages[i], published[i], 0.006) << i;
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
    EXPECT_NEAR(scatter, 0.3, 0.02); // The drift does not count as scatter.

    EXPECT_FALSE(driftOf({0, 0, 0, 0, 0, 5, 5, 5, 5}).significant); // Too few to say.
    EXPECT_TRUE(driftOf({0, 0, 0, 0, 0, 5, 5, 5, 5, 5}).significant);
    EXPECT_TRUE(std::isnan(driftOf({none, none}).began));
}

Sample sampleAt(int day, double value, double tolerance, const std::string& paper = "Matt") {
    Sample sample;
    sample.time = 1'770'000'000 + 86400 * day;
    sample.title = "Job " + std::to_string(day);
    sample.paper = paper;
    sample.formula = "CIE2000";
    Criterion cyan;
    cyan.name = "solidCyan";
    cyan.title = "Solid cyan";
    cyan.unit = "dE";
    cyan.used = true;
    cyan.tolerance = tolerance;
    cyan.value = value;
    cyan.rounded = std::round(value * 100) / 100;
    cyan.outcome = *cyan.rounded <= tolerance ? Outcome::Pass : Outcome::Fail;
    sample.verdict = cyan.outcome == Outcome::Pass ? Verdict::Passed : Verdict::Failed;
    sample.criteria = {cyan};
    sample.inks[static_cast<std::size_t>(Ink::Cyan)] = colour::Lab{55 + value, -37, -50};
    sample.inks[static_cast<std::size_t>(Ink::Paper)] = colour::Lab{95, 0, -2};
    return sample;
}

TEST(Trend, SaysWhichInkDriftsAndComparesLikeWithLike) {
    std::vector<Sample> samples;
    for (int day = 39; day >= 0; --day) // In no order of time.
        samples.push_back(sampleAt(day, day < 20 ? 0.5 : 0.5 + 0.15 * (day - 19), 3));
    for (int day = 0; day < 50; ++day)
        samples.push_back(sampleAt(day, 2.5, day < 6 ? 3 : 2.25, "Gloss"));
    Criterion& unanswered = samples.back().criteria[0];
    unanswered.value.reset();
    unanswered.rounded.reset();
    unanswered.outcome = Outcome::Unanswered;
    samples.push_back(sampleAt(3, 1, 3, "Newsprint"));
    const TrendModel trend = makeTrend(samples, "files", {});
    ASSERT_EQ(trend.series.size(), 3u);

    const Series& drifting = trend.series[0]; // In front of a longer one that is steady.
    EXPECT_EQ(drifting.name, "Matt");
    EXPECT_EQ(drifting.word, "Drifting: cyan");
    EXPECT_EQ(trend.samples[drifting.samples[0]].title, "Job 0");
    const InkTrend& cyan = drifting.inks[static_cast<std::size_t>(Ink::Cyan)];
    EXPECT_NEAR(cyan.began.L, 55.5, 1e-9);
    EXPECT_EQ(cyan.value, "3.50");
    EXPECT_TRUE(cyan.above);
    EXPECT_THAT(drifting.reasons, ElementsAre("Cyan: " + cyan.sentence,
                                              "4 of the last 20 failed, most often by Solid cyan"));
    EXPECT_EQ(drifting.inks[0].word, "Steady");
    EXPECT_EQ(drifting.inks[2].word, "No data");
    EXPECT_EQ(drifting.span, "2 February 2026 to 13 March 2026");

    // Each job keeps the tolerance that it was judged by.
    EXPECT_EQ(trend.series[1].word, "Steady, but the latest job failed");
    const CriterionTrend& gloss = trend.series[1].criteria[0];
    EXPECT_THAT(gloss.tolerances, ElementsAre(std::pair(0u, 3.0), std::pair(6u, 2.25)));
    EXPECT_EQ(gloss.failed, 43u);
    EXPECT_EQ(gloss.answered, 49u);
    EXPECT_TRUE(std::isnan(gloss.values[49]));
    EXPECT_EQ(gloss.latest, "2.50");
    EXPECT_EQ(trend.series[2].word, "Too few jobs");
}

} // namespace
