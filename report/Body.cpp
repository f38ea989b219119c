// SPDX-License-Identifier: Apache-2.0
#include "report/Body.h"

#include <charconv>

#include "report/InPage.h"

namespace report {
namespace {

using languages::Texts;

constexpr std::size_t mostReasons = 4;

std::string_view signOf(Outcome outcome) {
    switch (outcome) {
    case Outcome::Pass:
        return "✓";
    case Outcome::Fail:
        return "✕";
    case Outcome::Unanswered:
        return "?";
    case Outcome::Unjudged:
        break;
    }
    return "";
}

Html facts(const Facts& facts) {
    Html list;
    for (const auto& [label, text] : facts) {
        list += element("div", {}, element("dt", label) + element("dd", text));
    }
    return list;
}

Html verdictSection(const Model& model, const Texts& say) {
    Html reasons;
    for (const std::string& doubt : model.doubts) {
        reasons += element("li", doubt);
    }
    const std::size_t all = model.reasons.size();
    const std::size_t shown = all > mostReasons ? mostReasons - 1 : all;
    for (std::size_t i = 0; i < shown; ++i) {
        reasons += element("li", model.reasons[i]);
    }
    if (shown < all) {
        reasons += element("li", say("page.moreReasons", {{"count", all - shown}}));
    }
    Html words = element("h2", {{"id", "word"}}, Html(model.word)) +
                 element("p", {{"id", "sentence"}}, Html(model.sentence));
    if (!reasons.markup().empty()) {
        words += element("ul", {{"id", "reasons"}}, reasons);
    }
    return element(
        "section",
        {{"id", "verdict"}, {"class", keyOf(model.verdict)}, {"aria-labelledby", "word"}},
        element("span", {{"class", "sign"}, {"aria-hidden", "true"}},
                Html(report::signOf(model.verdict))) +
            element("div", {{"class", "words"}}, words) +
            element("dl", {{"id", "basis"}}, facts(model.basis)));
}

Html warnings(const Model& model, const Texts& say) {
    if (model.warnings.empty()) {
        return {};
    }
    Html list;
    for (const std::string& warning : model.warnings) {
        list += element("li", warning);
    }
    return element("section", {{"id", "warnings"}, {"aria-label", say("html.page.warnings")}},
                   element("ul", {}, list));
}

/// Half of the bar is the tolerance.
Html bar(const Figure& figure) {
    char digits[32];
    const double percent = 100 * figure.fill;
    const auto end =
        std::to_chars(digits, digits + sizeof digits, percent, std::chars_format::fixed, 1);
    const std::string width = std::string(digits, end.ptr) + "%";
    return element("div", {{"class", "bar"}, {"aria-hidden", "true"}},
                   element("svg", {{"width", width}}));
}

Html criterionRow(const Figure& figure, const Texts& say) {
    const std::string_view outcome = keyOf(figure.outcome);
    const std::string word(signOf(figure.outcome));
    const std::string badge = "badge " + std::string(outcome);
    Html distance;
    if (!figure.distance.empty()) {
        distance = bar(figure) + element("span", {{"class", "distance"}}, Html(figure.distance));
    }
    return element(
        "tr", {{"class", outcome}},
        element("td", {},
                element("span", {{"class", badge}},
                        Html(word.empty() ? figure.word : word + " " + figure.word))) +
            element("th", {{"scope", "row"}}, Html(figure.title)) +
            element("td", {{"class", "number"}},
                    Html(figure.value + " ") +
                        element("span", {{"class", "unit"}}, Html(figure.unit))) +
            element("td", {{"class", "number limit"}, {"data-lead", say("page.limitLead")}},
                    Html(figure.tolerance)) +
            element("td", {}, distance) +
            element("td",
                    {{"class", "worst"},
                     {"data-lead", figure.worstLabel.empty() ? "" : say("page.worstLead")}},
                    Html(figure.worstLabel)));
}

Html criteriaTable(const char* id, const std::vector<Figure>& figures, const Texts& say) {
    Html heads;
    const auto head = [&](const std::string& text, const char* kind) {
        heads += element("th", {{"scope", "col"}, {"class", kind}}, Html(text));
    };
    head(say("html.page.verdict"), "");
    head(say("html.page.criterion"), "");
    head(say("html.page.value"), "number");
    head(say("html.page.tolerance"), "number");
    head(say("html.page.against"), "");
    head(say("html.page.worst"), "");
    Html rows;
    for (const Figure& figure : figures) {
        rows += criterionRow(figure, say);
    }
    return element("table", {{"id", id}, {"class", "criteria"}},
                   element("thead", {}, element("tr", {}, heads)) + element("tbody", {}, rows));
}

Html criteria(const Model& model, const Texts& say) {
    Html html;
    if (!model.judged.empty()) {
        html += criteriaTable("criteria", model.judged, say);
    }
    if (!model.others.empty()) {
        html +=
            element("details", {{"id", "more"}},
                    element("summary", say("page.moreFigures", {{"count", model.others.size()}})) +
                        criteriaTable("others", model.others, say));
    }
    return html;
}

Html sections(const Model& model) {
    Html html;
    for (const auto& [title, content] : model.sections) {
        html += element("div", {}, element("h3", title) + element("dl", {}, facts(content)));
    }
    return html;
}

} // namespace

std::string_view signOf(Verdict verdict) {
    return signOf(verdict == Verdict::Passed   ? Outcome::Pass
                  : verdict == Verdict::Failed ? Outcome::Fail
                                               : Outcome::Unanswered);
}

Html badge(Verdict verdict, const std::string& word) {
    return element("span", {{"class", "badge " + std::string(keyOf(verdict))}},
                   Html(std::string(signOf(verdict)) + " " + word));
}

Html bodyPart(std::string_view hole, const Model& model, const Texts& say) {
    if (hole == "documentTitle") {
        return Html(model.word + " – " + model.title);
    }
    if (hole == "title") {
        return Html(model.title);
    }
    if (hole == "verdict") {
        return verdictSection(model, say);
    }
    if (hole == "warnings") {
        return warnings(model, say);
    }
    if (hole == "statistics") {
        return facts(model.statistics);
    }
    if (hole == "criteria") {
        return criteria(model, say);
    }
    return hole == "sections" ? sections(model) : Html();
}

} // namespace report
