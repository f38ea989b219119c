#include "companions/tintgate-report/SummaryText.h"

#include <algorithm>

#include "companions/report/Model.h"

namespace reporting {
namespace {

using report::fixedText;

constexpr std::size_t mostPatches = 5;

struct Mark {
    const char* sign;
    Tone tone;
};

Mark markOf(report::Verdict verdict) {
    return verdict == report::Verdict::Passed   ? Mark{"✓ ", Tone::Passed}
           : verdict == report::Verdict::Failed ? Mark{"✕ ", Tone::Failed}
                                                : Mark{"? ", Tone::Open};
}

Mark markOf(report::Outcome outcome) {
    return outcome == report::Outcome::Pass   ? Mark{"✓ ", Tone::Passed}
           : outcome == report::Outcome::Fail ? Mark{"✕ ", Tone::Failed}
                                              : Mark{"? ", Tone::Open};
}

std::string criteriaText(const report::Model& model, const Painter& paint) {
    std::vector<std::vector<Cell>> lines;
    for (const report::Figure& figure : model.judged) {
        const Mark mark = markOf(figure.outcome);
        lines.push_back({{mark.sign + figure.word, mark.tone},
                         {figure.title},
                         {figure.value, Tone::Bold, true},
                         {"of " + figure.tolerance, Tone::Plain, true},
                         {figure.unit, Tone::Soft},
                         {figure.distance},
                         {figure.worstLabel, Tone::Soft}});
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

} // namespace

std::string summaryText(const report::Result& result, const report::Meta* meta,
                        const Painter& paint) {
    const report::Model model = report::makeModel(result, meta);
    const Mark mark = markOf(model.verdict);
    std::string text = paint(mark.tone, mark.sign + model.word) + "  " +
                       paint(Tone::Bold, model.title) + '\n' + paint(Tone::Soft, model.subtitle) +
                       '\n' + model.sentence + '\n';
    text += criteriaText(model, paint) + '\n';
    std::string statistics;
    for (const auto& [label, value] : model.statistics)
        statistics += (statistics.empty() ? "" : ", ") + label + ' ' + value;
    text += statistics + '\n' + patchesText(model, result, paint);
    if (!model.warnings.empty())
        text += '\n' + paint(Tone::Bold, "Warnings") + '\n';
    for (const std::string& warning : model.warnings)
        text += "  " + paint(Tone::Open, "! ") + paint(Tone::Plain, warning) + '\n';
    return text;
}

} // namespace reporting
