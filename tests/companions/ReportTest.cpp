#include <algorithm>
#include <cmath>
#include <filesystem>
#include <functional>
#include <limits>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <lcms2.h>

#include "ScratchFolder.h"
#include "companions/report/Model.h"
#include "companions/report/Page.h"
#include "companions/report/PageFile.h"

namespace {

using namespace report;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

constexpr double none = std::numeric_limits<double>::quiet_NaN();

// LittleCMS as the peer: Lab to sRGB, which is relative colorimetric with Bradford inside.
TEST(Swatch, IsTheColourThatLittleCmsShows) {
    cmsHPROFILE const lab = cmsCreateLab4Profile(nullptr);
    cmsHPROFILE const srgb = cmsCreate_sRGBProfile();
    cmsHTRANSFORM const transform = cmsCreateTransform(
        lab, TYPE_Lab_DBL, srgb, TYPE_RGB_DBL, INTENT_RELATIVE_COLORIMETRIC, cmsFLAGS_NOOPTIMIZE);
    int inside = 0;
    for (double L = 0; L <= 100; L += 5)
        for (double a = -90; a <= 90; a += 15)
            for (double b = -90; b <= 90; b += 15) {
                const double colour[3] = {L, a, b};
                double rgb[3];
                cmsDoTransform(transform, colour, rgb, 1);
                const Swatch s = swatch({L, a, b});
                const double ours[3] = {double(s.red), double(s.green), double(s.blue)};
                bool clear = true; // Well inside or outside, so that rounding can't decide.
                bool outside = false;
                for (const double channel : rgb) {
                    clear = clear && (channel < -0.01 || channel > 0.01) &&
                            (channel < 0.99 || channel > 1.01);
                    outside = outside || channel < 0 || channel > 1;
                }
                for (int i = 0; i < 3; ++i)
                    EXPECT_NEAR(ours[i], 255 * std::clamp(rgb[i], 0.0, 1.0), 1.0)
                        << L << ' ' << a << ' ' << b;
                if (clear) {
                    EXPECT_EQ(s.clipped, outside) << L << ' ' << a << ' ' << b;
                }
                inside += clear && !outside;
            }
    EXPECT_GT(inside, 500);
    for (const double bad : {none, 1e308, -1e308})
        EXPECT_TRUE(swatch({bad, bad, bad}).clipped);
    cmsDeleteTransform(transform);
    cmsCloseProfile(lab);
    cmsCloseProfile(srgb);
}

TEST(Histogram, HasFewRoundBinsThatHoldEveryNumber) {
    const struct {
        std::vector<double> values;
        std::size_t bins;
        double width;
        std::vector<std::size_t> firstCounts;
    } cases[] = {
        {{0, 0, 0}, 1, 0.01, {3}},
        {{0.1, 0.49, 0.5, 7.6}, 16, 0.5, {2, 1}},
        {{-3, none, 1.2}, 13, 0.1, {1}},
        {{0, 2.4, 1e6}, 21, 5e4, {2}},
        {{1e308, std::numeric_limits<double>::infinity()}, 21, 5e306, {0}},
        {{none}, 1, 0.01, {0}},
    };
    for (const auto& [values, bins, width, firstCounts] : cases) {
        const std::vector<Bin> histogram = histogramOf(values);
        ASSERT_EQ(histogram.size(), bins) << values.back();
        EXPECT_NEAR(histogram[0].to / width, 1, 1e-9);
        std::size_t sum = 0;
        for (std::size_t i = 0; i < histogram.size(); ++i) {
            sum += histogram[i].count;
            if (i < firstCounts.size()) {
                EXPECT_EQ(histogram[i].count, firstCounts[i]) << i;
            }
        }
        const auto finite = std::count_if(values.begin(), values.end(),
                                          [](double value) { return std::isfinite(value); });
        EXPECT_EQ(sum, static_cast<std::size_t>(finite));
    }
}

Criterion criterion(const char* name, double tolerance, double value, Outcome outcome,
                    bool used = true) {
    Criterion c;
    c.name = c.title = name;
    c.unit = "dE";
    c.used = used;
    c.outcome = outcome;
    c.tolerance = tolerance;
    if (std::isfinite(value))
        c.value = c.rounded = value;
    return c;
}

Result resultOf(std::size_t patches) {
    Result result;
    result.formula = "CIE2000";
    for (std::size_t i = 0; i < patches; ++i)
        result.patches.push_back({std::to_string(i + 1), "", {50, 0, 0}, {50, 1, 0}, double(i)});
    return result;
}

TEST(Model, SaysFirstWhatFailedAndByHowMuch) {
    Result result = resultOf(3);
    result.patches[1].difference = none;
    result.verdict = Verdict::Failed;
    result.criteria = {
        criterion("near", 3, 2.9, Outcome::Pass),        criterion("little", 3, 3.1, Outcome::Fail),
        criterion("unused", 1, 9, Outcome::Fail, false), criterion("much", 2.125, 6, Outcome::Fail),
        criterion("zero", 0, 0.5, Outcome::Fail),        criterion("far", 3, 0.5, Outcome::Pass)};
    Model model = makeModel(result, nullptr);
    EXPECT_EQ(model.sentence, "3 of 5 criteria are above tolerance.");
    EXPECT_THAT(model.reasons, ElementsAre("zero: 0.50 ΔE00, 0.50 above the tolerance of 0.00",
                                           "much: 6.00 ΔE00, 3.875 above the tolerance of 2.125",
                                           "little: 3.10 ΔE00, 0.10 above the tolerance of 3.00"));
    EXPECT_EQ(model.judged[3].title, "near");
    EXPECT_EQ(model.judged[3].distance, "0.10 below");
    EXPECT_EQ(model.others.size(), 1u);
    EXPECT_EQ(model.rows[0].patch, 2u); // No number comes last.
    EXPECT_EQ(model.rows[2].patch, 1u);

    result.verdict = Verdict::Incomplete;
    result.criteria = {criterion("there", 3, 4, Outcome::Fail),
                       criterion("missing", 3, none, Outcome::Unanswered)};
    model = makeModel(result, nullptr);
    EXPECT_EQ(model.sentence, "1 of 2 criteria can't be answered from these data, 1 failed.");
    EXPECT_EQ(model.judged[1].word, "No data");
    result.criteria.clear();
    EXPECT_THAT(makeModel(result, nullptr).sentence, HasSubstr("judges no criterion"));
}

TEST(Model, DrawsTheWorstAndAnEvenRest) {
    EXPECT_EQ(makeModel(resultOf(mostDrawn), nullptr).drawn.size(), mostDrawn);
    const Model model = makeModel(resultOf(100'000), nullptr);
    ASSERT_EQ(model.drawn.size(), mostDrawn);
    EXPECT_EQ(model.drawn[999], 999u);
    EXPECT_EQ(model.drawn[1001] - model.drawn[1000], 99u);
    EXPECT_GT(model.drawn.back(), 99'800u);
    EXPECT_EQ(std::adjacent_find(model.drawn.begin(), model.drawn.end(), std::greater_equal()),
              model.drawn.end());
    EXPECT_THAT(model.drawnText, HasSubstr("2000 of 100000"));
}

TEST(ReadResult, RefusesWhatIsNoResult) {
    const std::string whole =
        support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/report/output.json");
    std::string problem;
    const auto result = readResult(whole, problem);
    ASSERT_TRUE(result) << problem;
    EXPECT_EQ(result->patches.size(), 4u);
    EXPECT_EQ(result->device.size(), 16u);
    EXPECT_EQ(result->unpairedTarget.count, 2u);
    EXPECT_TRUE(std::isnan(result->patches[3].difference));

    const auto with = [&](const std::string& part, const std::string& other) {
        std::string text = whole;
        const std::size_t at = text.find(part);
        EXPECT_NE(at, text.npos) << part;
        return text.replace(at, part.size(), other);
    };
    for (const std::string& text :
         {std::string(), std::string("[]"), std::string("null"), whole.substr(0, whole.size() / 2),
          with("tintgate-result", "other"), with("\"formatVersion\": 1", "\"formatVersion\": 2"),
          with("\"failed\"", "\"won\""), with("[100,0,0,0]", "[100,0,0]"),
          with("\"worstPatch\":1", "\"worstPatch\":4"),
          with("\"decimals\":2", "\"decimals\":1e300"),
          with("\"worstPatch\":1", "\"worstPatch\":-1"), with("[55,-37,-50]", "[55,\"x\",-50]"),
          with("\"patches\": [", "\"others\": ["), with("\"CIE2000\"", "4")}) {
        problem.clear();
        EXPECT_FALSE(readResult(text, problem)) << text.substr(0, 200);
        EXPECT_NE(problem, "");
    }
}

TEST(ReadMeta, TakesNoOtherStampThanATime) {
    const std::string whole =
        support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/report/meta.json");
    const std::string time = "2024-05-01T12:34:56+02:00";
    std::string problem;
    const auto meta = readMeta(whole, problem);
    ASSERT_TRUE(meta) << problem;
    EXPECT_EQ(dateText(meta->created), "1 May 2024, 12:34 (UTC+02:00)");
    for (const char* other : {"../../../../etc/cron.d/xxx", "2024-05-01T12:34:56Z", ""}) {
        std::string text = whole;
        text.replace(text.find(time), time.size(), other);
        EXPECT_FALSE(readMeta(text, problem)) << other;
    }
}

TEST(KeepPage, OverwritesNothingAndLeavesNothingBehind) {
    const support::ScratchFolder folder;
    std::string problem;
    const std::string first = keepPage(folder.path(), "page", "one", problem);
    EXPECT_EQ(first, folder.path("page.html"));
    EXPECT_EQ(keepPage(folder.path(), "page", "two", problem), folder.path("page-2.html"));
    EXPECT_EQ(keepPage(folder.path(), "page", "one", problem), first);
    folder.makeFolder("taken.html");
    EXPECT_EQ(keepPage(folder.path(), "taken", "x", problem), folder.path("taken-2.html"));
    EXPECT_EQ(support::contentsOf(first), "one");
    EXPECT_EQ(support::modeOf(first) & 0444, 0444u);

    EXPECT_FALSE(replacePage(folder.path("taken.html"), "x", problem));
    EXPECT_TRUE(replacePage(first, "three", problem));
    EXPECT_EQ(support::contentsOf(first), "three");
    EXPECT_EQ(keepPage(folder.path("missing"), "page", "x", problem), "");
    EXPECT_THAT(problem, HasSubstr("No such file"));
    std::size_t files = 0;
    for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator(folder.path()))
        ++files;
    EXPECT_EQ(files, 4u);
}

TEST(Index, GivesSummariesBackAndLinksAsRelativePaths) {
    Result result = resultOf(1);
    result.verdict = Verdict::Failed;
    Meta meta;
    meta.created = "2024-05-01T12:34:56+02:00";
    meta.title = "</script>" + std::string(3000, 'x');
    const auto summary =
        summaryIn(std::string_view(pageOf(result, &meta)).substr(0, summaryWithin));
    ASSERT_TRUE(summary);
    EXPECT_EQ(summary->title.substr(0, 10), "</script>x");
    EXPECT_LT(summary->title.size(), 600u);
    EXPECT_FALSE(summaryIn("<script type=\"application/json\" id=\"summary\">[1]</script>"));

    const std::string index = indexOf({{"JobID_1/a b#?\xff\".html", *summary}}, "/tmp");
    EXPECT_THAT(index, HasSubstr("./JobID_1/a%20b%23%3F%FF%22.html"));
    EXPECT_THAT(index, Not(HasSubstr("</script>x")));
}

} // namespace
