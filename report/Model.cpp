// SPDX-License-Identifier: Apache-2.0
#include "report/Model.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <iterator>
#include <limits>
#include <numeric>

namespace report {
namespace {

using languages::Texts;

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

std::string formulaTitle(const std::string& formula, const Texts& say) {
    if (formula == "CIE2000") {
        return "CIEDE2000";
    }
    if (formula == "CIE76") {
        return "CIE 1976 (ΔE*ab)";
    }
    if (formula == "CIE94") {
        return say("page.cie94");
    }
    if (formula == "CIECMC") {
        return "CMC 1:1";
    }
    return formula == "CIECMC_2_1" ? "CMC 2:1" : formula;
}

std::string wordOf(Outcome outcome, const Texts& say) {
    switch (outcome) {
    case Outcome::Pass:
        return say("outcome.passed");
    case Outcome::Fail:
        return say("outcome.failed");
    case Outcome::Unanswered:
        return say("outcome.noData");
    case Outcome::Unjudged:
        break;
    }
    return say("outcome.notJudged");
}

/// " (100 0 0 0)": the device values of a patch, not to be broken; empty without any.
std::string deviceText(const Result& result, std::size_t patch, const Texts& say) {
    const std::size_t channels = result.channels.size();
    std::string text;
    for (std::size_t i = 0; i < channels; ++i) {
        const double value = result.device[patch * channels + i];
        text += (i == 0 ? " (" : "\u00a0") + say.number(value, decimalsOf(value, 0));
    }
    return text.empty() ? text : text + ")";
}

/// Why a criterion has no answer.
std::string missingText(const Criterion& criterion, const Texts& say) {
    if (criterion.found > 0) {
        return say("page.tooFewPatches",
                   {{"found", criterion.found}, {"needed", criterion.needed}});
    }
    if (criterion.name == "repeatSpread" || criterion.name == "repeatAverage") {
        return say("page.noRepeats");
    }
    return criterion.unit == "dTV" ? say("page.noTints") : say("page.noSuchPatches");
}

Figure figureOf(const Criterion& criterion, const Result& result, const Texts& say) {
    Figure figure;
    figure.title = titleOf(criterion, say);
    figure.unit = unitOf(criterion, result.formula);
    figure.outcome = criterion.outcome;
    figure.word = wordOf(criterion.outcome, say);
    figure.patches = criterion.patches;
    const double value = criterion.rounded.value_or(
        criterion.value.value_or(std::numeric_limits<double>::quiet_NaN()));
    figure.value = say.number(value, criterion.decimals);
    figure.tolerance = dash;
    if (criterion.worstPatch) {
        figure.worstLabel = labelOf(result, *criterion.worstPatch, say);
    }
    if (criterion.outcome == Outcome::Unanswered) {
        figure.missing = missingText(criterion, say);
    }
    if (criterion.listed > criterion.found && criterion.found > 0) {
        figure.title = say("page.partOfPatches", {{"criterion", figure.title},
                                                  {"found", criterion.found},
                                                  {"listed", criterion.listed}});
    }
    if (!criterion.tolerance) {
        return figure;
    }

    const double limit = *criterion.tolerance;
    const int decimals = decimalsOf(limit, criterion.decimals);
    figure.tolerance = say.number(limit, decimals);
    if (!std::isfinite(value)) {
        return figure;
    }
    figure.excess = limit > 0 ? value / limit : std::numeric_limits<double>::infinity();
    figure.fill = std::clamp(figure.excess / 2, 0.0, 1.0);
    if (criterion.outcome == Outcome::Pass || criterion.outcome == Outcome::Fail) {
        const std::string off = say.number(std::abs(value - limit), decimals);
        figure.distance = value == limit  ? say("page.atTolerance")
                          : value > limit ? say("page.above", {{"difference", off}})
                                          : say("page.below", {{"difference", off}});
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

std::string reasonText(const Figure& figure, const Texts& say) {
    if (figure.outcome != Outcome::Fail) {
        return say("page.openReason", {{"criterion", figure.title}, {"why", figure.missing}});
    }
    return say("page.failedReason", {{"criterion", figure.title},
                                     {"value", figure.value},
                                     {"unit", figure.unit},
                                     {"distance", figure.distance},
                                     {"tolerance", figure.tolerance}});
}

std::string passedText(const std::vector<Figure>& judged, const Texts& say) {
    std::string text = say("page.passed", {{"count", judged.size()}});
    if (!judged.empty()) {
        const Figure& nearest = judged.front();
        text += say("sentence.gap") + say("page.nearest", {{"criterion", nearest.title},
                                                           {"value", nearest.value},
                                                           {"tolerance", nearest.tolerance},
                                                           {"unit", nearest.unit}});
    }
    return text;
}

void sayVerdict(Model& model, const Result& result, const Texts& say) {
    const Verdict verdict = result.verdict;
    model.verdict = verdict;
    std::size_t failed = 0;
    std::size_t open = 0;
    for (const Figure& figure : model.judged) {
        if (figure.outcome != Outcome::Pass) {
            ++(figure.outcome == Outcome::Fail ? failed : open);
            model.reasons.push_back(reasonText(figure, say));
        }
    }
    for (const Warning& warning : result.warnings) {
        (warning.keepsOpen && verdict == Verdict::Incomplete ? model.doubts : model.warnings)
            .push_back(warningText(warning, say));
    }
    const std::size_t all = model.judged.size();
    model.word = report::wordOf(verdict, say);
    switch (verdict) {
    case Verdict::Passed:
        model.sentence = passedText(model.judged, say);
        return;
    case Verdict::Failed:
        model.sentence = say("page.failed", {{"failed", failed}, {"count", all}});
        return;
    case Verdict::Incomplete:
        if (all == 0) {
            model.sentence = say("page.nothingJudged");
        } else if (open == 0 && failed == 0 && !model.doubts.empty()) {
            model.sentence = say("page.inDoubt");
        } else if (failed == 0) {
            model.sentence = say("page.open", {{"open", open}, {"count", all}});
        } else {
            model.sentence =
                say("page.openAndFailed", {{"open", open}, {"count", all}, {"failed", failed}});
        }
        return;
    }
}

/// "measurement M1, target M0, preset requires M1"
std::string conditionText(const Result& result, const Texts& say) {
    const std::string& measured = result.measurement.measurementCondition;
    const std::string& target = result.target.measurementCondition;
    const bool isAsked = result.presetCondition >= 0 && result.presetCondition <= 3;
    if (measured.empty() && target.empty() && !isAsked) {
        return {};
    }
    const auto stated = [&](const std::string& condition) {
        return condition.empty() ? say("page.notStated") : condition;
    };
    const std::string preset = "M" + std::to_string(result.presetCondition);
    std::string text =
        say("page.condition", {{"measurement", stated(measured)}, {"target", stated(target)}});
    if (isAsked) {
        text += result.conditionRequired ? say("page.conditionRequired", {{"preset", preset}})
                                         : say("page.conditionAsked", {{"preset", preset}});
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

/// The rows of the table, then those that only the charts need.
void chooseRows(Model& model, const Result& result, const Texts& say) {
    const std::vector<std::size_t> order = worstFirst(result.patches);
    const std::size_t all = order.size();
    model.shown = all > mostRows ? worstRows : all;
    const auto add = [&](std::size_t place) {
        const Patch& patch = result.patches[order[place]];
        model.rows.push_back({order[place], swatch(patch.target), swatch(patch.measured)});
    };
    for (std::size_t i = 0; i < model.shown; ++i) {
        add(i);
    }
    if (model.shown < all) {
        model.shownText = say("page.worstRows", {{"shown", model.shown}, {"all", all}});
    }
    const std::size_t worst = all <= mostDrawn ? all : mostDrawn / 2;
    model.drawn.resize(worst);
    std::iota(model.drawn.begin(), model.drawn.end(), std::size_t{0});
    if (worst == all) {
        return;
    }
    const std::size_t rest = mostDrawn - worst;
    for (std::size_t i = 0; i < rest; ++i) {
        const std::size_t place = worst + i * (all - worst) / rest;
        model.drawn.push_back(place < model.shown ? place : model.rows.size());
        if (place >= model.shown) {
            add(place);
        }
    }
    model.drawnText = say("page.drawn", {{"drawn", mostDrawn}, {"all", all}, {"worst", worst}});
}

void drawHistogram(Model& model, const Result& result, const Texts& say) {
    std::vector<double> differences;
    for (const Patch& patch : result.patches) {
        differences.push_back(patch.difference);
    }
    model.histogram = histogramOf(differences);
    const auto average = say.number(result.statistics.mean, 2);
    const auto percentile = say.number(result.statistics.percentile95, 2);
    model.marks = {{say("page.averageMark", {{"value", average}}), result.statistics.mean, false},
                   {say("page.percentileMark", {{"value", percentile}}),
                    result.statistics.percentile95, false}};
    for (const Criterion& criterion : result.criteria) {
        if (!criterion.used || !criterion.tolerance) {
            continue;
        }
        const double limit = *criterion.tolerance;
        const std::string text = say.number(limit, decimalsOf(limit, 0));
        if (criterion.name == "average") {
            model.marks[0].label +=
                say("sentence.space") + say("page.limitOfMark", {{"limit", text}});
        } else if (criterion.name == "percentile95") {
            model.marks[1].label +=
                say("sentence.space") + say("page.limitOfMark", {{"limit", text}});
        } else if (criterion.name == "maximum") {
            model.marks.push_back({say("page.patchLimit", {{"limit", text}}), limit, true});
        }
    }
    std::erase_if(model.marks, [](const Mark& mark) { return !std::isfinite(mark.value); });
    for (const Bin& bin : model.histogram) {
        model.histogramText +=
            (model.histogramText.empty() ? "" : "; ") +
            say("page.bin", {{"from", say.number(bin.from, decimalsOf(bin.from, 0))},
                             {"to", say.number(bin.to, decimalsOf(bin.to, 0))},
                             {"patches", bin.count}});
    }
}

void addFact(Facts& facts, const std::string& label, const std::string& text) {
    if (!text.empty()) {
        facts.emplace_back(label, text);
    }
}

std::string foundBy(const std::string& how, const Texts& say) {
    return say.find("foundBy." + how).value_or(how);
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

Facts factsOf(const Input& input, const Texts& say) {
    Facts facts;
    addFact(facts, say("fact.file"), input.path);
    addFact(facts, say("fact.kind"),
            input.kind == "profile" ? say("fact.profile") : say("fact.text"));
    for (const auto& [name, text] : input.statements) {
        addFact(facts, say.find("statement." + name).value_or(name),
                text.empty() ? say.find("statement." + name + "Text").value_or("") : text);
    }
    return facts;
}

Facts jobFacts(const Model& model, const Meta& meta, const Texts& say) {
    Facts job;
    addFact(job, say("fact.title"), meta.title);
    addFact(job, say("fact.job"), std::to_string(meta.jobId));
    if (meta.parentId) {
        addFact(job, say("fact.parent"), std::to_string(*meta.parentId));
    }
    addFact(job, say("fact.strip"),
            meta.strip == 2 ? say("fact.secondStrip") : say("fact.firstStrip"));
    addFact(job, say("fact.verified"), model.created);
    addFact(job, say("fact.paper"), meta.paper);
    addFact(job, say("fact.instrument"), meta.instrument);
    addFact(job, say("fact.workflow"), meta.workflow);
    addFact(job, say("fact.server"), meta.server);
    addFact(job, say("fact.user"), meta.user);
    return job;
}

Facts pairingFacts(const Model& model, const Result& result, const Texts& say) {
    Facts pairing;
    addFact(pairing, say("pairing.selection"),
            say.find("selection." + result.selection).value_or(result.selection));
    addFact(pairing, say("pairing.target"), foundBy(result.targetBy, say));
    addFact(pairing, say("pairing.measurement"), foundBy(result.measurementBy, say));
    addFact(pairing, say("pairing.notMeasured"), listed(result.unpairedTarget));
    addFact(pairing, say("pairing.noTarget"), listed(result.unpairedMeasurement));
    addFact(pairing, say("pairing.notInFiles"), listed(result.unpairedPatchSet));
    const Repeats& repeats = result.repeats;
    if (repeats.patches > 0) {
        const std::string patches = say("count.patches", {{"count", repeats.patches}});
        const std::string readings = say("count.readings", {{"count", repeats.readings}});
        addFact(pairing, say("pairing.repeated"),
                repeats.averaged
                    ? say("pairing.averaged", {{"patches", patches}, {"readings", readings}})
                    : say("pairing.each", {{"patches", patches}, {"readings", readings}}));
        if (repeats.worstPatch && repeats.largestDistance) {
            addFact(pairing, say("pairing.furthest"),
                    say.number(*repeats.largestDistance, 2) + " " + model.unit + ", " +
                        labelOf(result, *repeats.worstPatch, say));
        }
    }
    return pairing;
}

void addSections(Model& model, const Result& result, const Meta* meta, const Texts& say) {
    Facts job;
    if (meta != nullptr) {
        job = jobFacts(model, *meta, say);
    }
    addFact(job, say("fact.preset"), result.presetName);
    addFact(job, say("fact.presetNumber"),
            result.presetId > 0 ? std::to_string(result.presetId) : "");
    addFact(job, say("fact.formula"), formulaTitle(result.formula, say));
    model.sections = {{meta != nullptr ? say("section.job") : say("section.preset"), job},
                      {say("section.target"), factsOf(result.target, say)},
                      {say("section.measurement"), factsOf(result.measurement, say)}};
    if (result.patchSet) {
        model.sections.emplace_back(say("section.patchSet"), factsOf(*result.patchSet, say));
    }
    model.sections.emplace_back(say("section.pairing"), pairingFacts(model, result, say));
    model.sections.emplace_back(
        say("section.programs"),
        Facts{{"Tintgate", result.toolVersion}, {"libTintgate", result.libraryVersion}});
}

void addRepeats(Model& model, const Result& result, const Texts& say) {
    const Repeats& repeats = result.repeats;
    if (repeats.patches == 0 || !repeats.largestDistance) {
        return;
    }
    model.statistics.emplace_back(say("statistic.repeated"), say.count(repeats.patches));
    model.statistics.emplace_back(say("statistic.spread"), say.number(*repeats.largestDistance, 2));
}

// ---- Tone values, greys, repeated readings and paper

constexpr const char* processInks[] = {"Cyan", "Magenta", "Yellow", "Black"};

/// "Cyan", or the name that a channel after the process inks has.
std::string inkTitle(const Result& result, std::size_t channel, const Texts& say) {
    if (channel < std::size(processInks)) {
        return say.find(std::string("measure.ink.") + processInks[channel]).value_or("");
    }
    const std::string& name = result.channels[channel];
    return name.starts_with("SPOT_") ? name.substr(5) : name;
}

bool isWithin(double nominal, double from, double to) {
    constexpr double deviceTolerance = 0.5;
    return nominal >= from - deviceTolerance && nominal <= to + deviceTolerance;
}

/// The narrowest tolerance of a tint; NaN without any. Criteria by name as docs/criteria.md has
/// them.
double toneTolerance(const Result& result, std::size_t channel, double nominal, bool isSpotTone) {
    double narrowest = std::numeric_limits<double>::infinity();
    for (const Criterion& criterion : result.criteria) {
        bool applies = false;
        if (isSpotTone) {
            applies = criterion.name == "sctvMaximum" ||
                      (criterion.name == "sctvSpotMaximum" && channel >= std::size(processInks));
        } else if (const std::string stem = std::string("tone") + processInks[channel];
                   criterion.name.starts_with(stem)) {
            const std::string part = criterion.name.substr(stem.size());
            applies =
                part.empty() ||
                (part == "Middle" && (isWithin(nominal, 40, 40) || isWithin(nominal, 50, 50))) ||
                (part == "ThreeQuarters" && isWithin(nominal, 70, 80));
        }
        if (applies && criterion.used && criterion.tolerance) {
            narrowest = std::min(narrowest, *criterion.tolerance);
        }
    }
    return std::isfinite(narrowest) ? narrowest : std::numeric_limits<double>::quiet_NaN();
}

std::string aimText(const std::string& aims, const Texts& say) {
    return aims == "target"    ? say("measure.aimTarget")
           : aims == "nominal" ? say("measure.aimNominal")
                               : say("measure.aimCurve", {{"curve", aims}});
}

void addTones(Model& model, const Result& result, const Tones& tones, bool isSpotTone,
              const Texts& say) {
    for (const InkTones& ink : tones.inks) {
        if (ink.steps.empty() || (!isSpotTone && ink.channel >= std::size(processInks))) {
            continue;
        }
        ToneChart& chart = model.tones.emplace_back();
        chart.title = inkTitle(result, ink.channel, say);
        if (isSpotTone) {
            chart.title = say("measure.spotTone", {{"ink", chart.title}});
        }
        double largest = -1;
        double where = 0;
        for (const ToneStep& step : ink.steps) {
            const double off = std::abs(step.measured - step.aim);
            const double tolerance = toneTolerance(result, ink.channel, step.nominal, isSpotTone);
            chart.points.push_back({step.nominal, step.measured - step.nominal,
                                    step.aim - step.nominal, tolerance, off > tolerance});
            if (off > largest) {
                largest = off;
                where = step.nominal;
            }
        }
        chart.text =
            say("measure.toneText", {{"aim", aimText(isSpotTone ? tones.aims : ink.aims, say)},
                                     {"deviation", say.number(largest, 2)},
                                     {"tint", say.number(where, decimalsOf(where, 0))}});
    }
}

void addGreys(Model& model, const Result& result) {
    model.greys = result.greys;
    std::stable_sort(model.greys.begin(), model.greys.end(),
                     [](const Grey& a, const Grey& b) { return a.tone < b.tone; });
}

void addSpreads(Model& model, const Result& result, const Texts& say) {
    std::vector<RepeatedPatch> each = result.repeats.each;
    std::stable_sort(each.begin(), each.end(), [](const RepeatedPatch& a, const RepeatedPatch& b) {
        return a.largest > b.largest;
    });
    for (std::size_t i = 0; i < std::min(each.size(), mostSpreads); ++i) {
        model.spreads.push_back(
            {labelOf(result, each[i].patch, say), each[i].mean, each[i].largest});
    }
    if (each.size() > mostSpreads) {
        model.spreadsText = say("measure.spreads", {{"drawn", mostSpreads}, {"all", each.size()}});
    }
}

std::string labText(const std::optional<colour::Lab>& lab, const Texts& say) {
    return lab ? say.number(lab->L, 2) + " " + say.number(lab->a, 2) + " " + say.number(lab->b, 2)
               : dash;
}

void addPapers(Model& model, const Papers& papers, const Texts& say) {
    PaperPair pair;
    pair.sentence = papers.aims == "absolute"    ? say("measure.aimsAbsolute")
                    : !papers.adjusted           ? say("measure.aimsUnadjusted")
                    : papers.aims == "corrected" ? say("measure.aimsCorrected")
                                                 : say("measure.aimsRelative");
    pair.target = labText(papers.target, say);
    pair.measured = labText(papers.measured, say);
    pair.difference = say.number(papers.difference, 2);
    pair.targetSwatch = swatch(papers.target.value_or(colour::Lab{}));
    pair.measuredSwatch = swatch(papers.measured.value_or(colour::Lab{}));
    model.papers = pair;
}

void addMeasures(Model& model, const Result& result, const Texts& say) {
    Facts facts;
    if (result.papers) {
        addPapers(model, *result.papers, say);
        addFact(facts, say("measure.aims"), model.papers->sentence);
        addFact(facts, say("measure.targetPaper"), model.papers->target);
        addFact(facts, say("measure.measuredPaper"), model.papers->measured);
        addFact(facts, say("measure.paperDifference"), model.papers->difference);
    }
    if (result.tones) {
        addTones(model, result, *result.tones, false, say);
        addFact(facts, say("measure.toneValues"),
                result.tones->method == "density"        ? say("measure.byDensity")
                : result.tones->method == "colorimetric" ? say("measure.byColour")
                                                         : "");
    }
    if (result.spotTones) {
        addTones(model, result, *result.spotTones, true, say);
    }
    addGreys(model, result);
    addSpreads(model, result, say);
    if (!facts.empty()) {
        model.sections.emplace(model.sections.end() - 1, say("measure.section"), facts);
    }
}

void addHead(Model& model, const Result& result, const Meta* meta, const Texts& say) {
    const std::string& path = result.measurement.path;
    model.title = meta != nullptr ? jobTitle(*meta, say) : path.substr(path.rfind('/') + 1);
    std::vector<std::string> parts;
    if (meta != nullptr) {
        model.created = dateText(meta->created, say);
        parts = {meta->strip == 2 ? say("page.secondStrip") : say("page.firstStrip"), meta->paper,
                 meta->instrument, result.presetName, model.created};
    } else {
        parts = {result.presetName};
    }
    for (const std::string& part : parts) {
        if (!part.empty()) {
            model.subtitle += (model.subtitle.empty() ? "" : " · ") + part;
        }
    }
}

std::string statementOf(const Input& input, const char* wanted) {
    for (const auto& [name, text] : input.statements) {
        if (name == wanted) {
            return text;
        }
    }
    return {};
}

/// What a verdict is worth nothing without, for the first page of a print.
void addBasis(Model& model, const Result& result, const Meta* meta, const std::string& condition,
              const Texts& say) {
    const std::string& path = result.target.path;
    const std::string file = path.substr(path.rfind('/') + 1);
    const std::string description = statementOf(result.target, "description");
    addFact(model.basis, say("section.target"),
            description.empty() ? file : description + " (" + file + ")");
    addFact(model.basis, say("section.preset"), result.presetName);
    addFact(model.basis, say("fact.date"),
            meta != nullptr ? model.created : statementOf(result.measurement, "created"));
    addFact(model.basis, say("fact.instrument"),
            meta != nullptr && !meta->instrument.empty()
                ? meta->instrument
                : statementOf(result.measurement, "instrumentation"));
    addFact(model.basis, say("fact.condition"), condition);
    if (meta != nullptr) {
        addFact(model.basis, say("fact.strip"),
                meta->strip == 2 ? say("fact.secondStrip") : say("fact.firstStrip"));
        addFact(model.basis, say("fact.paper"), meta->paper);
    }
}

/// The file that is meant, as the sentences need it: "the target", "of the target", "in the
/// target".
void addRole(languages::Recognised& sentence, const std::string& name, const std::string& english,
             const Texts& say) {
    const std::string role = english == "patch set" ? "patchSet" : english;
    for (const char* form : {"", "Of", "In"}) {
        if (const auto text = say.find("role." + role + form)) {
            sentence.values.emplace_back(name + form, *text);
        }
    }
}

} // namespace

std::string wordOf(Verdict verdict, const Texts& say) {
    return verdict == Verdict::Passed   ? say("verdict.passed")
           : verdict == Verdict::Failed ? say("verdict.failed")
                                        : say("verdict.incomplete");
}

std::string titleOf(const Criterion& criterion, const Texts& say) {
    return say.find("criterion." + criterion.name).value_or(criterion.title);
}

std::string warningText(const Warning& warning, const Texts& say) {
    if (say.language() == languages::Language::English) {
        return warning.text;
    }
    auto sentence = languages::recognise(warning.text, "warning." + warning.code + ".");
    if (!sentence) {
        return warning.text;
    }
    const auto values = sentence->values;
    for (auto& [name, text] : sentence->values) {
        if (name == "note") {
            const auto note = languages::recognise(text, "note.");
            text = note ? say(*note) : text;
        } else if (name == "stated") {
            const auto stated = languages::recognise(text, "stated.");
            text = stated ? say(*stated) : text;
        }
    }
    for (const auto& [name, text] : values) {
        if (name == "role" || name == "other") {
            addRole(*sentence, name, text, say);
        }
    }
    return say(*sentence);
}

std::string jobTitle(const Meta& meta, const Texts& say) {
    return meta.title.empty() ? say("page.job", {{"job", std::to_string(meta.jobId)}}) : meta.title;
}

std::string labelOf(const Result& result, std::size_t index, const Texts& say) {
    const Patch& patch = result.patches[index];
    const auto joined = [](const std::string& id, const std::string& name) {
        return id.empty() || name.empty() || name == id ? id + (name == id ? "" : name)
                                                        : id + " " + name;
    };
    const std::string inTarget = joined(patch.id, patch.name);
    const std::string onSheet = joined(patch.measuredId, patch.measuredName);
    const std::string device = deviceText(result, index, say);
    if (onSheet.empty() || onSheet == inTarget) {
        return (inTarget.empty() ? say("page.row", {{"row", index + 1}}) : inTarget) + device;
    }
    return inTarget.empty()
               ? onSheet + device
               : say("page.labelInTarget", {{"sheet", onSheet + device}, {"target", inTarget}});
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
           : criterion.unit == "dL"  ? "ΔL*"
           : criterion.unit == "dTV" ? "ΔTV"
           : criterion.unit == "TV"  ? "%"
                                     : differenceUnit(formula);
}

std::string dateText(const std::string& created, const Texts& say) {
    const std::string day =
        say.day(std::stoi(created.substr(8, 2)), std::stoi(created.substr(5, 2)),
                std::stoi(created.substr(0, 4)));
    return say.time(day, created.substr(11, 5)) + " (UTC" + created.substr(19) + ")";
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

Model makeModel(const Result& result, const Meta* meta, const Texts& say, const Facts& print) {
    Model model;
    addHead(model, result, meta, say);
    model.unit = differenceUnit(result.formula);
    for (const Criterion& criterion : result.criteria) {
        (criterion.used ? model.judged : model.others).push_back(figureOf(criterion, result, say));
    }
    putInOrder(model.judged);
    sayVerdict(model, result, say);
    const std::string condition = conditionText(result, say);
    if (!condition.empty()) {
        model.condition = say("page.conditionSentence", {{"condition", condition}});
    }
    addBasis(model, result, meta, condition, say);
    const Statistics& s = result.statistics;
    model.statistics = {{say("statistic.patches"), say.count(result.patches.size())},
                        {say("statistic.average"), say.number(s.mean, 2)},
                        {say("statistic.median"), say.number(s.median, 2)},
                        {say("statistic.percentile95"), say.number(s.percentile95, 2)},
                        {say("statistic.largest"), say.number(s.maximum, 2)},
                        {say("statistic.deviation"), say.number(s.standardDeviation, 2)}};
    addRepeats(model, result, say);
    drawHistogram(model, result, say);
    chooseRows(model, result, say);
    addSections(model, result, meta, say);
    addMeasures(model, result, say);
    if (!print.empty()) {
        for (const auto& [label, text] : print) {
            model.subtitle += (model.subtitle.empty() ? "" : " · ") + text;
        }
        model.sections.emplace(model.sections.begin(), say("section.print"), print);
    }
    return model;
}

} // namespace report
