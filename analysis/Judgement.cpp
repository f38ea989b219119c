#include "analysis/Judgement.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace analysis {
namespace {

/// How far a device value may be off and still count, in percent: eight-bit values miss by 0.2,
/// whole percents by 0.5.
constexpr double deviceTolerance = 0.5;

/// CMY triplets in use as greys, in percent: ISO 12647-7 and the control strips that go with it,
/// the older strips, and the ones after the near-neutral formula.
constexpr double greyTriplets[][3] = {
    {10, 6, 6},       {20, 12, 12},       {40, 27, 27},       {60, 45, 45},
    {80, 65, 65},     {100, 85, 85},      {3.1, 2.2, 2.2},    {10.2, 7.4, 7.4},
    {25, 19, 19},     {50, 40, 40},       {75, 66, 66},       {3, 2.24, 2.24},
    {10, 7.46, 7.46}, {25, 18.88, 18.88}, {75, 66.12, 66.12}, {90, 85.34, 85.34},
};

constexpr std::size_t patchKinds = static_cast<std::size_t>(Patches::Spots) + 1;

using KindSet = std::uint32_t;

constexpr KindSet kind(Patches patches) {
    return KindSet{1} << static_cast<unsigned>(patches);
}

bool near(double value, double wanted) {
    return std::abs(value - wanted) <= deviceTolerance;
}

bool isGrey(const double* cmyk) {
    return std::any_of(std::begin(greyTriplets), std::end(greyTriplets), [&](const double* grey) {
        return near(cmyk[0], grey[0]) && near(cmyk[1], grey[1]) && near(cmyk[2], grey[2]);
    });
}

/// Kinds of a patch by process inks alone.
KindSet kindsOfProcess(const double* cmyk) {
    unsigned none = 0;
    unsigned full = 0;
    for (unsigned ink = 0; ink < 4; ++ink) {
        none |= near(cmyk[ink], 0) ? 1u << ink : 0;
        full |= near(cmyk[ink], 100) ? 1u << ink : 0;
    }
    const bool pure = (none | full) == 15; // every ink is either 0 or 100
    const auto isPure = [&](unsigned inks) { return pure && full == inks; };
    constexpr unsigned c = 1, m = 2, y = 4, k = 8;

    if (isPure(0))
        return kind(Patches::Paper);
    KindSet kinds = 0;
    constexpr struct {
        unsigned inks;
        KindSet kinds;
    } pureKinds[] = {
        {c, kind(Patches::SolidCyan) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
        {m, kind(Patches::SolidMagenta) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
        {y, kind(Patches::SolidYellow) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
        {k, kind(Patches::SolidBlack) | kind(Patches::Solids)},
        {m | y, kind(Patches::Red) | kind(Patches::Secondaries)},
        {c | y, kind(Patches::Green) | kind(Patches::Secondaries)},
        {c | m, kind(Patches::Blue) | kind(Patches::Secondaries)},
    };
    for (const auto& entry : pureKinds)
        if (isPure(entry.inks))
            kinds |= entry.kinds;
    if (none & k) {
        if (none & (c | m | y))
            kinds |= kind(Patches::OuterGamut);
        if (isGrey(cmyk))
            kinds |= kind(Patches::Greys);
    }
    return kinds;
}

/// All kinds that a patch is of. `channels` are process inks and, behind these, spot colours.
KindSet kindsOf(const double* device, std::size_t channels) {
    const auto off = [](double value) { return near(value, 0); };
    const double* const spots = device + 4;
    const double* const end = device + channels;
    const auto inked = static_cast<std::size_t>(end - spots) -
                       static_cast<std::size_t>(std::count_if(spots, end, off));
    if (inked == 0)
        return kindsOfProcess(device);
    if (inked == 1 && std::all_of(device, spots, off) &&
        std::any_of(spots, end, [](double value) { return near(value, 100); }))
        return kind(Patches::Spots);
    return 0;
}

using Selections = std::array<std::vector<std::size_t>, patchKinds>;

/// The patches of each kind but All, which needs no list.
Selections select(const Comparison& c) {
    Selections selections;
    if (!c.devices || !c.devices->file.set->hasCmyk())
        return selections;
    const std::size_t channels = c.devices->file.set->channels.size();
    for (std::size_t patch = 0; patch < c.patchCount(); ++patch) {
        KindSet kinds = kindsOf(c.deviceOf(patch), channels);
        for (std::size_t i = 0; kinds; ++i, kinds >>= 1)
            if (kinds & 1)
                selections[i].push_back(patch);
    }
    return selections;
}

double quantityOf(const Comparison& c, Quantity quantity, std::size_t patch) {
    switch (quantity) {
    case Quantity::DeltaH:
        return colour::deltaH(c.targetLab[patch], c.measuredLab[patch]);
    case Quantity::DeltaCh:
        return colour::deltaCh(c.targetLab[patch], c.measuredLab[patch]);
    case Quantity::DeltaE:
        break;
    }
    return c.difference[patch];
}

double meanOf(const std::vector<double>& figures) {
    double sum = 0;
    for (const double figure : figures)
        sum += figure;
    return sum / static_cast<double>(figures.size());
}

/// Nearest rank, ceil(0.95 n), in whole numbers since 0.95 is none of the binary fractions.
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
    for (const double figure : sorted)
        squares += (figure - s.mean) * (figure - s.mean);
    s.standardDeviation = std::sqrt(squares / static_cast<double>(s.count));

    const auto at = [&](std::size_t rank) {
        const auto nth = sorted.begin() + static_cast<std::ptrdiff_t>(rank);
        std::nth_element(sorted.begin(), nth, sorted.end());
        return *nth;
    };
    s.percentile95 = at(rank95(s.count) - 1);
    s.median = (at((s.count - 1) / 2) + at(s.count / 2)) / 2;
    return s;
}

/// Value of a criterion over its patches. REQUIRES: patches is not empty.
void answer(const Comparison& c, const std::vector<std::size_t>& patches, Finding& finding) {
    std::vector<double> figures;
    figures.reserve(patches.size());
    for (const std::size_t patch : patches)
        figures.push_back(quantityOf(c, finding.criterion->quantity, patch));
    const auto largest = std::max_element(figures.begin(), figures.end());
    finding.answered = true;
    finding.patches = patches.size();
    finding.worst = patches[static_cast<std::size_t>(largest - figures.begin())];
    finding.value = finding.criterion->statistic == Statistic::Mean ? meanOf(figures) : *largest;
}

void answerFromAll(const Statistics& statistics, std::size_t worst, Finding& finding) {
    finding.answered = true;
    finding.patches = statistics.count;
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

void holdAgainst(const tolerancePresetParameterRecord& preset, Finding& finding) {
    const Criterion& criterion = *finding.criterion;
    if (preset.fograPSDPreset > 0) {
        finding.tolerance = preset.psdPresetValues[criterion.psdEntry];
        finding.used = preset.usedForPSDResult[criterion.psdEntry] != 0;
    } else {
        finding.tolerance = preset.presetValues[criterion.index];
        finding.used = preset.usedForResult[criterion.index] != 0;
    }
    finding.decimals = preset.decimalPlaces[criterion.index];
    if (!finding.answered)
        return;
    finding.rounded = roundedTo(finding.value, finding.decimals);
    finding.passed = finding.rounded <= finding.tolerance;
}

/// Never passed by silence: what takes part and has no answer leaves the verdict open.
Verdict verdictOf(const std::vector<Finding>& findings) {
    bool anyUsed = false;
    bool allPassed = true;
    for (const Finding& finding : findings) {
        if (!finding.used)
            continue;
        if (!finding.answered)
            return Verdict::Incomplete;
        anyUsed = true;
        allPassed = allPassed && finding.passed;
    }
    if (!anyUsed)
        return Verdict::Incomplete;
    return allPassed ? Verdict::Passed : Verdict::Failed;
}

void warnOfPreset(const tolerancePresetParameterRecord& preset, Judgement& judgement) {
    const auto& findings = judgement.findings;
    if (std::none_of(findings.begin(), findings.end(), [](const Finding& f) { return f.used; }))
        judgement.warnings.push_back({"nothingJudged", "The preset uses no criterion."});
    if (preset.fograPSDPreset > 0)
        return;
    for (int i = 0; i < presetValueCount; ++i)
        if (preset.usedForResult[i] != 0 &&
            std::none_of(findings.begin(), findings.end(),
                         [&](const Finding& f) { return f.criterion->index == i; }))
            judgement.warnings.push_back(
                {"criterionUnknown",
                 "The preset uses entry " + std::to_string(i) + ", which has no meaning."});
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
    if (decimals > 15)
        return value;
    const double scale = std::pow(10.0, std::max(decimals, 0));
    return std::floor(value * scale + 0.5) / scale;
}

Judgement judge(const Comparison& c, const tolerancePresetParameterRecord& preset) {
    Judgement judgement;
    std::size_t worst = 0;
    judgement.statistics = statisticsOf(c, worst);
    const Selections selections = select(c);
    for (const Criterion& criterion : criteria) {
        Finding finding;
        finding.criterion = &criterion;
        const auto& patches = selections[static_cast<std::size_t>(criterion.patches)];
        if (criterion.patches == Patches::All)
            answerFromAll(judgement.statistics, worst, finding);
        else if (!patches.empty())
            answer(c, patches, finding);
        holdAgainst(preset, finding);
        judgement.findings.push_back(finding);
    }
    judgement.verdict = verdictOf(judgement.findings);
    warnOfPreset(preset, judgement);
    return judgement;
}

void fillResults(const Judgement& judgement, const tolerancePresetParameterRecord& preset,
                 analyseResultsRecord& results) {
    std::fill(std::begin(results.values), std::end(results.values), -1.0);
    std::fill(std::begin(results.approvals), std::end(results.approvals), false);
    for (int i = 0; i < presetValueCount; ++i)
        results.decimals[i] = preset.decimalPlaces[i] > 0;
    for (const Finding& finding : judgement.findings) {
        results.values[finding.criterion->value] = finding.value;
        results.approvals[finding.criterion->index] = finding.passed;
    }
    results.overallPassed = judgement.verdict == Verdict::Passed;
}

} // namespace analysis
