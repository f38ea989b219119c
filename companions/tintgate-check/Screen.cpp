// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Screen.h"

#include <algorithm>
#include <filesystem>
#include <functional>
#include <string_view>

#include <sys/ioctl.h>
#include <unistd.h>

#include "base/Utf8.h"
#include "base/WideBytes.h"
#include "companions/tintgate-check/Words.h"
#include "report/Model.h"

namespace check {
namespace {

using report::Cell;
using report::Painter;
using report::Tone;

constexpr std::size_t mostPatches = 5;
constexpr std::size_t mostCriteria = 14; ///< Of the judged ones; the rest has passed.

struct Mark {
    const char* sign;
    Tone tone;
    Say word;
};

Mark markOf(Fate fate) {
    switch (fate) {
    case Fate::Passed:
        return {"✓", Tone::Passed, Say::Passed};
    case Fate::Failed:
        return {"✕", Tone::Failed, Say::Failed};
    case Fate::Incomplete:
        return {"?", Tone::Open, Say::Incomplete};
    case Fate::NotDone:
        break;
    }
    return {"!", Tone::Failed, Say::NotDone};
}

std::string padded(std::string text, std::size_t width) {
    const std::size_t has = report::columnsOf(text);
    return text.append(has < width ? width - has : 0, ' ');
}

/// Cut to so many columns of the terminal, with "…" as the last one.
std::string fitted(const std::string& text, std::size_t width) {
    if (report::columnsOf(text) <= width || width == 0) {
        return text;
    }
    std::size_t end = 0;
    std::size_t used = 0;
    while (true) {
        std::size_t next = end + 1;
        while (next < text.size() && (text[next] & 0xC0) == 0x80) {
            ++next;
        }
        used += report::columnsOf(text.substr(end, next - end));
        if (used >= width) {
            return text.substr(0, end) + "…";
        }
        end = next;
    }
}

/// The text in lines of `width`, each after `indent` blanks but for the first, which follows
/// `label`. Breaks at blanks.
std::string wrapped(const std::string& label, std::size_t indent, const std::string& text,
                    const Painter& paint, std::size_t width, Tone tone = Tone::Plain) {
    std::string lines = label;
    std::string line;
    const auto flush = [&](bool last) {
        lines += paint(tone, line) + '\n';
        line.clear();
        if (!last) {
            lines.append(indent, ' ');
        }
    };
    for (std::size_t start = 0; start < text.size();) {
        const std::size_t end = std::min(text.find(' ', start), text.size());
        const std::string word = text.substr(start, end - start);
        if (!line.empty() &&
            indent + report::columnsOf(line) + 1 + report::columnsOf(word) > width) {
            flush(false);
        }
        line += (line.empty() ? "" : " ") + word;
        start = end + 1;
    }
    flush(true);
    return lines;
}

std::string heading(Say what, const Painter& paint) {
    return '\n' + paint(Tone::Bold, say(what)) + '\n';
}

std::string criteriaText(const report::Model& model, const Painter& paint, std::size_t width) {
    // Numbers and signs take 30 characters; labels of patches want 16 if there are any.
    const bool hasLabels =
        std::any_of(model.judged.begin(), model.judged.end(), [](const report::Figure& figure) {
            return figure.outcome != report::Outcome::Pass;
        });
    const std::size_t mostTitle = width - (hasLabels ? 46 : 30);
    std::vector<std::vector<Cell>> lines;
    std::size_t left = 0;
    for (const report::Figure& figure : model.judged) {
        const bool passed = figure.outcome == report::Outcome::Pass;
        if (lines.size() >= mostCriteria && passed) {
            ++left;
            continue;
        }
        const Mark mark = markOf(passed                                    ? Fate::Passed
                                 : figure.outcome == report::Outcome::Fail ? Fate::Failed
                                                                           : Fate::Incomplete);
        lines.push_back({{mark.sign, mark.tone},
                         {fitted(figure.title, mostTitle)},
                         {figure.value, Tone::Bold, true},
                         {say(Say::Of) + " " + figure.tolerance, Tone::Plain, true},
                         {figure.unit, Tone::Soft},
                         {passed                   ? ""
                          : figure.missing.empty() ? figure.worstLabel
                                                   : figure.missing,
                          Tone::Soft}});
    }
    // The last column takes what room is left.
    std::size_t used = 0;
    for (std::size_t column = 0; column < 5; ++column) {
        std::size_t widest = 0;
        for (const auto& cells : lines) {
            widest = std::max(widest, report::columnsOf(cells[column].text));
        }
        used += widest + 2;
    }
    for (auto& cells : lines) {
        cells[5].text = used + 10 < width ? fitted(cells[5].text, width - used - 2) : "";
    }
    std::string text = lines.empty() ? "" : '\n' + report::tableText(lines, paint);
    if (left > 0) {
        text += "     " + paint(Tone::Soft, say(Say::MoreCriteria, {std::to_string(left)})) + '\n';
    }
    return text;
}

std::string signedText(double value) {
    return (value > 0 ? "+" : "") + texts().number(value, 2);
}

std::string patchesText(const report::Model& model, const report::Result& result,
                        const Painter& paint, std::size_t width) {
    constexpr std::size_t ofNumbers = 47;
    std::vector<std::vector<Cell>> lines;
    for (std::size_t i = 0; i < std::min(mostPatches, model.rows.size()); ++i) {
        const std::size_t index = model.rows[i].patch;
        const report::Patch& patch = result.patches[index];
        if (!(patch.difference > 0)) {
            break;
        }
        lines.push_back(
            {{texts().number(patch.difference, 2), Tone::Bold, true},
             {fitted(report::labelOf(result, index, texts()), width - ofNumbers)},
             {"ΔL* " + signedText(patch.measured.L - patch.target.L), Tone::Soft, true},
             {"Δa* " + signedText(patch.measured.a - patch.target.a), Tone::Soft, true},
             {"Δb* " + signedText(patch.measured.b - patch.target.b), Tone::Soft, true}});
    }
    if (lines.empty()) {
        return "";
    }
    return '\n' + paint(Tone::Bold, say(Say::LargestDifferences, {model.unit})) + '\n' +
           report::tableText(lines, paint);
}

std::string aimText(const Aim& aim, const std::string& preset) {
    const std::string target = std::filesystem::path(aim.targetPath).filename();
    std::string text = aim.condition.empty()
                           ? say(Say::Against, {target, preset})
                           : say(Say::AgainstCondition, {aim.condition, target, preset});
    for (const std::string& part : {aim.printer, aim.paper}) {
        text += part.empty() ? "" : " · " + part;
    }
    return text;
}

/// What a person does next, the most likely cause first.
std::vector<std::string> adviceOf(const Outcome& outcome, const Aim& aim, bool isReferenceData) {
    const report::Result& result = *outcome.result;
    std::vector<std::string> advice;
    const auto failed = [&](std::string_view part) {
        return std::any_of(result.criteria.begin(), result.criteria.end(), [&](const auto& c) {
            return c.used && c.outcome == report::Outcome::Fail && c.name.find(part) != c.name.npos;
        });
    };
    const auto find = [&](std::string_view name) {
        return std::find_if(result.criteria.begin(), result.criteria.end(),
                            [&](const auto& c) { return c.name == name; });
    };
    if (analysis::isSameFile(aim.references.targetPath,
                             base::wideFromBytes(outcome.measurement.path))) {
        advice.push_back(say(Say::AdviceSameFile));
    } else if (isReferenceData) {
        advice.push_back(say(Say::AdviceSwapped, {outcome.measurement.path}));
    }
    if (result.verdict == report::Verdict::Passed) {
        if (advice.empty()) {
            advice.push_back(say(Say::AdvicePassed));
        }
        return advice;
    }
    constexpr double farOff = 2.5; // times the tolerance: other paper or other data, not drift
    const auto average = find("average");
    const bool isAverageFar = average != result.criteria.end() && average->rounded &&
                              average->tolerance.value_or(0) > 0 &&
                              *average->rounded > farOff * *average->tolerance;
    if (failed("average") && isAverageFar) {
        advice.push_back(
            say(Say::AdviceFarOff,
                {aim.condition.empty() ? std::filesystem::path(aim.targetPath).filename().string()
                                       : aim.condition}));
    }
    if (failed("paperWhite")) {
        advice.push_back(say(Say::AdvicePaper));
    }
    if (failed("solid") || failed("secondary") || failed("spot")) {
        advice.push_back(say(Say::AdviceSolids));
    }
    if (failed("grey")) {
        advice.push_back(say(Say::AdviceGreys));
    }
    if (failed("maximum") && !failed("average")) {
        advice.push_back(say(Say::AdviceSinglePatches));
    }
    const bool isOpen = std::any_of(result.warnings.begin(), result.warnings.end(),
                                    [](const auto& warning) { return warning.keepsOpen; });
    if (result.verdict == report::Verdict::Incomplete) {
        const auto used = [](const auto& c) { return c.used; };
        if (std::none_of(result.criteria.begin(), result.criteria.end(), used)) {
            advice.push_back(say(Say::AdviceNothingJudged));
        } else if (std::any_of(result.criteria.begin(), result.criteria.end(), [](const auto& c) {
                       return c.used && c.outcome == report::Outcome::Unanswered;
                   })) {
            advice.push_back(say(Say::AdviceMissingPatches));
        }
        if (isOpen) {
            advice.push_back(say(Say::AdviceDoubt));
        }
    }
    if (advice.empty()) {
        advice.push_back(say(Say::AdviceCalibrate));
    }
    if (outcome.written.empty()) {
        advice.push_back(say(Say::AdviceShowPage));
    }
    return advice;
}

std::string headText(Fate fate, const std::string& name, const Painter& paint) {
    const Mark mark = markOf(fate);
    return paint(mark.tone, std::string(mark.sign) + ' ' + say(mark.word)) + "  " +
           paint(Tone::Bold, name) + '\n';
}

std::string resultText(const Outcome& outcome, const Aim& aim, bool isReferenceData,
                       const Painter& paint, std::size_t width) {
    const report::Model model = report::makeModel(*outcome.result, nullptr, texts());
    std::string text = headText(outcome.fate, outcome.measurement.path, paint);
    text += wrapped("", 0, aimText(aim, outcome.result->presetName), paint, width, Tone::Soft);
    text += wrapped("", 0, model.sentence, paint, width);
    if (!model.condition.empty()) {
        text += wrapped("", 0, model.condition, paint, width, Tone::Soft);
    }
    for (const std::string& doubt : model.doubts) {
        text += wrapped("  " + paint(Tone::Open, "?") + " ", 4, doubt, paint, width);
    }
    text += criteriaText(model, paint, width);
    text += patchesText(model, *outcome.result, paint, width);
    if (!model.warnings.empty()) {
        text += heading(Say::Warnings, paint);
    }
    for (const std::string& warning : model.warnings) {
        text += wrapped("  " + paint(Tone::Open, "!") + " ", 4, warning, paint, width);
    }
    text += heading(Say::WhatToDo, paint);
    for (const std::string& advice : adviceOf(outcome, aim, isReferenceData)) {
        text += wrapped("  - ", 4, advice, paint, width);
    }
    for (const std::string& path : outcome.written) {
        const Say words = path.ends_with(".html")                     ? Say::PageIn
                          : path.ends_with(".json")                   ? Say::ResultIn
                          : path.find(".label.") != std::string::npos ? Say::LabelIn
                                                                      : Say::CertificateIn;
        text += (path == outcome.written.front() ? "\n" : "") +
                paint(Tone::Plain, say(words, {path})) + '\n';
    }
    return text;
}

/// "Cause", "Remedy" and their texts.
std::string reasonsText(const Problem& problem, const Painter& paint, std::size_t width,
                        std::size_t indent) {
    const std::size_t column =
        indent + std::max(report::columnsOf(say(Say::Cause)), report::columnsOf(say(Say::Remedy))) +
        2;
    std::string text;
    for (const auto& [label, words] :
         {std::pair(Say::Cause, problem.cause), std::pair(Say::Remedy, problem.remedy)}) {
        if (!words.empty()) {
            const bool isSentence = words.ends_with('?') || words.ends_with('.');
            text += wrapped(std::string(indent, ' ') +
                                paint(Tone::Bold, padded(say(label), column - indent)),
                            column, words + (isSentence ? "" : "."), paint, width);
        }
    }
    return text;
}

/// `sign` takes one column.
std::string problemAfter(const std::string& sign, const Problem& problem, const Painter& paint,
                         std::size_t width) {
    return wrapped(sign + " ", 2, problem.what + ".", paint, width) +
           reasonsText(problem, paint, width, 2);
}

} // namespace

std::size_t screenWidth() {
    constexpr std::size_t usual = 80;
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) != 0 || size.ws_col == 0) {
        return usual;
    }
    return std::clamp<std::size_t>(size.ws_col, 60, 100);
}

std::string problemText(const Problem& problem, const Painter& paint, std::size_t width) {
    return problemAfter(paint(Tone::Failed, "!"), problem, paint, width);
}

std::string screenText(const Outcome& outcome, const Aim& aim, bool isReferenceData,
                       const Painter& paint, std::size_t width) {
    if (!outcome.result) {
        return headText(outcome.fate, outcome.measurement.path, paint) +
               problemAfter(" ", *outcome.problem, paint, width);
    }
    const std::string text = resultText(outcome, aim, isReferenceData, paint, width);
    return outcome.problem ? text + "\n" + problemText(*outcome.problem, paint, width) : text;
}

std::string lineText(const Outcome& outcome, const Painter& paint, std::size_t width) {
    constexpr std::size_t ofWord = 14;
    constexpr std::size_t ofFigures = 19;
    constexpr std::size_t ofName = 24;
    constexpr std::size_t shortestReason = 8;
    const Mark mark = markOf(outcome.fate);
    const std::string name = padded(outcome.measurement.path, ofName);
    std::string reason = outcome.fate == Fate::NotDone ? outcome.problem->what : outcome.criterion;
    if (width != 0) {
        const std::size_t used = 2 + ofWord + 2 + ofFigures + 2 + report::columnsOf(name) + 2;
        reason = used + shortestReason <= width ? fitted(reason, width - used) : "";
    }
    const std::size_t ofText = report::columnsOf(outcome.figures);
    const std::string line =
        "  " + paint(mark.tone, padded(std::string(mark.sign) + ' ' + say(mark.word), ofWord)) +
        "  " + std::string(ofText < ofFigures ? ofFigures - ofText : 0, ' ') +
        paint(Tone::Bold, outcome.figures) + "  " + paint(Tone::Plain, name) + "  " +
        paint(Tone::Soft, reason);
    return line.substr(0, line.find_last_not_of(' ') + 1) + '\n';
}

void Totals::add(const Outcome& outcome) {
    ++m_count;
    switch (outcome.fate) {
    case Fate::Passed:
        ++m_passed;
        break;
    case Fate::Failed:
        m_failed.push_back(outcome.measurement.path);
        break;
    case Fate::Incomplete:
        m_incomplete.push_back(outcome.measurement.path);
        break;
    case Fate::NotDone:
        ++m_notDone;
        break;
    }
    if (!outcome.problem) {
        return;
    }
    const Problem& problem = *outcome.problem;
    const auto same = [&](const Trouble& trouble) {
        return trouble.problem.what == problem.what && trouble.problem.remedy == problem.remedy;
    };
    // Each problem that names its file is one of its own; a search over all of them would take
    // long.
    constexpr std::size_t latest = 16;
    const std::size_t skipped = m_troubles.size() > latest ? m_troubles.size() - latest : 0;
    auto found = std::find_if(m_troubles.begin() + static_cast<std::ptrdiff_t>(skipped),
                              m_troubles.end(), same);
    if (found == m_troubles.end()) {
        m_troubles.push_back({problem, {}});
        found = m_troubles.end() - 1;
    }
    found->names.push_back(outcome.measurement.path);
}

Status Totals::status() const {
    return !m_troubles.empty()     ? Status::NotDone
           : !m_failed.empty()     ? Status::Failed
           : !m_incomplete.empty() ? Status::Incomplete
                                   : Status::Passed;
}

std::string Totals::text(const Painter& paint, std::size_t width) const {
    std::string parts;
    const auto part = [&](std::size_t count, Say words) {
        if (count > 0) {
            parts += (parts.empty() ? "" : ", ") + say(words, {std::to_string(count)});
        }
    };
    part(m_passed, Say::TotalPassed);
    part(m_failed.size(), Say::TotalFailed);
    part(m_incomplete.size(), Say::TotalIncomplete);
    part(m_notDone, Say::TotalNotDone);
    const std::string measurements = m_count == 1
                                         ? say(Say::OneMeasurement)
                                         : say(Say::SeveralMeasurements, {std::to_string(m_count)});
    std::string text =
        '\n' +
        paint(Tone::Bold, parts.empty() ? measurements : say(Say::Total, {measurements, parts})) +
        '\n';
    const auto list = [&](Fate fate, const std::vector<std::string>& names) {
        const Mark mark = markOf(fate);
        text += names.empty() ? "" : '\n' + paint(mark.tone, say(mark.word)) + '\n';
        for (const std::string& name : names) {
            text += "  " + paint(Tone::Plain, name) + '\n';
        }
    };
    list(Fate::Failed, m_failed);
    list(Fate::Incomplete, m_incomplete);
    for (const Trouble& trouble : m_troubles) {
        text += '\n' + problemText(trouble.problem, paint, width);
        for (const std::string& name : trouble.names) {
            text += "    " + paint(Tone::Plain, name) + '\n';
        }
    }
    return text;
}

} // namespace check
