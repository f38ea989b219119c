// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cmath>
#include <limits>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <lcms2.h>

#include "ScratchFolder.h"
#include "report/Model.h"
#include "report/Sample.h"

namespace {

using namespace report;
using testing::ElementsAre;
using testing::HasSubstr;

constexpr double none = std::numeric_limits<double>::quiet_NaN();
const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";

std::string with(std::string text, const std::string& part, const std::string& other) {
    const std::size_t at = text.find(part);
    EXPECT_NE(at, text.npos) << part;
    return text.replace(at, part.size(), other);
}

// LittleCMS is the reference: Lab to sRGB, relative colorimetric with Bradford adaptation.
TEST(Swatch, IsTheColourThatLittleCmsShows) {
    cmsHPROFILE const lab = cmsCreateLab4Profile(nullptr);
    cmsHPROFILE const srgb = cmsCreate_sRGBProfile();
    cmsHTRANSFORM const transform = cmsCreateTransform(
        lab, TYPE_Lab_DBL, srgb, TYPE_RGB_DBL, INTENT_RELATIVE_COLORIMETRIC, cmsFLAGS_NOOPTIMIZE);
    int inside = 0;
    for (int i = 0; i < 21 * 13 * 13; ++i) {
        const double colour[3] = {i % 21 * 5.0, i / 21 % 13 * 15.0 - 90, i / 21 / 13 * 15.0 - 90};
        SCOPED_TRACE(testing::PrintToString(colour));
        double rgb[3];
        cmsDoTransform(transform, colour, rgb, 1);
        const Swatch s = swatch({colour[0], colour[1], colour[2]});
        const double ours[3] = {double(s.red), double(s.green), double(s.blue)};
        for (int channel = 0; channel < 3; ++channel) {
            EXPECT_NEAR(ours[channel], 255 * std::clamp(rgb[channel], 0.0, 1.0), 1.0);
        }
        // Clearly inside or outside the gamut, so that rounding does not matter.
        const auto [least, most] = std::minmax({rgb[0], rgb[1], rgb[2]});
        if (least < -0.01 || most > 1.01) {
            EXPECT_TRUE(s.clipped);
        } else if (least > 0.01 && most < 0.99) {
            EXPECT_FALSE(s.clipped);
            ++inside;
        }
    }
    EXPECT_GT(inside, 500);
    for (const double bad : {none, 1e308, -1e308}) {
        EXPECT_TRUE(swatch({bad, bad, bad}).clipped);
    }
    cmsDeleteTransform(transform);
    cmsCloseProfile(lab);
    cmsCloseProfile(srgb);
}

TEST(Histogram, HasFewRoundBinsThatHoldEveryNumber) {
    const struct {
        std::vector<double> values;
        std::size_t bins;
        double width;
        std::size_t first, sum; ///< The count of the first bin, and of all bins.
    } cases[] = {
        {{0, 0, 0}, 1, 0.01, 3, 3},
        {{0.1, 0.49, 0.5, 7.6}, 16, 0.5, 2, 4},
        {{1e308, std::numeric_limits<double>::infinity()}, 21, 5e306, 0, 1},
    };
    for (const auto& [values, bins, width, first, sum] : cases) {
        SCOPED_TRACE(values.back());
        const std::vector<Bin> histogram = histogramOf(values);
        ASSERT_EQ(histogram.size(), bins);
        EXPECT_NEAR(histogram[0].to / width, 1, 1e-9);
        EXPECT_EQ(histogram[0].count, first);
        std::size_t counted = 0;
        for (const Bin& bin : histogram) {
            counted += bin.count;
        }
        EXPECT_EQ(counted, sum);
    }
}

Criterion criterion(const char* name, double tolerance, double value, Outcome outcome) {
    Criterion c;
    c.name = c.title = name;
    c.unit = "dE";
    c.used = name != std::string("unused");
    c.outcome = outcome;
    c.tolerance = tolerance;
    if (std::isfinite(value)) {
        c.value = c.rounded = value;
    }
    return c;
}

Result resultOf(std::size_t patches) {
    Result result;
    result.formula = "CIE2000";
    for (std::size_t i = 0; i < patches; ++i) {
        result.patches.push_back({std::to_string(i + 1), "", {50, 0, 0}, {50, 1, 0}, double(i)});
    }
    return result;
}

TEST(Model, SaysFirstWhatFailedAndByHowMuch) {
    Result result = resultOf(3);
    result.patches[1].difference = none;
    result.verdict = Verdict::Failed;
    result.criteria = {
        criterion("near", 3, 2.9, Outcome::Pass), criterion("little", 10, 20, Outcome::Fail),
        criterion("unused", 1, 9, Outcome::Fail), criterion("much", 2.125, 6, Outcome::Fail),
        criterion("zero", 0, 0.5, Outcome::Fail), criterion("far", 3, 0.5, Outcome::Pass)};
    Model model = makeModel(result, nullptr);
    EXPECT_EQ(model.sentence, "3 of 5 criteria are above tolerance.");
    EXPECT_THAT(model.reasons,
                ElementsAre("zero: 0.50 ΔE00, 0.50 above the tolerance of 0.00",
                            "much: 6.00 ΔE00, 3.875 above the tolerance of 2.125",
                            "little: 20.00 ΔE00, 10.00 above the tolerance of 10.00"));
    EXPECT_EQ(model.judged[3].title, "near");
    EXPECT_EQ(model.judged[3].distance, "0.10 below");
    EXPECT_EQ(model.rows[0].patch, 2u); // A row without a number comes last.
    EXPECT_EQ(model.rows[2].patch, 1u);

    result.verdict = Verdict::Incomplete;
    result.criteria = {criterion("there", 3, 4, Outcome::Fail),
                       criterion("missing", 3, none, Outcome::Unanswered)};
    EXPECT_EQ(makeModel(result, nullptr).sentence,
              "1 of 2 criteria can't be answered from these data, 1 failed.");
    result.criteria[1].needed = 5;
    result.criteria[1].found = 3;
    result.warnings = {{"in doubt", true}, {"a remark", false}};
    model = makeModel(result, nullptr);
    EXPECT_THAT(model.reasons[1], HasSubstr("only 3 of the 5 different patches"));
    EXPECT_THAT(model.doubts, ElementsAre("in doubt"));
    EXPECT_THAT(model.warnings, ElementsAre("a remark"));
    result.criteria = {criterion("near", 3, 2.9, Outcome::Pass)};
    EXPECT_THAT(makeModel(result, nullptr).sentence, HasSubstr("comparison itself is in doubt"));
    result.criteria.clear();
    EXPECT_THAT(makeModel(result, nullptr).sentence, HasSubstr("judges no criterion"));
}

// Members of a result that are there only if its preset asks for them.
const std::string measures =
    R"("papers": {"aims": "corrected", "adjusted": true, "target": [95, 1, -4],
                  "measured": [93, 0, -1], "difference": 2.9, "darkest": null},
       "tones": {"method": "density", "inks": [
           {"channel": 0, "aims": "target", "steps": [[40, 54, 53, 1, 0], [50, 69.5, 64, 1, 1]]},
           {"channel": 1, "aims": "A", "steps": []}], "midToneSpreads": []},
       "spotTones": {"aims": "nominal", "inks": [
           {"channel": 0, "steps": [[75, 76, 75, 1, 2]]}]},
       "greys": {"weights": "equal", "rows": [[2, 50, 1, [58, 0.4, -2], [0.5, -2]],
                                              [1, 25, 1, [70, 0.4, -2], null]]},
       "repeats": {"patches": 2, "readings": 5, "largestDistance": 2, "worstPatch": 1,
                   "each": [[0, 2, 0.5, 0.5], [1, 3, 1, 2]]},
       "statistics")";

TEST(Measures, BecomeChartsAndATrend) {
    std::string problem;
    const std::string text =
        with(support::contentsOf(data + "output.json"), "\"statistics\"", measures);
    auto result = readResult(text, problem);
    ASSERT_TRUE(result) << problem;
    for (const auto& [name, tolerance] : {std::pair{"toneCyan", 9.0},
                                          {"toneCyanMiddle", 4.0},
                                          {"toneCyanThreeQuarters", 1.0},
                                          {"toneBlack", 0.5}}) {
        result->criteria.push_back(criterion(name, tolerance, 1, Outcome::Pass));
    }
    const Model model = makeModel(*result, nullptr);
    ASSERT_EQ(model.tones.size(), 2U); // none of an ink without tints
    EXPECT_THAT(model.tones[0].text, HasSubstr("the target’s · largest deviation 5.50 at 50 %"));
    EXPECT_EQ(model.tones[0].points[0].measured, 14);
    EXPECT_EQ(model.tones[0].points[0].aim, 13);
    EXPECT_EQ(model.tones[0].points[0].tolerance, 4); // the narrowest of those for this tint
    EXPECT_FALSE(model.tones[0].points[0].above);
    EXPECT_TRUE(model.tones[0].points[1].above);
    EXPECT_TRUE(std::isnan(model.tones[1].points[0].tolerance)); // SCTV has a limit of its own
    EXPECT_EQ(model.greys[0].tone, 25);
    EXPECT_TRUE(std::isnan(model.greys[0].aimA));
    EXPECT_THAT(model.spreads[0].label, HasSubstr(result->patches[1].id));
    EXPECT_THAT(model.papers->sentence, HasSubstr("corrected for the measured paper"));
    EXPECT_EQ(model.papers->measured, "93.00 0.00 -1.00");

    const Sample sample = sampleOf(*result, nullptr);
    EXPECT_EQ(sample.criteria.back().name, "toneAtHalfCyan");
    EXPECT_EQ(sample.criteria.back().value, 69.5);
    EXPECT_EQ(sample.inks[0]->L, 93); // of the papers, not of the patches
    EXPECT_EQ(sample.aims[0]->b, -4);

    for (const auto& [from, to] : {std::pair{"[50, 69.5, 64, 1, 1]", "[50, 69.5, 64, 1, 9]"},
                                   {"[[2, 50,", "[[9, 50,"},
                                   {"[1, 3, 1, 2]", "[9, 3, 1, 2]"},
                                   {"\"channel\": 1", "\"channel\": 7"}}) {
        EXPECT_FALSE(readResult(with(text, from, to), problem)) << to;
    }
}

TEST(Model, HasTheWorstPatchesOfManyAndChartsOfAll) {
    for (const std::size_t count : {mostRows, mostRows + 1}) {
        const bool isCut = count > mostRows;
        const Model model = makeModel(resultOf(count), nullptr);
        EXPECT_EQ(model.shown, isCut ? worstRows : count);
        EXPECT_EQ(model.shownText.empty(), !isCut);
        std::vector<std::size_t> patches;
        for (std::size_t i = 0; i < model.rows.size(); ++i) {
            patches.push_back(model.rows[i].patch);
            EXPECT_TRUE(i >= model.shown || model.rows[i].patch == count - 1 - i) << i;
        }
        std::sort(patches.begin(), patches.end());
        EXPECT_EQ(std::adjacent_find(patches.begin(), patches.end()), patches.end());
        // The charts reach from the worst patch to the best ones.
        ASSERT_EQ(model.drawn.size(), mostDrawn);
        std::size_t best = count;
        for (const std::size_t row : model.drawn) {
            best = std::min(best, model.rows.at(row).patch);
        }
        EXPECT_LT(best, count / 100);
    }
}

TEST(Readers, RefuseWhatIsNoResultAndNoTime) {
    const std::string whole = support::contentsOf(data + "output.json");
    std::string problem;
    ASSERT_TRUE(readResult(whole, problem)) << problem;
    for (const std::string& text :
         {std::string("[]"), whole.substr(0, whole.size() / 2),
          with(whole, "tintgate-result", "other"),
          with(whole, "\"formatVersion\": 1", "\"formatVersion\": 2"),
          with(whole, "\"failed\"", "\"won\""), with(whole, "[100,0,0,0]", "[100,0,0]"),
          with(whole, "\"worstPatch\":1", "\"worstPatch\":4"),
          with(whole, "\"statistics\"",
               "\"repeats\":{\"patches\":1,\"readings\":2,"
               "\"largestDistance\":1,\"worstPatch\":4},\"statistics\""),
          with(whole, "\"decimals\":2", "\"decimals\":1e300"),
          with(whole, "[55,-37,-50]", "[55,\"x\",-50]")}) {
        problem.clear();
        EXPECT_FALSE(readResult(text, problem)) << text.substr(0, 200);
        EXPECT_NE(problem, "");
    }

    // The time is used in a file name.
    const std::string meta = support::contentsOf(data + "meta.json");
    const std::string time = "2024-05-01T12:34:56+02:00";
    EXPECT_EQ(dateText(readMeta(meta, problem)->created), "1 May 2024, 12:34 (UTC+02:00)");
    for (const char* other : {"../../../../etc/cron.d/xxx", "2024-05-01T12:34:56Z", ""}) {
        EXPECT_FALSE(readMeta(with(meta, time, other), problem)) << other;
    }
}

} // namespace
