// SPDX-License-Identifier: Apache-2.0
#include "report/TrendPage.h"

#include <cmath>

#include "report/Html.h"
#include "report/InPage.h"
#include "report/Model.h"
#include "report/Template.h"

namespace report {
namespace {

using languages::Texts;

constexpr double secondsOfDay = 86400;

const char* keyOf(Movement movement) {
    switch (movement) {
    case Movement::Drifting:
        return "drifting";
    case Movement::Steady:
        return "steady";
    case Movement::TooFew:
    case Movement::Unknown:
        break;
    }
    return "unknown";
}

std::string labText(const colour::Lab& lab, const Texts& say) {
    if (!std::isfinite(lab.L)) {
        return {};
    }
    const auto tenths = [&](double value) {
        return say.number(std::round(value * 10) / 10 + 0.0, 1); // No "-0.0".
    };
    return tenths(lab.L) + " " + tenths(lab.a) + " " + tenths(lab.b);
}

/// A part of the page's data: a tree for small data, then lists of numbers as text.
class Part {
  public:
    explicit Part(const PageJson& head) : m_text(inScript(head)) { m_text.pop_back(); }

    void numbers(const char* name, const std::vector<double>& values, int decimals) {
        m_text += std::string(",\"") + name + "\":";
        appendRounded(m_text, values, decimals);
    }
    void raw(const char* name, const std::string& json) {
        m_text += std::string(",\"") + name + "\":" + json;
    }
    void list(const char* name, const std::vector<std::string>& parts) {
        m_text += std::string(",\"") + name + "\":[";
        for (std::size_t i = 0; i < parts.size(); ++i) {
            m_text += (i == 0 ? "\n" : ",\n") + parts[i];
        }
        m_text += ']';
    }
    std::string text() && { return std::move(m_text) + "}"; }

  private:
    std::string m_text;
};

std::string inkData(const InkTrend& ink, const Texts& say) {
    Part part({{"name", inkName(ink.ink, say)},
               {"movement", keyOf(ink.movement)},
               {"word", ink.word},
               {"sentence", ink.sentence},
               {"began", labText(ink.began, say)},
               {"now", labText(ink.now, say)},
               {"aim", labText(ink.aim, say)},
               {"beganSwatch", swatchText(ink.beganSwatch)},
               {"nowSwatch", swatchText(ink.nowSwatch)},
               {"aimSwatch", swatchText(ink.aimSwatch)},
               {"averageOff", ink.averageOff},
               {"correction", ink.correction},
               {"value", ink.value},
               {"tolerance", ink.tolerance},
               {"fill", ink.fill},
               {"above", ink.above}});
    static constexpr const char* changeNames[] = {"changeL", "changeA", "changeB"};
    static constexpr const char* averageNames[] = {"averageL", "averageA", "averageB"};
    for (std::size_t i = 0; i < 3; ++i) {
        part.numbers(changeNames[i], ink.changes[i], 3);
        part.numbers(averageNames[i], ink.averages[i], 3);
    }
    return std::move(part).text();
}

std::string criterionData(const CriterionTrend& criterion) {
    std::string outcomes;
    for (const Outcome outcome : criterion.outcomes) {
        outcomes += keyOf(outcome)[0]; // p, f, i or u
    }
    PageJson tolerances = PageJson::array();
    for (const auto& [job, tolerance] : criterion.tolerances) {
        tolerances.push_back({job, std::isfinite(tolerance) ? PageJson(tolerance) : PageJson()});
    }
    Part part({{"title", criterion.title},
               {"unit", criterion.unit},
               {"used", criterion.used},
               {"followed", criterion.followed},
               {"decimals", criterion.decimals},
               {"latest", criterion.latest},
               {"tolerance", criterion.tolerance},
               {"failed", criterion.failed},
               {"answered", criterion.answered},
               {"tolerances", tolerances},
               {"outcomes", outcomes}});
    part.numbers("values", criterion.values, 6);
    return std::move(part).text();
}

/// [time in days, verdict, title, nearest criterion, link]
std::string jobData(const Sample& sample, const Texts& say) {
    return inScript({static_cast<double>(sample.time) / secondsOfDay, keyOf(sample.verdict),
                     titleOf(sample, say), nearestText(sample, say),
                     sample.page.empty() ? "" : linkTo(sample.page)});
}

std::string seriesData(const TrendModel& model, const Series& series, const Texts& say) {
    Part part({{"name", series.name},
               {"movement", keyOf(series.movement)},
               {"failing", series.failing},
               {"word", series.word},
               {"sentence", series.sentence},
               {"reasons", series.reasons},
               {"span", series.span},
               {"passed", series.passed},
               {"failed", series.failed},
               {"incomplete", series.incomplete},
               {"beginning", series.beginning}});
    std::vector<std::string> parts;
    for (const InkTrend& ink : series.inks) {
        parts.push_back(inkData(ink, say));
    }
    part.list("inks", parts);
    parts.clear();
    for (const CriterionTrend& criterion : series.criteria) {
        parts.push_back(criterionData(criterion));
    }
    part.list("criteria", parts);
    parts.clear();
    for (const std::size_t index : series.samples) {
        parts.push_back(jobData(model.samples[index], say));
    }
    part.list("jobs", parts);
    return std::move(part).text();
}

/// A series as it is read where scripts do not run: its state, and how its criteria stand.
Html seriesWithoutScript(const Series& series, const Texts& say) {
    Html reasons;
    for (const std::string& reason : series.reasons) {
        reasons += element("li", reason);
    }
    Html rows;
    for (const CriterionTrend& criterion : series.criteria) {
        if (criterion.used) {
            const std::string failures = say(
                "text.failures", {{"failed", criterion.failed}, {"answered", criterion.answered}});
            rows += element("tr", {},
                            element("th", {{"scope", "row"}}, Html(criterion.title)) +
                                element("td", criterion.latest + " " + criterion.unit) +
                                element("td", criterion.tolerance) + element("td", failures));
        }
    }
    const Html heads =
        element("th", say("html.page.criterion")) + element("th", say("html.page.value")) +
        element("th", say("html.page.tolerance")) + element("th", say("html.trend.failed"));
    return element(
        "section", {},
        element("h2", series.name) + element("p", series.span) +
            element("p", {}, element("strong", series.word)) + element("p", series.sentence) +
            element("ul", {}, reasons) +
            element("table", {},
                    element("thead", {}, element("tr", {}, heads)) + element("tbody", {}, rows)));
}

Html withoutScript(const TrendModel& model, const Texts& say) {
    Html html = element("header", {},
                        element("h1", say("html.trend.title")) + element("p", model.subtitle)) +
                element("p", say("html.trend.noScript"));
    for (const Series& series : model.series) {
        html += seriesWithoutScript(series, say);
    }
    return html;
}

} // namespace

std::string trendPageOf(const TrendModel& model, const Texts& say) {
    Part data({{"subtitle", model.subtitle}, {"notes", model.notes}});
    data.raw("texts", scriptTexts(say, "trend"));
    std::vector<std::string> parts;
    for (const Series& series : model.series) {
        parts.push_back(seriesData(model, series, say));
    }
    data.list("series", parts);
    const std::string text = std::move(data).text();
    return assembled(trendTemplate, say, [&](std::string_view hole, std::string& page) {
        page += hole == "data" ? text : withoutScript(model, say).markup();
    });
}

} // namespace report
