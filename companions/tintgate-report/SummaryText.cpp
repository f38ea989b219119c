// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/SummaryText.h"

#include <algorithm>

#include "report/Model.h"

namespace report {
namespace {

using languages::Texts;

constexpr std::size_t mostPatches = 5;

struct Badge {
    std::string sign;
    Tone tone;
};

Badge badgeOf(report::Verdict verdict) {
    return verdict == report::Verdict::Passed   ? Badge{"✓ ", Tone::Passed}
           : verdict == report::Verdict::Failed ? Badge{"✕ ", Tone::Failed}
                                                : Badge{"? ", Tone::Open};
}

Badge badgeOf(report::Outcome outcome) {
    return outcome == report::Outcome::Pass   ? Badge{"✓ ", Tone::Passed}
           : outcome == report::Outcome::Fail ? Badge{"✕ ", Tone::Failed}
                                              : Badge{"? ", Tone::Open};
}

std::string criteriaText(const report::Model& model, const Painter& paint, const Texts& say) {
    std::vector<std::vector<Cell>> lines;
    for (const report::Figure& figure : model.judged) {
        const Badge badge = badgeOf(figure.outcome);
        lines.push_back({{badge.sign + figure.word, badge.tone},
                         {figure.title},
                         {figure.value, Tone::Bold, true},
                         {say("text.of", {{"tolerance", figure.tolerance}}), Tone::Plain, true},
                         {figure.unit, Tone::Soft},
                         {figure.distance},
                         {figure.worstLabel + figure.missing, Tone::Soft}});
    }
    return lines.empty() ? "" : '\n' + tableText(lines, paint);
}

std::string signedText(double value, const Texts& say) {
    return (value > 0 ? "+" : "") + say.number(value, 2);
}

std::string patchesText(const report::Model& model, const report::Result& result,
                        const Painter& paint, const Texts& say) {
    std::vector<std::vector<Cell>> lines;
    for (std::size_t i = 0; i < std::min(mostPatches, model.rows.size()); ++i) {
        const std::size_t index = model.rows[i].patch;
        const report::Patch& patch = result.patches[index];
        lines.push_back(
            {{say.number(patch.difference, 2), Tone::Bold, true},
             {report::labelOf(result, index, say)},
             {"ΔL* " + signedText(patch.measured.L - patch.target.L, say), Tone::Soft},
             {"Δa* " + signedText(patch.measured.a - patch.target.a, say), Tone::Soft},
             {"Δb* " + signedText(patch.measured.b - patch.target.b, say), Tone::Soft}});
    }
    return '\n' + paint(Tone::Bold, say("text.largest", {{"unit", model.unit}})) + '\n' +
           tableText(lines, paint);
}

// ---- Trends

constexpr std::size_t mostJobs = 10;

Badge badgeOf(report::Movement movement) {
    return movement == report::Movement::Drifting ? Badge{"↗ ", Tone::Failed}
           : movement == report::Movement::Steady ? Badge{"= ", Tone::Passed}
                                                  : Badge{"? ", Tone::Open};
}

std::string inksText(const report::Series& series, const Painter& paint, const Texts& say) {
    std::vector<std::vector<Cell>> lines;
    for (const report::InkTrend& ink : series.inks) {
        const Badge badge = badgeOf(ink.movement);
        lines.push_back(
            {{badge.sign + ink.word, badge.tone},
             {report::inkName(ink.ink, say)},
             {ink.value, Tone::Bold, true},
             {ink.tolerance.empty() ? "" : say("text.of", {{"tolerance", ink.tolerance}}),
              Tone::Plain, true},
             {ink.above ? say("text.above") : "", Tone::Failed},
             {ink.averageOff, Tone::Bold, true},
             {ink.correction},
             {ink.sentence, Tone::Soft}});
    }
    lines.insert(lines.begin(), {{""},
                                 {""},
                                 {say("text.latest"), Tone::Soft, true},
                                 {""},
                                 {""},
                                 {say("text.averageToAim"), Tone::Soft, true},
                                 {""},
                                 {""}});
    return tableText(lines, paint);
}

std::string criteriaText(const report::Series& series, const Painter& paint, const Texts& say) {
    std::vector<std::vector<Cell>> lines;
    for (const report::CriterionTrend& criterion : series.criteria) {
        if (criterion.used || criterion.followed) {
            const bool isLimited = !criterion.tolerance.empty();
            lines.push_back({{criterion.title},
                             {criterion.latest, Tone::Bold, true},
                             {isLimited ? say("text.of", {{"tolerance", criterion.tolerance}}) : "",
                              Tone::Plain, true},
                             {criterion.unit, Tone::Soft},
                             {isLimited ? say("text.failures", {{"failed", criterion.failed},
                                                                {"answered", criterion.answered}})
                                        : "",
                              criterion.failed != 0 ? Tone::Failed : Tone::Soft}});
        }
    }
    return lines.empty() ? "" : '\n' + tableText(lines, paint);
}

std::string jobsText(const report::TrendModel& trend, const report::Series& series,
                     const Painter& paint, const Texts& say) {
    std::vector<std::vector<Cell>> lines;
    for (std::size_t i = 0; i < std::min(mostJobs, series.samples.size()); ++i) {
        const auto& sample = trend.samples[series.samples[series.samples.size() - 1 - i]];
        const Badge badge = badgeOf(sample.verdict);
        lines.push_back({{badge.sign + report::wordOf(sample.verdict, say), badge.tone},
                         {report::timeText(sample.time, say), Tone::Soft},
                         {report::titleOf(sample, say)},
                         {report::nearestText(sample, say), Tone::Soft}});
    }
    return "\n" + paint(Tone::Bold, say("text.latestJobs")) + "\n" + tableText(lines, paint);
}

} // namespace

std::string trendText(const report::TrendModel& trend, const Painter& paint, const Texts& say) {
    std::string text;
    for (const std::string& note : trend.notes) {
        text += paint(Tone::Open, "! ") + paint(Tone::Plain, note) + '\n';
    }
    for (const report::Series& series : trend.series) {
        const bool bad = series.failing && series.movement == report::Movement::Steady;
        const Badge badge = bad ? badgeOf(report::Verdict::Failed) : badgeOf(series.movement);
        text += (text.empty() ? "" : "\n") + paint(badge.tone, badge.sign + series.word) + "  " +
                paint(Tone::Bold, series.name) + '\n' +
                paint(Tone::Soft, say("text.series", {{"count", series.samples.size()},
                                                      {"span", series.span},
                                                      {"passed", series.passed},
                                                      {"failed", series.failed},
                                                      {"incomplete", series.incomplete}})) +
                '\n' + paint(Tone::Plain, series.sentence) + '\n';
        for (const std::string& reason : series.reasons) {
            text += "  " + paint(Tone::Plain, reason) + '\n';
        }
        text += '\n' + inksText(series, paint, say) + criteriaText(series, paint, say) +
                jobsText(trend, series, paint, say);
    }
    return text;
}

std::string summaryText(const report::Result& result, const report::Meta* meta,
                        const Painter& paint, const Texts& say) {
    const report::Model model = report::makeModel(result, meta, say);
    const Badge badge = badgeOf(model.verdict);
    std::string text = paint(badge.tone, badge.sign + model.word) + "  " +
                       paint(Tone::Bold, model.title) + '\n' + paint(Tone::Soft, model.subtitle) +
                       '\n' + model.sentence + '\n';
    for (const std::string& doubt : model.doubts) {
        text += "  " + paint(Tone::Open, "? ") + paint(Tone::Plain, doubt) + '\n';
    }
    if (!model.condition.empty()) {
        text += paint(Tone::Soft, model.condition) + '\n';
    }
    text += criteriaText(model, paint, say) + '\n';
    std::string statistics;
    for (const auto& [label, value] : model.statistics) {
        statistics += (statistics.empty() ? "" : ", ") + label + ' ' + value;
    }
    text += statistics + '\n' + patchesText(model, result, paint, say);
    if (!model.warnings.empty()) {
        text += '\n' + paint(Tone::Bold, say("html.page.warnings")) + '\n';
    }
    for (const std::string& warning : model.warnings) {
        text += "  " + paint(Tone::Open, "! ") + paint(Tone::Plain, warning) + '\n';
    }
    return text;
}

} // namespace report
