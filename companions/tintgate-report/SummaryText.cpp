// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/SummaryText.h"

#include <algorithm>

#include "report/Model.h"

namespace report {
namespace {

using report::fixedText;

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

std::string criteriaText(const report::Model& model, const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (const report::Figure& figure : model.judged) {
        const Badge badge = badgeOf(figure.outcome);
        lines.push_back({{badge.sign + figure.word, badge.tone},
                         {figure.title},
                         {figure.value, Tone::Bold, true},
                         {"of " + figure.tolerance, Tone::Plain, true},
                         {figure.unit, Tone::Soft},
                         {figure.distance},
                         {figure.worstLabel + figure.missing, Tone::Soft}});
    }
    return lines.empty() ? "" : '\n' + tableText(lines, paint);
}

std::string signedText(double value) {
    return (value > 0 ? "+" : "") + fixedText(value, 2);
}

std::string patchesText(const report::Model& model, const report::Result& result,
                        const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (std::size_t i = 0; i < std::min(mostPatches, model.rows.size()); ++i) {
        const std::size_t index = model.rows[i].patch;
        const report::Patch& patch = result.patches[index];
        lines.push_back({{fixedText(patch.difference, 2), Tone::Bold, true},
                         {report::labelOf(result, index)},
                         {"ΔL* " + signedText(patch.measured.L - patch.target.L), Tone::Soft},
                         {"Δa* " + signedText(patch.measured.a - patch.target.a), Tone::Soft},
                         {"Δb* " + signedText(patch.measured.b - patch.target.b), Tone::Soft}});
    }
    return '\n' + paint(Tone::Bold, "Largest differences, " + model.unit) + '\n' +
           tableText(lines, paint);
}

// ---- Trends

constexpr std::size_t mostJobs = 10;

Badge badgeOf(report::Movement movement) {
    return movement == report::Movement::Drifting ? Badge{"↗ ", Tone::Failed}
           : movement == report::Movement::Steady ? Badge{"= ", Tone::Passed}
                                                  : Badge{"? ", Tone::Open};
}

std::string inksText(const report::Series& series, const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (const report::InkTrend& ink : series.inks) {
        const Badge badge = badgeOf(ink.movement);
        lines.push_back({{badge.sign + ink.word, badge.tone},
                         {report::inkName(ink.ink)},
                         {ink.value, Tone::Bold, true},
                         {ink.tolerance.empty() ? "" : "of " + ink.tolerance, Tone::Plain, true},
                         {ink.above ? "above" : "", Tone::Failed},
                         {ink.averageOff, Tone::Bold, true},
                         {ink.correction},
                         {ink.sentence, Tone::Soft}});
    }
    lines.insert(lines.begin(), {{""},
                                 {""},
                                 {"latest job", Tone::Soft, true},
                                 {""},
                                 {""},
                                 {"average to aim", Tone::Soft, true},
                                 {""},
                                 {""}});
    return tableText(lines, paint);
}

std::string criteriaText(const report::Series& series, const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (const report::CriterionTrend& criterion : series.criteria) {
        if (criterion.used) {
            lines.push_back({{criterion.title},
                             {criterion.latest, Tone::Bold, true},
                             {"of " + criterion.tolerance, Tone::Plain, true},
                             {criterion.unit, Tone::Soft},
                             {std::to_string(criterion.failed) + " of " +
                                  std::to_string(criterion.answered) + " above",
                              criterion.failed != 0 ? Tone::Failed : Tone::Soft}});
        }
    }
    return lines.empty() ? "" : '\n' + tableText(lines, paint);
}

std::string jobsText(const report::TrendModel& trend, const report::Series& series,
                     const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (std::size_t i = 0; i < std::min(mostJobs, series.samples.size()); ++i) {
        const auto& sample = trend.samples[series.samples[series.samples.size() - 1 - i]];
        const Badge badge = badgeOf(sample.verdict);
        lines.push_back({{badge.sign + report::wordOf(sample.verdict), badge.tone},
                         {report::timeText(sample.time), Tone::Soft},
                         {sample.title},
                         {report::nearestText(sample), Tone::Soft}});
    }
    return "\n" + paint(Tone::Bold, "Latest jobs") + "\n" + tableText(lines, paint);
}

} // namespace

std::string trendText(const report::TrendModel& trend, const Painter& paint) {
    std::string text;
    for (const std::string& note : trend.notes) {
        text += paint(Tone::Open, "! ") + paint(Tone::Plain, note) + '\n';
    }
    for (const report::Series& series : trend.series) {
        const bool bad = series.failing && series.movement == report::Movement::Steady;
        const Badge badge = bad ? badgeOf(report::Verdict::Failed) : badgeOf(series.movement);
        text += (text.empty() ? "" : "\n") + paint(badge.tone, badge.sign + series.word) + "  " +
                paint(Tone::Bold, series.name) + '\n' +
                paint(Tone::Soft, std::to_string(series.samples.size()) +
                                      (series.samples.size() == 1 ? " result, " : " results, ") +
                                      series.span + ": " + std::to_string(series.passed) +
                                      " passed, " + std::to_string(series.failed) + " failed, " +
                                      std::to_string(series.incomplete) + " incomplete") +
                '\n' + paint(Tone::Plain, series.sentence) + '\n';
        for (const std::string& reason : series.reasons) {
            text += "  " + paint(Tone::Plain, reason) + '\n';
        }
        text += '\n' + inksText(series, paint) + criteriaText(series, paint) +
                jobsText(trend, series, paint);
    }
    return text;
}

std::string summaryText(const report::Result& result, const report::Meta* meta,
                        const Painter& paint) {
    const report::Model model = report::makeModel(result, meta);
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
    text += criteriaText(model, paint) + '\n';
    std::string statistics;
    for (const auto& [label, value] : model.statistics) {
        statistics += (statistics.empty() ? "" : ", ") + label + ' ' + value;
    }
    text += statistics + '\n' + patchesText(model, result, paint);
    if (!model.warnings.empty()) {
        text += '\n' + paint(Tone::Bold, "Warnings") + '\n';
    }
    for (const std::string& warning : model.warnings) {
        text += "  " + paint(Tone::Open, "! ") + paint(Tone::Plain, warning) + '\n';
    }
    return text;
}

} // namespace report
