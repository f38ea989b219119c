// SPDX-License-Identifier: Apache-2.0
#include "report/Model.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>
#include <numeric>

namespace report {
namespace {

constexpr const char* dash = "\u2013";

/// Decimals that a number needs to be shown as it stands, up to six.
int decimalsOf(double value, int atLeast) {
    if (!std::isfinite(value)) {
        return atLeast;
    }
    int decimals = atLeast;
    for (double scale = std::pow(10, decimals);
         decimals < 6 && std::abs(value * scale - std::round(value * scale)) > 1e-6; scale *= 10) {
        ++decimals;
    }
    return decimals;
}

/// "1 patch", "2 patches"
std::string counted(std::size_t count, const std::string& one, const std::string& many) {
    return std::to_string(count) + ' ' + (count == 1 ? one : many);
}

std::string differenceUnit(const std::string& formula) {
    if (formula == "CIE2000") {
        return "ΔE00";
    }
    if (formula == "CIE76") {
        return "ΔE*ab";
    }
    if (formula == "CIE94") {
        return "ΔE94";
    }
    if (formula == "CIECMC") {
        return "ΔE CMC 1:1";
    }
    return formula == "CIECMC_2_1" ? "ΔE CMC 2:1" : "ΔE " + formula;
}

std::string formulaTitle(const std::string& formula) {
    if (formula == "CIE2000") {
        return "CIEDE2000";
    }
    if (formula == "CIE76") {
        return "CIE 1976 (ΔE*ab)";
    }
    if (formula == "CIE94") {
        return "CIE94, graphic arts";
    }
    if (formula == "CIECMC") {
        return "CMC 1:1";
    }
    return formula == "CIECMC_2_1" ? "CMC 2:1" : formula;
}

const char* wordOf(Outcome outcome) {
    switch (outcome) {
    case Outcome::Pass:
        return "Passed";
    case Outcome::Fail:
        return "Failed";
    case Outcome::Unanswered:
        return "No data";
    case Outcome::Unjudged:
        break;
    }
    return "Not judged";
}

/// " (100 0 0 0)": the device values of a patch, not to be broken; empty without any.
std::string deviceText(const Result& result, std::size_t patch) {
    const std::size_t channels = result.channels.size();
    std::string text;
    for (std::size_t i = 0; i < channels; ++i) {
        const double value = result.device[patch * channels + i];
        text += (i == 0 ? " (" : "\u00a0") + fixedText(value, decimalsOf(value, 0));
    }
    return text.empty() ? text : text + ")";
}

/// Why a criterion has no answer.
std::string missingText(const Criterion& criterion) {
    if (criterion.found > 0) {
        return "only " + std::to_string(criterion.found) + " of the " +
               std::to_string(criterion.needed) + " different patches that it needs";
    }
    return criterion.name == "repeatSpread" ? "no patch was measured more than once"
                                            : "the data hold no such patches";
}

Figure figureOf(const Criterion& criterion, const Result& result) {
    Figure figure;
    figure.title = criterion.title;
    figure.unit = unitOf(criterion, result.formula);
    figure.outcome = criterion.outcome;
    figure.word = wordOf(criterion.outcome);
    figure.patches = criterion.patches;
    const double value = criterion.rounded.value_or(
        criterion.value.value_or(std::numeric_limits<double>::quiet_NaN()));
    figure.value = fixedText(value, criterion.decimals);
    figure.tolerance = dash;
    if (criterion.worstPatch) {
        figure.worstLabel = labelOf(result, *criterion.worstPatch);
    }
    if (criterion.outcome == Outcome::Unanswered) {
        figure.missing = missingText(criterion);
    }
    if (criterion.listed > criterion.found && criterion.found > 0) {
        figure.title += " (" + std::to_string(criterion.found) + " of " +
                        std::to_string(criterion.listed) + " patches)";
    }
    if (!criterion.tolerance) {
        return figure;
    }

    const double limit = *criterion.tolerance;
    const int decimals = decimalsOf(limit, criterion.decimals);
    figure.tolerance = fixedText(limit, decimals);
    if (!std::isfinite(value)) {
        return figure;
    }
    figure.excess = limit > 0 ? value / limit : std::numeric_limits<double>::infinity();
    figure.fill = std::clamp(figure.excess / 2, 0.0, 1.0);
    if (criterion.outcome == Outcome::Pass || criterion.outcome == Outcome::Fail) {
        figure.distance = value == limit ? "at the tolerance"
                                         : fixedText(std::abs(value - limit), decimals) +
                                               (value > limit ? " above" : " below");
    }
    return figure;
}

/// Failed first, the furthest above its tolerance at the top; then what has no data; then the rest,
/// the nearest to its tolerance first.
void putInOrder(std::vector<Figure>& judged) {
    const auto rank = [](const Figure& figure) {
        return figure.outcome == Outcome::Fail ? 0 : figure.outcome == Outcome::Pass ? 2 : 1;
    };
    std::stable_sort(judged.begin(), judged.end(), [&](const Figure& a, const Figure& b) {
        return rank(a) != rank(b) ? rank(a) < rank(b) : a.excess > b.excess;
    });
}

void sayVerdict(Model& model, const Result& result) {
    const Verdict verdict = result.verdict;
    model.verdict = verdict;
    std::size_t failed = 0;
    std::size_t open = 0;
    for (const Figure& figure : model.judged) {
        if (figure.outcome == Outcome::Fail) {
            ++failed;
            model.reasons.push_back(figure.title + ": " + figure.value + " " + figure.unit + ", " +
                                    figure.distance + " the tolerance of " + figure.tolerance);
        } else if (figure.outcome != Outcome::Pass) {
            ++open;
            model.reasons.push_back(figure.title + ": " + figure.missing);
        }
    }
    for (const Warning& warning : result.warnings) {
        (warning.keepsOpen && verdict == Verdict::Incomplete ? model.doubts : model.warnings)
            .push_back(warning.text);
    }
    const std::size_t all = model.judged.size();
    model.word = report::wordOf(verdict);
    switch (verdict) {
    case Verdict::Passed:
        model.sentence =
            all == 1 ? "The one criterion is within its tolerance."
                     : "All " + std::to_string(all) + " criteria are within their tolerances.";
        if (!model.judged.empty()) {
            const Figure& nearest = model.judged.front();
            model.sentence += " Nearest to its limit: " + nearest.title + ", " + nearest.value +
                              " of " + nearest.tolerance + " " + nearest.unit + ".";
        }
        return;
    case Verdict::Failed:
        model.sentence = std::to_string(failed) + " of " +
                         counted(all, "criterion is", "criteria are") + " above tolerance.";
        return;
    case Verdict::Incomplete:
        if (all == 0) {
            model.sentence = "The preset judges no criterion, so nothing can pass.";
        } else if (open == 0 && failed == 0 && !model.doubts.empty()) {
            model.sentence =
                "Every figure is within its tolerance, but the comparison itself is in "
                "doubt, so it can't pass.";
        } else {
            model.sentence =
                std::to_string(open) + " of " + counted(all, "criterion", "criteria") +
                " can't be answered from these data" +
                (failed == 0 ? std::string(".") : ", " + std::to_string(failed) + " failed.");
        }
        return;
    }
}

/// "Measured M1, target M0, preset asks for M1 and requires it"
std::string conditionText(const Result& result) {
    const std::string& measured = result.measurement.measurementCondition;
    const std::string& target = result.target.measurementCondition;
    const bool isAsked = result.presetCondition >= 0 && result.presetCondition <= 3;
    if (measured.empty() && target.empty() && !isAsked) {
        return {};
    }
    const auto stated = [](const std::string& condition) {
        return condition.empty() ? std::string("not stated") : condition;
    };
    std::string text =
        "Measuring condition: measurement " + stated(measured) + ", target " + stated(target);
    if (isAsked) {
        text += std::string(", preset ") +
                (result.conditionRequired ? "requires M" : "asks for M") +
                std::to_string(result.presetCondition);
    }
    return text;
}

/// Largest first; what is no number comes last; equals stay in the result's order.
std::vector<std::size_t> worstFirst(const std::vector<Patch>& patches) {
    std::vector<std::size_t> order(patches.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    const auto key = [&](std::size_t i) {
        return std::isfinite(patches[i].difference) ? patches[i].difference
                                                    : -std::numeric_limits<double>::infinity();
    };
    std::stable_sort(order.begin(), order.end(),
                     [&](std::size_t a, std::size_t b) { return key(a) > key(b); });
    return order;
}

void chooseDrawn(Model& model) {
    const std::size_t all = model.rows.size();
    const std::size_t worst = all <= mostDrawn ? all : mostDrawn / 2;
    model.drawn.resize(worst);
    std::iota(model.drawn.begin(), model.drawn.end(), std::size_t{0});
    if (worst == all) {
        return;
    }
    const std::size_t rest = mostDrawn - worst;
    for (std::size_t i = 0; i < rest; ++i) {
        model.drawn.push_back(worst + i * (all - worst) / rest);
    }
    model.drawnText = "Drawn are " + std::to_string(mostDrawn) + " of " + std::to_string(all) +
                      " patches: the " + std::to_string(worst) +
                      " with the largest differences, and others spread evenly over the rest.";
}

void drawHistogram(Model& model, const Result& result) {
    std::vector<double> differences;
    for (const Patch& patch : result.patches) {
        differences.push_back(patch.difference);
    }
    model.histogram = histogramOf(differences);
    model.marks = {
        {"average " + fixedText(result.statistics.mean, 2), result.statistics.mean, false},
        {"95 % " + fixedText(result.statistics.percentile95, 2), result.statistics.percentile95,
         false}};
    for (const Criterion& criterion : result.criteria) {
        if (!criterion.used || !criterion.tolerance) {
            continue;
        }
        const double limit = *criterion.tolerance;
        const std::string text = fixedText(limit, decimalsOf(limit, 0));
        if (criterion.name == "average") {
            model.marks[0].label += " (at most " + text + ")";
        } else if (criterion.name == "percentile95") {
            model.marks[1].label += " (at most " + text + ")";
        } else if (criterion.name == "maximum") {
            model.marks.push_back({"limit of each patch " + text, limit, true});
        }
    }
    std::erase_if(model.marks, [](const Mark& mark) { return !std::isfinite(mark.value); });
    for (const Bin& bin : model.histogram) {
        model.histogramText += (model.histogramText.empty() ? "" : "; ") +
                               fixedText(bin.from, decimalsOf(bin.from, 0)) + " to " +
                               fixedText(bin.to, decimalsOf(bin.to, 0)) + ": " +
                               std::to_string(bin.count);
    }
}

void addFact(Facts& facts, const char* label, const std::string& text) {
    if (!text.empty()) {
        facts.emplace_back(label, text);
    }
}

std::string foundBy(const std::string& how) {
    if (how == "own") {
        return "its own patches";
    }
    if (how == "profile") {
        return "the profile, evaluated at their device values";
    }
    if (how == "deviceValues") {
        return "patches with equal device values";
    }
    if (how == "labels") {
        return "patches with equal ids or names";
    }
    return how == "order" ? "patches in the same order" : how;
}

std::string listed(const Unpaired& unpaired) {
    if (unpaired.count == 0) {
        return {};
    }
    std::string text = std::to_string(unpaired.count) + (unpaired.labels.empty() ? "" : ":");
    for (const std::string& label : unpaired.labels) {
        text += ' ' + label;
    }
    return !unpaired.labels.empty() && unpaired.count > unpaired.labels.size() ? text + " ..."
                                                                               : text;
}

Facts factsOf(const Input& input) {
    Facts facts;
    addFact(facts, "File", input.path);
    addFact(facts, "Kind", input.kind == "profile" ? "ICC profile" : "CGATS text");
    facts.insert(facts.end(), input.statements.begin(), input.statements.end());
    return facts;
}

void addSections(Model& model, const Result& result, const Meta* meta) {
    Facts job;
    if (meta != nullptr) {
        addFact(job, "Title", meta->title);
        addFact(job, "Job", std::to_string(meta->jobId));
        if (meta->parentId) {
            addFact(job, "Part of job", std::to_string(*meta->parentId));
        }
        addFact(job, "Strip", meta->strip == 2 ? "Second" : "First");
        addFact(job, "Verified", model.created);
        addFact(job, "Paper", meta->paper);
        addFact(job, "Instrument", meta->instrument);
        addFact(job, "Workflow", meta->workflow);
        addFact(job, "Server", meta->server);
        addFact(job, "User", meta->user);
    }
    addFact(job, "Preset", result.presetName);
    addFact(job, "Preset number", result.presetId > 0 ? std::to_string(result.presetId) : "");
    addFact(job, "Colour difference", formulaTitle(result.formula));
    model.sections = {{meta != nullptr ? "Job" : "Preset", job},
                      {"Target", factsOf(result.target)},
                      {"Measurement", factsOf(result.measurement)}};
    if (result.patchSet) {
        model.sections.emplace_back("Patch set", factsOf(*result.patchSet));
    }
    Facts pairing;
    addFact(pairing, "Patches of",
            result.selection == "patchSet" ? "the patch set" : "the " + result.selection);
    addFact(pairing, "Target values from", foundBy(result.targetBy));
    addFact(pairing, "Measured values from", foundBy(result.measurementBy));
    addFact(pairing, "Patches of the target that were not measured", listed(result.unpairedTarget));
    addFact(pairing, "Measured patches without a target", listed(result.unpairedMeasurement));
    addFact(pairing, "Patches of the patch set that the files lack",
            listed(result.unpairedPatchSet));
    if (result.repeats.patches > 0) {
        addFact(pairing, "Measured more than once",
                counted(result.repeats.patches, "patch", "patches") + ", " +
                    counted(result.repeats.readings, "reading", "readings") +
                    (result.repeats.averaged ? "; their means are compared"
                                             : "; each is compared by itself"));
        if (result.repeats.worstPatch && result.repeats.largestDistance) {
            addFact(pairing, "Furthest from the mean of its readings",
                    fixedText(*result.repeats.largestDistance, 2) + " " + model.unit + ", " +
                        labelOf(result, *result.repeats.worstPatch));
        }
    }
    model.sections.emplace_back("Pairing", pairing);
    model.sections.emplace_back(
        "Made by", Facts{{"Tintgate", result.toolVersion}, {"libTintgate", result.libraryVersion}});
}

void addRepeats(Model& model, const Result& result) {
    const Repeats& repeats = result.repeats;
    if (repeats.patches == 0 || !repeats.largestDistance) {
        return;
    }
    model.statistics.emplace_back("Read repeatedly", std::to_string(repeats.patches));
    model.statistics.emplace_back("Spread of repeats", fixedText(*repeats.largestDistance, 2));
}

void addHead(Model& model, const Result& result, const Meta* meta) {
    const std::string& path = result.measurement.path;
    model.title = meta != nullptr && !meta->title.empty() ? meta->title
                  : meta != nullptr                       ? "Job " + std::to_string(meta->jobId)
                                                          : path.substr(path.rfind('/') + 1);
    std::vector<std::string> parts;
    if (meta != nullptr) {
        model.created = dateText(meta->created);
        parts = {meta->strip == 2 ? "Second strip" : "First strip", meta->paper, meta->instrument,
                 result.presetName, model.created};
    } else {
        parts = {result.presetName};
    }
    for (const std::string& part : parts) {
        if (!part.empty()) {
            model.subtitle += (model.subtitle.empty() ? "" : " · ") + part;
        }
    }
}

} // namespace

const char* wordOf(Verdict verdict) {
    return verdict == Verdict::Passed   ? "Passed"
           : verdict == Verdict::Failed ? "Failed"
                                        : "Incomplete";
}

std::string labelOf(const Result& result, std::size_t index) {
    const Patch& patch = result.patches[index];
    const auto joined = [](const std::string& id, const std::string& name) {
        return id.empty() || name.empty() || name == id ? id + (name == id ? "" : name)
                                                        : id + " " + name;
    };
    const std::string inTarget = joined(patch.id, patch.name);
    const std::string onSheet = joined(patch.measuredId, patch.measuredName);
    const std::string device = deviceText(result, index);
    if (onSheet.empty() || onSheet == inTarget) {
        return (inTarget.empty() ? "row " + std::to_string(index + 1) : inTarget) + device;
    }
    return onSheet + device + (inTarget.empty() ? "" : ", in the target " + inTarget);
}

std::string fixedText(double value, int decimals) {
    char text[400];
    if (!std::isfinite(value)) {
        return dash;
    }
    const auto [end, error] =
        std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, decimals);
    return error == std::errc() ? std::string(text, end) : dash;
}

std::string unitOf(const Criterion& criterion, const std::string& formula) {
    return criterion.unit == "dH"    ? "ΔH*ab"
           : criterion.unit == "dCh" ? "ΔCh"
                                     : differenceUnit(formula);
}

std::string dayText(int day, int month, int year) {
    static constexpr const char* months[] = {"January",   "February", "March",    "April",
                                             "May",       "June",     "July",     "August",
                                             "September", "October",  "November", "December"};
    return std::to_string(day) + ' ' +
           (month >= 1 && month <= 12 ? months[month - 1] : std::to_string(month)) + ' ' +
           std::to_string(year);
}

std::string dateText(const std::string& created) {
    return dayText(std::stoi(created.substr(8, 2)), std::stoi(created.substr(5, 2)),
                   std::stoi(created.substr(0, 4))) +
           ", " + created.substr(11, 5) + " (UTC" + created.substr(19) + ")";
}

std::vector<Bin> histogramOf(const std::vector<double>& values) {
    double largest = 0;
    for (const double value : values) {
        if (std::isfinite(value)) {
            largest = std::max(largest, value);
        }
    }
    constexpr double fewest = 12;
    constexpr double smallestWidth = 0.01;
    const double wanted = std::max(largest / fewest, smallestWidth);
    const double power = std::pow(10, std::floor(std::log10(wanted * (1 + 1e-12))));
    const double step = wanted / power;
    const double width = power * (step >= 5 ? 5 : step >= 2 ? 2 : 1);

    // 1.2 belongs to the bin that begins there, though 1.2 / 0.1 is below 12.
    const auto binOf = [&](double value) {
        return static_cast<std::size_t>(std::max(value, 0.0) / width + 1e-9);
    };
    std::vector<Bin> bins(binOf(largest) + 1);
    for (std::size_t i = 0; i < bins.size(); ++i) {
        bins[i] = {static_cast<double>(i) * width, static_cast<double>(i + 1) * width, 0};
    }
    for (const double value : values) {
        if (std::isfinite(value)) {
            ++bins[binOf(value)].count;
        }
    }
    return bins;
}

Model makeModel(const Result& result, const Meta* meta, const Facts& print) {
    Model model;
    addHead(model, result, meta);
    model.unit = differenceUnit(result.formula);
    for (const Criterion& criterion : result.criteria) {
        (criterion.used ? model.judged : model.others).push_back(figureOf(criterion, result));
    }
    putInOrder(model.judged);
    sayVerdict(model, result);
    model.condition = conditionText(result);
    const Statistics& s = result.statistics;
    model.statistics = {{"Patches", std::to_string(result.patches.size())},
                        {"Average", fixedText(s.mean, 2)},
                        {"Median", fixedText(s.median, 2)},
                        {"95th percentile", fixedText(s.percentile95, 2)},
                        {"Largest", fixedText(s.maximum, 2)},
                        {"Standard deviation", fixedText(s.standardDeviation, 2)}};
    addRepeats(model, result);
    drawHistogram(model, result);
    for (const std::size_t patch : worstFirst(result.patches)) {
        model.rows.push_back(
            {patch, swatch(result.patches[patch].target), swatch(result.patches[patch].measured)});
    }
    chooseDrawn(model);
    addSections(model, result, meta);
    if (!print.empty()) {
        for (const auto& [label, text] : print) {
            model.subtitle += (model.subtitle.empty() ? "" : " · ") + text;
        }
        model.sections.emplace(model.sections.begin(), "Print", print);
    }
    return model;
}

} // namespace report
