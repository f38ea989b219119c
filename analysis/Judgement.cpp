// SPDX-License-Identifier: Apache-2.0
#include "analysis/Judgement.h"

#include <algorithm>
#include <cmath>
#include <string_view>
#include <utility>

#include "analysis/ConditionWarnings.h"
#include "analysis/PaperAims.h"
#include "analysis/PatchKinds.h"

namespace analysis {
namespace {

double quantityOf(const Comparison& c, Quantity quantity, std::size_t patch) {
    switch (quantity) {
    case Quantity::DeltaH:
        return colour::deltaH(c.targetLab[patch], c.measuredLab[patch]);
    case Quantity::DeltaCh:
        return colour::deltaCh(c.targetLab[patch], c.measuredLab[patch]);
    case Quantity::DeltaL:
        return std::abs(c.measuredLab[patch].L - c.targetLab[patch].L);
    case Quantity::DeltaE:
    case Quantity::Spread: // of all readings of a patch: answerFromRepeats
    case Quantity::GreyCh: // has aims of its own: answerFromGreys
    case Quantity::Tone:   // of all readings of a tint: answerFromTones
    case Quantity::SpotTone:
        break;
    }
    return c.difference[patch];
}

double meanOf(const std::vector<double>& figures) {
    double sum = 0;
    for (const double figure : figures) {
        sum += figure;
    }
    return sum / static_cast<double>(figures.size());
}

/// Nearest rank, ceil(0.95 n), in integers because 0.95 is not a binary fraction.
std::size_t rank95(std::size_t count) {
    return (count * 95 + 99) / 100;
}

Statistics statisticsOf(const Comparison& c, std::size_t& worst) {
    std::vector<double> sorted = c.difference;
    Statistics s;
    s.count = sorted.size();
    s.mean = meanOf(sorted);
    worst =
        static_cast<std::size_t>(std::max_element(sorted.begin(), sorted.end()) - sorted.begin());
    s.maximum = sorted[worst];
    double squares = 0;
    for (const double figure : sorted) {
        squares += (figure - s.mean) * (figure - s.mean);
    }
    s.standardDeviation = std::sqrt(squares / static_cast<double>(s.count));

    const auto at = [&](std::size_t rank) {
        const auto nth = sorted.begin() + static_cast<std::ptrdiff_t>(rank);
        std::nth_element(sorted.begin(), nth, sorted.end());
        return *nth;
    };
    s.percentile95 = at(rank95(s.count) - 1);
    const double lower = at((s.count - 1) / 2);
    const auto above = sorted.begin() + static_cast<std::ptrdiff_t>(s.count / 2);
    s.median = s.count % 2 == 1 ? lower : (lower + *std::min_element(above, sorted.end())) / 2;
    return s;
}

/// Counts patches that differ in their device values.
std::size_t differentPatches(const Comparison& c, const std::vector<std::size_t>& patches) {
    std::vector<std::uint32_t> groups;
    groups.reserve(patches.size());
    for (const std::size_t patch : patches) {
        groups.push_back(c.groupOf[patch]);
    }
    std::sort(groups.begin(), groups.end());
    return static_cast<std::size_t>(std::unique(groups.begin(), groups.end()) - groups.begin());
}

/// Value of a criterion over its patches, which have a figure each.
void answerFromFigures(const Comparison& c, const std::vector<std::size_t>& patches,
                       const std::vector<double>& figures, Finding& finding) {
    finding.patches = patches.size();
    finding.found = differentPatches(c, patches);
    if (finding.found < finding.needed) {
        return;
    }
    const auto largest = std::max_element(figures.begin(), figures.end());
    finding.answered = true;
    finding.worst = patches[static_cast<std::size_t>(largest - figures.begin())];
    finding.value = finding.criterion->statistic == Statistic::Mean ? meanOf(figures) : *largest;
}

void answerFromPatches(const Comparison& c, const std::vector<std::size_t>& patches,
                       Finding& finding) {
    std::vector<double> figures;
    figures.reserve(patches.size());
    for (const std::size_t patch : patches) {
        figures.push_back(quantityOf(c, finding.criterion->quantity, patch));
    }
    answerFromFigures(c, patches, figures, finding);
}

void answerFromAll(const Statistics& statistics, std::size_t worst, Finding& finding) {
    finding.answered = true;
    finding.patches = finding.found = statistics.count;
    finding.worst = worst;
    switch (finding.criterion->statistic) {
    case Statistic::Mean:
        finding.value = statistics.mean;
        break;
    case Statistic::Maximum:
        finding.value = statistics.maximum;
        break;
    case Statistic::Percentile95:
        finding.value = statistics.percentile95;
        break;
    }
}

void answerFromRepeats(const RepeatSpread& spread, Finding& finding) {
    finding.patches = spread.readings;
    finding.found = spread.patches;
    if (spread.patches == 0) {
        return;
    }
    finding.answered = true;
    finding.worst = spread.worst;
    finding.value = finding.criterion->statistic == Statistic::Mean ? spread.mean : spread.largest;
}

/// The papers themselves, though the aims of all other patches were adjusted for them.
void answerFromPapers(const Papers& papers, Finding& finding) {
    for (const auto& [patch, difference] : papers.differences) {
        if (difference >= finding.value) {
            finding.value = difference;
            finding.worst = patch;
        }
    }
}

/// Greys or tints of black, which count by their weight.
void answerFromGreys(const Comparison& c, const std::vector<Grey>& greys,
                     const std::vector<colour::Lab>& aims, Finding& finding) {
    std::vector<std::size_t> patches;
    std::vector<double> figures;
    const bool isBalance = finding.criterion->quantity == Quantity::GreyCh;
    for (std::size_t i = 0; i < greys.size(); ++i) {
        if (isBalance && aims.empty()) {
            return; // the paper is not known
        }
        const std::size_t patch = greys[i].patch;
        patches.push_back(patch);
        figures.push_back(greys[i].weight * (isBalance
                                                 ? colour::deltaCh(aims[i], c.measuredAsIs(patch))
                                                 : quantityOf(c, Quantity::DeltaL, patch)));
    }
    answerFromFigures(c, patches, figures, finding);
}

bool isOf(Inks inks, std::size_t channel) {
    constexpr std::size_t black = 3;
    switch (inks) {
    case Inks::Chromatic:
        return channel < black;
    case Inks::Spots:
        return channel > black;
    case Inks::All:
        return true;
    case Inks::Cyan:
    case Inks::Magenta:
    case Inks::Yellow:
    case Inks::Black:
        break;
    }
    return channel == static_cast<std::size_t>(inks);
}

void answerFromTones(const std::vector<InkTones>& inks, Finding& finding) {
    const auto [wantedInks, wantedTones] = finding.criterion->tints;
    double sum = 0;
    for (const InkTones& ink : inks) {
        for (const ToneStep& step : ink.steps) {
            if (!isOf(wantedInks, ink.channel) || !analysis::isOf(wantedTones, step.nominal)) {
                continue;
            }
            const double deviation = std::abs(step.deviation());
            finding.patches += step.readings;
            ++finding.found;
            sum += deviation;
            if (deviation > finding.value) {
                finding.value = deviation;
                finding.worst = step.patch;
            }
        }
    }
    finding.answered = finding.found > 0;
    if (finding.answered && finding.criterion->statistic == Statistic::Mean) {
        finding.value = sum / static_cast<double>(finding.found);
    }
}

void answerFromSpreads(const std::vector<MidToneSpread>& spreads, Finding& finding) {
    constexpr std::size_t inks = 3;
    finding.needed = inks;
    finding.answered = !spreads.empty();
    for (const MidToneSpread& spread : spreads) {
        finding.patches += spread.readings;
        finding.found += inks;
        if (spread.spread > finding.value) {
            finding.value = spread.spread;
            finding.worst = spread.patch;
        }
    }
}

/// A criterion that is answered on request.
void answerFromMeasures(const Comparison& c, const Measures& measures, Finding& finding) {
    const bool isGrey = finding.criterion->patches == Patches::BalancedGreys;
    const bool isBlack = finding.criterion->tints.inks == Inks::Black;
    switch (finding.criterion->quantity) {
    case Quantity::Tone:
        return finding.criterion->tints.inks == Inks::Chromatic
                   ? answerFromSpreads(measures.spreads, finding)
                   : answerFromTones(measures.tones, finding);
    case Quantity::SpotTone:
        return answerFromTones(measures.spotTones, finding);
    case Quantity::GreyCh:
        return answerFromGreys(c, measures.greys, measures.greyAims, finding);
    case Quantity::DeltaL:
        return isGrey || isBlack
                   ? answerFromGreys(c, isGrey ? measures.greys : measures.blacks, {}, finding)
                   : answerFromPatches(c, measures.ramp, finding);
    default:
        return answerFromRepeats(c.spread, finding);
    }
}

/// The data that criteria are answered from.
struct Evidence {
    const Comparison& comparison;
    const Selections selections;
    const Statistics& statistics;
    std::size_t worst; ///< Of all patches.
    const Measures& measures;
};

/// Answers a criterion according to its patches and its quantity.
void answer(const Evidence& evidence, const PresetOptions& options, Finding& finding) {
    const Patches patches = finding.criterion->patches;
    if (patches == Patches::Greys || patches == Patches::BalancedGreys) {
        finding.needed = static_cast<std::size_t>(options.minimumGreys);
    }
    if (finding.criterion->onRequest) {
        answerFromMeasures(evidence.comparison, evidence.measures, finding);
    } else if (patches == Patches::All) {
        answerFromAll(evidence.statistics, evidence.worst, finding);
    } else if (finding.criterion->quantity == Quantity::Spread) {
        answerFromRepeats(evidence.comparison.spread, finding);
    } else {
        answerFromPatches(evidence.comparison, evidence.selections.of(patches), finding);
    }
    if (patches == Patches::Paper && evidence.comparison.papers.adjusted) {
        finding.value = -1;
        answerFromPapers(evidence.comparison.papers, finding);
    }
    if (patches == Patches::OuterGamut) {
        finding.listed = outerGamutCount;
        finding.found = evidence.selections.outerGamut.count();
    }
}

void holdAgainst(const Setting& setting, Finding& finding) {
    finding.tolerance = setting.tolerance;
    finding.used = setting.used;
    finding.decimals = setting.decimals;
    if (!finding.answered) {
        return;
    }
    finding.rounded = roundedTo(finding.value, finding.decimals);
    finding.passed = finding.rounded <= finding.tolerance;
}

/// "Passed" needs an answer for each used criterion. A failed one outweighs unanswered ones.
Verdict verdictOf(const std::vector<Finding>& findings, bool keptOpen) {
    bool isAnyUsed = false;
    bool isAnyOpen = keptOpen;
    for (const Finding& finding : findings) {
        if (!finding.used) {
            continue;
        }
        isAnyUsed = true;
        if (finding.answered && !finding.passed) {
            return Verdict::Failed;
        }
        isAnyOpen = isAnyOpen || !finding.answered;
    }
    return isAnyUsed && !isAnyOpen ? Verdict::Passed : Verdict::Incomplete;
}

/// Warns of criteria that are answered from fewer data than intended.
void warnOfFindings(const Comparison& c, Judgement& judgement) {
    bool isListSaid = false;
    for (const Finding& finding : judgement.findings) {
        if (finding.used && finding.answered && finding.found < finding.listed &&
            !std::exchange(isListSaid, true)) {
            judgement.warnings.push_back(
                {"outerGamutIncomplete",
                 "The data have " + std::to_string(finding.found) + " of the " +
                     std::to_string(finding.listed) +
                     " patches of the outer gamut, and it was judged by these."});
        }
        if (finding.criterion->index == noEntry &&
            finding.criterion->name == std::string_view("repeatSpread") && finding.answered &&
            !finding.used && c.repeatMode == RepeatMode::Mean) {
            judgement.warnings.push_back(
                {"spreadUnjudged",
                 "The means of repeated readings were compared, and the preset sets no limit to "
                 "how far the readings may lie apart.",
                 true});
        }
    }
}

/// Aims that could not be adjusted as the preset asks, or are adjusted beyond the method's limit.
void warnOfPapers(const Papers& papers, Judgement& judgement) {
    if (papers.aims != PaperAims::Absolute && !papers.adjusted) {
        judgement.warnings.push_back(
            {"paperUnknown",
             "The preset asks for aims adjusted for the paper, and the data have no paper patch: "
             "the aims are those of the target as it is.",
             true});
    }
    if (papers.aims == PaperAims::Corrected && papers.adjusted &&
        colour::deltaE2000(*papers.target, *papers.measured) > largestCorrected) {
        judgement.warnings.push_back(
            {"papersTooDifferent",
             "The papers differ by more than 5 in CIEDE2000, beyond which aims can't be corrected "
             "for the paper.",
             true});
    }
}

void warnOfPreset(const tolerancePresetParameterRecord& preset, Judgement& judgement) {
    const auto& findings = judgement.findings;
    if (std::none_of(findings.begin(), findings.end(), [](const Finding& f) { return f.used; })) {
        judgement.warnings.push_back({"nothingJudged", "The preset uses no criterion."});
    }
    if (preset.fograPSDPreset > 0) {
        return;
    }
    for (int i = 0; i < presetValueCount; ++i) {
        if (preset.usedForResult[i] != 0 &&
            std::none_of(findings.begin(), findings.end(),
                         [&](const Finding& f) { return f.criterion->index == i; })) {
            judgement.warnings.push_back(
                {"criterionUnknown",
                 "The preset uses entry " + std::to_string(i) + ", which has no meaning."});
        }
    }
}

} // namespace

const char* verdictName(Verdict verdict) {
    switch (verdict) {
    case Verdict::Passed:
        return "passed";
    case Verdict::Failed:
        return "failed";
    case Verdict::Incomplete:
        break;
    }
    return "incomplete";
}

double roundedTo(double value, int decimals) {
    if (decimals > 15) {
        return value;
    }
    const double scale = std::pow(10.0, std::max(decimals, 0));
    return std::floor(value * scale + 0.5) / scale;
}

Judgement judge(const Comparison& c, const tolerancePresetParameterRecord& preset,
                const PresetOptions& options) {
    Judgement judgement;
    std::size_t worst = 0;
    judgement.statistics = statisticsOf(c, worst);
    judgement.measures = measuresOf(c, options);
    const Evidence evidence{c, selectionsOf(c), judgement.statistics, worst, judgement.measures};
    for (const Criterion& criterion : criteria) {
        if (criterion.onRequest && !options.stated[placeOf(criterion)]) {
            continue;
        }
        Finding finding;
        finding.criterion = &criterion;
        answer(evidence, options, finding);
        holdAgainst(settingOf(criterion, preset, options), finding);
        judgement.findings.push_back(finding);
    }
    judgement.warnings = conditionWarnings(c, preset, options);
    warnOfPapers(c.papers, judgement);
    warnOfFindings(c, judgement);
    warnOfPreset(preset, judgement);
    const auto keepsOpen = [](const Warning& warning) { return warning.keepsOpen; };
    judgement.verdict =
        verdictOf(judgement.findings,
                  std::any_of(c.warnings.begin(), c.warnings.end(), keepsOpen) ||
                      std::any_of(judgement.warnings.begin(), judgement.warnings.end(), keepsOpen));
    return judgement;
}

void fillResults(const Judgement& judgement, const tolerancePresetParameterRecord& preset,
                 analyseResultsRecord& results) {
    std::fill(std::begin(results.values), std::end(results.values), -1.0);
    std::fill(std::begin(results.approvals), std::end(results.approvals), false);
    for (int i = 0; i < presetValueCount; ++i) {
        results.decimals[i] = preset.decimalPlaces[i] > 0;
    }
    for (const Finding& finding : judgement.findings) {
        if (finding.criterion->index == noEntry) {
            continue;
        }
        results.values[finding.criterion->value] = finding.value;
        results.approvals[finding.criterion->index] = finding.passed;
    }
    results.overallPassed = judgement.verdict == Verdict::Passed;
}

} // namespace analysis
