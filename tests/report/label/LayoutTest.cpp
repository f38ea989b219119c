// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <memory>
#include <set>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <pango/pangocairo.h>

#include "Samples.h"
#include "report/label/CertificateLayout.h"
#include "report/label/Content.h"
#include "report/label/LabelLayout.h"
#include "report/label/Texts.h"

namespace {

using testing::HasSubstr;

constexpr label::Size sizes[] = {{100, 50}, {62, 100}, {89, 36}, {102, 152}, {50, 25}, {70, 70}};
constexpr double pangoUnits = PANGO_SCALE * 72 / 25.4; ///< In a millimetre.
constexpr double slack = 0.35;                         ///< Millimetres: overhang of single glyphs.

bool contains(const label::Rect& outer, const label::Rect& inner) {
    return inner.x >= outer.x - slack && inner.y >= outer.y - slack &&
           inner.right() <= outer.right() + slack && inner.bottom() <= outer.bottom() + slack;
}

bool overlap(const label::Rect& a, const label::Rect& b) {
    constexpr double touch = 0.01;
    return a.x + touch < b.right() && b.x + touch < a.right() && a.y + touch < b.bottom() &&
           b.y + touch < a.bottom();
}

const auto release = [](void* object) { g_object_unref(object); };
using Layout = std::unique_ptr<PangoLayout, decltype(release)>;

std::string markup(const char* text, long length) {
    const std::unique_ptr<char, decltype(&g_free)> escaped(g_markup_escape_text(text, length),
                                                           g_free);
    return escaped.get();
}

/// The text as pango lays it out by nothing but its style.
Layout layoutOf(const label::Text& text) {
    const std::unique_ptr<PangoContext, decltype(release)> context(
        pango_font_map_create_context(pango_cairo_font_map_get_default()), release);
    pango_cairo_context_set_resolution(context.get(), 72);
    pango_context_set_round_glyph_positions(context.get(), FALSE);
    cairo_font_options_t* const options = cairo_font_options_create();
    cairo_font_options_set_hint_style(options, CAIRO_HINT_STYLE_NONE);
    cairo_font_options_set_hint_metrics(options, CAIRO_HINT_METRICS_OFF);
    pango_cairo_context_set_font_options(context.get(), options);
    cairo_font_options_destroy(options);
    Layout layout(pango_layout_new(context.get()), release);
    const std::string words = "<span font='Sans " + std::string(text.style.bold ? "bold " : "") +
                              std::to_string(text.style.points) + "'><b>" +
                              markup(text.words.data(), static_cast<long>(text.lead)) + "</b>" +
                              markup(text.words.c_str() + text.lead, -1) + "</span>";
    pango_layout_set_markup(layout.get(), words.c_str(), -1);
    pango_layout_set_width(layout.get(), static_cast<int>(text.place.width * pangoUnits));
    pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
    pango_layout_set_height(layout.get(), -text.style.lines);
    pango_layout_set_ellipsize(layout.get(), PANGO_ELLIPSIZE_END);
    pango_layout_set_alignment(layout.get(),
                               text.style.align == label::Align::Left    ? PANGO_ALIGN_LEFT
                               : text.style.align == label::Align::Right ? PANGO_ALIGN_RIGHT
                                                                         : PANGO_ALIGN_CENTER);
    return layout;
}

bool isShortened(const label::Text& text) {
    return pango_layout_is_ellipsized(layoutOf(text).get()) != FALSE;
}

/// Where the text's glyphs are.
label::Rect inkOf(const label::Text& text) {
    PangoRectangle ink;
    pango_layout_get_extents(layoutOf(text).get(), &ink, nullptr);
    const double raised = std::min(0, ink.y) / pangoUnits; // Such a text is moved down by it.
    return {text.place.x + ink.x / pangoUnits, text.place.y + ink.y / pangoUnits - raised,
            ink.width / pangoUnits, ink.height / pangoUnits};
}

/// Everything is inside the page and its own place, and no two things are in one place.
void expectSound(const label::Page& page) {
    constexpr double edge = 1;
    const label::Rect inside = {edge, edge, page.size.width - 2 * edge,
                                page.size.height - 2 * edge};
    std::vector<label::Rect> places;
    for (const label::Text& text : page.texts) {
        ASSERT_TRUE(contains(inside, text.place)) << text.words;
        ASSERT_TRUE(contains(text.place, inkOf(text))) << text.words;
        EXPECT_GE(text.style.points, 5);
        places.push_back(text.place);
    }
    if (!page.symbol.empty()) {
        ASSERT_TRUE(contains(inside, page.symbolPlace));
        places.push_back(page.symbolPlace);
    }
    for (const label::Shape& shape : page.shapes) {
        ASSERT_TRUE(contains(inside, shape.place));
        const bool isSign = shape.mark == label::Mark::Tick || shape.mark == label::Mark::Cross ||
                            shape.mark == label::Mark::Question;
        if (isSign) {
            places.push_back(shape.place);
        } else if (!page.symbol.empty()) {
            ASSERT_FALSE(overlap(shape.place, page.symbolPlace));
        }
    }
    for (std::size_t i = 0; i < places.size(); ++i) {
        for (std::size_t k = i + 1; k < places.size(); ++k) {
            ASSERT_FALSE(overlap(places[i], places[k]))
                << (i < page.texts.size() ? page.texts[i].words : "shape") << "\n"
                << (k < page.texts.size() ? page.texts[k].words : "shape");
        }
    }
}

bool hasText(const std::vector<label::Page>& pages, const std::string& start) {
    return std::any_of(pages.begin(), pages.end(), [&](const label::Page& page) {
        return std::any_of(page.texts.begin(), page.texts.end(),
                           [&](const label::Text& text) { return text.words.starts_with(start); });
    });
}

std::size_t signsOf(const std::vector<label::Page>& pages) {
    std::size_t count = 0;
    for (const label::Page& page : pages) {
        count += static_cast<std::size_t>(
            std::count_if(page.shapes.begin(), page.shapes.end(), [](const label::Shape& shape) {
                return shape.mark == label::Mark::Tick || shape.mark == label::Mark::Cross ||
                       shape.mark == label::Mark::Question;
            }));
    }
    return count;
}

TEST(LabelLayout, OverlapsAndCutsOffNothingWhateverTheContent) {
    const label::Typesetter typesetter;
    LabelSamples samples(27);
    std::set<bool> counted;
    std::set<bool> dropped;
    for (int i = 0; i < 40; ++i) {
        const LabelSample sample = samples.next();
        const label::Content content = label::contentOf(sample.subject());
        for (const label::Size& size : sizes) {
            SCOPED_TRACE("sample " + std::to_string(i) + ", " + std::to_string(size.width) + " x " +
                         std::to_string(size.height));
            const label::LabelLayout layout =
                label::layOutLabel(content, size, label::usualDot, typesetter);
            expectSound(layout.page);
            ASSERT_FALSE(layout.page.symbol.empty());
            const std::vector<label::Page> pages = {layout.page};
            EXPECT_TRUE(hasText(pages, label::verdictText(sample.result.verdict)));
            for (const label::Text& text : layout.page.texts) {
                const bool isFigure = text.style.align == label::Align::Right;
                EXPECT_FALSE(isFigure && isShortened(text)) << text.words;
            }
            // A unit is at every value, or in the head.
            const bool hasHead = hasText(pages, "value / tolerance");
            for (const label::Text& text : layout.page.texts) {
                const bool isValue = text.style.align == label::Align::Right &&
                                     text.words.find(" / ") != std::string::npos;
                EXPECT_TRUE(!isValue || hasHead || text.words.find("Δ") != std::string::npos);
            }
            // Every criterion is listed with its sign or counted, every field is there or reported.
            const std::size_t judged = content.model.judged.size();
            EXPECT_EQ(signsOf(pages) - 1, judged - layout.criteriaCounted);
            EXPECT_EQ(layout.criteriaCounted > 0 || judged == 0,
                      hasText(pages, "and ") ||
                          hasText(pages, std::to_string(judged) + " criteria") ||
                          hasText(pages, "The preset judges"));
            for (const label::Entry& entry : content.entries) {
                const bool isLeftOut = std::find(layout.leftOut.begin(), layout.leftOut.end(),
                                                 entry.label) != layout.leftOut.end();
                EXPECT_EQ(hasText(pages, entry.label + ": "), entry.isKnown && !isLeftOut)
                    << entry.label;
            }
            counted.insert(layout.criteriaCounted > 0);
            dropped.insert(!layout.leftOut.empty());
            if (testing::Test::HasFatalFailure()) {
                return;
            }
        }
    }
    EXPECT_EQ(counted.size(), 2u);
    EXPECT_EQ(dropped.size(), 2u);
}

TEST(LabelLayout, ShrinksBeforeItDropsAndDropsInTheDocumentedOrder) {
    const label::Typesetter typesetter;
    LabelSample sample = LabelSamples(1).next(0);
    sample.details.clear();
    sample.hasMeta = true;
    sample.meta = jobOf("Title", "Instrument", "Paper", "Workflow", "anna");
    sample.result.presetName = "Preset";
    sample.result.target.statements = {{"description", "Condition"}};
    sample.result.measurement.statements = {{"printing", "Printer"}};
    sample.result.criteria.clear();
    for (int i = 0; i < 6; ++i) {
        report::Criterion criterion;
        criterion.title = "Criterion " + std::to_string(i);
        criterion.unit = "dE";
        criterion.used = true;
        criterion.outcome = i % 2 == 0 ? report::Outcome::Pass : report::Outcome::Fail;
        criterion.tolerance = 3;
        criterion.rounded = i;
        sample.result.criteria.push_back(criterion);
    }
    const label::Content content = label::contentOf(sample.subject());
    // From a large label to a small one: less and less is there, and never does a field come back.
    const std::vector<std::string> order = {"Not stated", "Workflow",   "Job",     "Target",
                                            "Operator",   "Instrument", "Printer", "Paper",
                                            "Preset",     "Condition",  "Verified"};
    double points = 99;
    std::size_t fewest = 6;
    std::size_t fields = 0;
    for (double height = 100; height >= 25; height -= 2.5) {
        SCOPED_TRACE(height);
        const label::LabelLayout layout =
            label::layOutLabel(content, {60, height}, label::usualDot, typesetter);
        const auto condition = std::find_if(
            layout.page.texts.begin(), layout.page.texts.end(),
            [](const label::Text& text) { return text.words.starts_with("Verified"); });
        std::vector<std::string> dropped(order.begin(),
                                         order.begin() + static_cast<long>(layout.leftOut.size()));
        EXPECT_THAT(layout.leftOut, testing::UnorderedElementsAreArray(dropped));
        if (height > 60 / 1.3) { // Below, the code moves to the side.
            EXPECT_GE(layout.leftOut.size(), fields);
            fields = layout.leftOut.size();
        }
        fewest = std::min(fewest, 6 - layout.criteriaCounted);
        if (condition != layout.page.texts.end()) {
            points = std::min(points, condition->style.points);
            if (layout.criteriaCounted > 0 || !layout.leftOut.empty()) {
                EXPECT_EQ(condition->style.points, label::smallestPoints);
            }
        }
        // The worst come first: the failed ones by their distance, then the passed ones.
        std::vector<std::string> titles;
        for (const label::Text& text : layout.page.texts) {
            if (text.words.starts_with("Criterion ")) {
                titles.push_back(text.words);
            }
        }
        std::vector<std::string> worst = {"Criterion 5", "Criterion 3", "Criterion 1",
                                          "Criterion 4", "Criterion 2", "Criterion 0"};
        worst.resize(6 - layout.criteriaCounted);
        EXPECT_EQ(titles, worst);
    }
    EXPECT_EQ(points, label::smallestPoints);
    EXPECT_LT(fewest, 3u);
}

TEST(CertificateLayout, TakesOneOrTwoSheetsWhateverTheContent) {
    const label::Typesetter typesetter;
    LabelSamples samples(5);
    std::set<std::size_t> pages;
    bool tones = false;
    std::set<bool> counted;
    for (int i = 0; i < 24; ++i) {
        SCOPED_TRACE(i);
        // From none of anything to far more than there is room for.
        const LabelSample sample = samples.next(i % 3 == 0   ? 90
                                                : i % 3 == 1 ? 12
                                                             : 2,
                                                i % 4 == 0 ? 3000 : 6);
        const label::Content content = label::contentOf(sample.subject());
        const label::CertificateLayout layout = label::layOutCertificate(
            content, sample.result, i % 2 == 0 ? label::a4 : label::letter, typesetter);
        ASSERT_GE(layout.pages.size(), 1u);
        ASSERT_LE(layout.pages.size(), 2u);
        for (const label::Page& page : layout.pages) {
            expectSound(page);
            if (testing::Test::HasFatalFailure()) {
                return;
            }
        }
        EXPECT_EQ(signsOf(layout.pages) - 1, content.model.judged.size() - layout.criteriaCounted);
        EXPECT_TRUE(layout.criteriaCounted == 0 || hasText(layout.pages, "and "));
        EXPECT_TRUE(hasText(layout.pages, "Largest differences"));
        EXPECT_TRUE(hasText(layout.pages, "Signature"));
        tones = tones || hasText(layout.pages, "Tone value increase");
        pages.insert(layout.pages.size());
        counted.insert(layout.criteriaCounted > 0);
    }
    EXPECT_TRUE(tones);
    EXPECT_EQ(counted.size(), 2u);
}

} // namespace
