// SPDX-License-Identifier: Apache-2.0
#include "report/Trend.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <ctime>
#include <limits>
#include <map>
#include <numeric>
#include <optional>
#include <tuple>

#include "colour/Difference.h"
#include "report/Drift.h"
#include "report/Model.h"

namespace report {
namespace {

constexpr double none = std::numeric_limits<double>::quiet_NaN();
constexpr std::size_t recentJobs = 20;

std::tm partsOf(std::int64_t time) {
    const std::time_t seconds = time;
    std::tm parts{};
    gmtime_r(&seconds, &parts);
    return parts;
}

std::string dayText(std::int64_t time) {
    const std::tm parts = partsOf(time);
    return report::dayText(parts.tm_mday, parts.tm_mon + 1, parts.tm_year + 1900);
}

/// "cyan", "cyan and black", "cyan, magenta and black"
std::string listText(const std::vector<std::string>& words) {
    std::string text;
    for (std::size_t i = 0; i < words.size(); ++i) {
        text += (i == 0 ? "" : i + 1 == words.size() ? " and " : ", ") + words[i];
    }
    return text;
}

std::string lower(std::string text) {
    if (!text.empty() && text[0] >= 'A' && text[0] <= 'Z') {
        text[0] = static_cast<char>(text[0] - 'A' + 'a');
    }
    return text;
}

const Criterion* criterionOf(const Sample& sample, const std::string& name) {
    const auto found = std::find_if(sample.criteria.begin(), sample.criteria.end(),
                                    [&](const Criterion& c) { return c.name == name; });
    return found == sample.criteria.end() ? nullptr : &*found;
}

/// The value that was held against the tolerance.
double judgedValue(const Criterion& criterion) {
    return criterion.rounded.value_or(criterion.value.value_or(none));
}

double excessOf(const Criterion& criterion) {
    const double value = judgedValue(criterion);
    if (!criterion.used || !criterion.tolerance || !std::isfinite(value)) {
        return -1;
    }
    return *criterion.tolerance > 0 ? value / *criterion.tolerance
                                    : std::numeric_limits<double>::infinity();
}

// ---- Inks

constexpr struct {
    const char* symbol;
    const char* more;
    const char* less;
} axes[3] = {{"L*", "lighter", "darker"}, {"a*", "redder", "greener"}, {"b*", "yellower", "bluer"}};

double axisOf(const colour::Lab& lab, std::size_t axis) {
    return axis == 0 ? lab.L : axis == 1 ? lab.a : lab.b;
}

std::string shiftText(const Drift (&drifts)[3]) {
    std::vector<std::string> parts;
    for (std::size_t i = 0; i < 3; ++i) {
        if (drifts[i].significant) {
            parts.push_back((drifts[i].shift > 0 ? axes[i].more : axes[i].less) +
                            std::string(" (") + axes[i].symbol +
                            (drifts[i].shift > 0 ? "\u00a0+" : "\u00a0") +
                            fixedText(drifts[i].shift, 2) + ")");
        }
    }
    return listText(parts);
}

void sayMovement(InkTrend& trend, bool significant, std::size_t known) {
    if (known == 0) {
        trend.word = "No data";
        return;
    }
    trend.movement = known < fewestForDrift                       ? Movement::TooFew
                     : significant && trend.shift > smallestDrift ? Movement::Drifting
                                                                  : Movement::Steady;
    trend.word = trend.movement == Movement::TooFew     ? "Too few jobs"
                 : trend.movement == Movement::Drifting ? "Drifting"
                                                        : "Steady";
}

/// What the latest job that was judged says of the ink.
void addLatest(InkTrend& trend, const std::vector<const Sample*>& samples) {
    for (auto at = samples.rbegin(); at != samples.rend(); ++at) {
        const Criterion* const criterion = criterionOf(**at, inkCriterion(trend.ink));
        if (criterion == nullptr || !std::isfinite(judgedValue(*criterion))) {
            continue;
        }
        trend.value = fixedText(judgedValue(*criterion), criterion->decimals);
        if (criterion->tolerance && *criterion->tolerance > 0) {
            trend.tolerance = fixedText(*criterion->tolerance, criterion->decimals);
            trend.fill = std::clamp(judgedValue(*criterion) / *criterion->tolerance / 2, 0.0, 1.0);
        }
        trend.above = criterion->used && criterion->outcome == Outcome::Fail;
        return;
    }
}

/// Without colours the difference from the target has to do, which tells less: where to is unknown.
void sayByDifference(InkTrend& trend, const std::vector<const Sample*>& samples) {
    std::vector<double> values;
    std::string unit;
    std::size_t known = 0;
    for (const Sample* sample : samples) {
        const Criterion* const criterion = criterionOf(*sample, inkCriterion(trend.ink));
        values.push_back(criterion != nullptr ? judgedValue(*criterion) : none);
        known += std::isfinite(values.back());
        if (criterion != nullptr) {
            unit = unitOf(*criterion, sample->formula);
        }
    }
    const Drift drift = driftOf(values);
    trend.shift = std::abs(drift.shift);
    sayMovement(trend, drift.significant, known);
    if (known == 0) {
        return;
    }
    trend.averageOff = fixedText(drift.averages.back(), 2) + " " + unit;
    trend.sentence = "moving average of its difference " + fixedText(std::abs(drift.shift), 2) +
                     (drift.shift < 0 ? " smaller" : " larger") +
                     " than the mean of the first jobs";
}

std::optional<colour::Formula> formulaNamed(const std::string& name) {
    using enum colour::Formula;
    for (const colour::Formula formula : {Cie76, Cmc11, Cie94, Ciede2000, Cmc21}) {
        if (name == colour::formulaName(formula)) {
            return formula;
        }
    }
    return std::nullopt;
}

/// What a person would correct by: where the average stands against the aim.
void addCorrection(InkTrend& trend, const std::vector<const Sample*>& samples) {
    const auto latest = std::find_if(samples.rbegin(), samples.rend(), [&](const Sample* sample) {
        return sample->aims[static_cast<std::size_t>(trend.ink)].has_value();
    });
    const auto formula = formulaNamed(samples.back()->formula);
    if (latest == samples.rend() || !formula) {
        return;
    }
    trend.aim = *(*latest)->aims[static_cast<std::size_t>(trend.ink)];
    trend.aimSwatch = swatch(trend.aim);
    Criterion difference;
    difference.unit = "dE";
    trend.averageOff = fixedText(colour::difference(*formula, trend.aim, trend.now), 2) + " " +
                       unitOf(difference, samples.back()->formula);
    for (std::size_t i = 0; i < 3; ++i) {
        const double exact = axisOf(trend.now, i) - axisOf(trend.aim, i);
        const double off = std::round(exact * 100) / 100 + 0.0; // No "-0.00".
        trend.correction += std::string(i == 0 ? "" : ", ") + axes[i].symbol +
                            (std::signbit(off) ? "\u00a0" : "\u00a0+") + fixedText(off, 2);
    }
}

InkTrend inkTrend(Ink ink, const std::vector<const Sample*>& samples) {
    InkTrend trend;
    trend.ink = ink;
    trend.aim = {none, none, none};
    std::array<std::vector<double>, 3> values;
    std::size_t known = 0;
    for (const Sample* sample : samples) {
        const auto& lab = sample->inks[static_cast<std::size_t>(ink)];
        known += lab.has_value();
        for (std::size_t i = 0; i < 3; ++i) {
            values[i].push_back(lab ? axisOf(*lab, i) : none);
        }
    }
    addLatest(trend, samples);
    const Drift drifts[3] = {driftOf(values[0]), driftOf(values[1]), driftOf(values[2])};
    trend.began = {drifts[0].began, drifts[1].began, drifts[2].began};
    trend.now = {trend.began.L + drifts[0].shift, trend.began.a + drifts[1].shift,
                 trend.began.b + drifts[2].shift};
    if (known == 0) {
        sayByDifference(trend, samples);
        return trend;
    }
    trend.beganSwatch = swatch(trend.began);
    trend.nowSwatch = swatch(trend.now);
    trend.shift = colour::deltaE76(trend.began, trend.now);
    for (std::size_t i = 0; i < 3; ++i) {
        for (std::size_t j = 0; j < samples.size(); ++j) {
            trend.changes[i].push_back(values[i][j] - drifts[i].began);
            trend.averages[i].push_back(drifts[i].averages[j] - drifts[i].began);
        }
    }
    sayMovement(trend,
                std::any_of(drifts, drifts + 3, [](const Drift& d) { return d.significant; }),
                known);
    addCorrection(trend, samples);
    trend.sentence =
        "moving average " + fixedText(trend.shift, 2) + " ΔE*ab from the mean of the first jobs";
    if (trend.movement == Movement::Drifting) {
        trend.sentence += ": " + shiftText(drifts);
    }
    return trend;
}

// ---- Criteria

void add(CriterionTrend& trend, std::size_t job, const Criterion* criterion) {
    const double value = criterion != nullptr ? judgedValue(*criterion) : none;
    const double tolerance =
        criterion != nullptr && criterion->tolerance ? *criterion->tolerance : none;
    trend.values.push_back(value);
    trend.outcomes.push_back(criterion != nullptr ? criterion->outcome : Outcome::Unanswered);
    if (criterion == nullptr) {
        return;
    }
    const bool same = !trend.tolerances.empty() &&
                      (trend.tolerances.back().second == tolerance ||
                       (std::isnan(trend.tolerances.back().second) && std::isnan(tolerance)));
    if (!same) {
        trend.tolerances.emplace_back(job, tolerance);
    }
    trend.used = trend.used || criterion->used;
    trend.decimals = criterion->decimals;
    trend.failed += criterion->outcome == Outcome::Fail;
    if (std::isfinite(value)) {
        ++trend.answered;
        trend.latest = fixedText(value, criterion->decimals);
    }
    trend.tolerance = std::isfinite(tolerance) ? fixedText(tolerance, criterion->decimals) : "";
}

std::vector<CriterionTrend> criterionTrends(const std::vector<const Sample*>& samples) {
    std::vector<std::string> names;
    std::vector<CriterionTrend> trends;
    for (const Sample* sample : samples) {
        for (const Criterion& criterion : sample->criteria) {
            if (std::find(names.begin(), names.end(), criterion.name) == names.end()) {
                names.push_back(criterion.name);
                trends.emplace_back().title = criterion.title;
                trends.back().unit = unitOf(criterion, sample->formula);
            }
        }
    }
    for (std::size_t job = 0; job < samples.size(); ++job) {
        for (std::size_t i = 0; i < names.size(); ++i) {
            add(trends[i], job, criterionOf(*samples[job], names[i]));
        }
    }
    std::erase_if(trends,
                  [](const CriterionTrend& trend) { return trend.answered == 0 && !trend.used; });
    std::stable_sort(trends.begin(), trends.end(),
                     [](const auto& a, const auto& b) { return a.used > b.used; });
    return trends;
}

// ---- Series

/// Results with equal keys may be compared with each other.
auto keyOf(const Sample& s) {
    return std::tie(s.paper, s.preset, s.presetId, s.formula, s.instrument, s.workflow, s.strip,
                    s.targetKey, s.printer, s.folder);
}

std::string nameOf(const Sample& sample) {
    std::string name;
    for (const std::string& part : {sample.folder, sample.printer, sample.paper, sample.target,
                                    sample.preset, sample.instrument, sample.workflow,
                                    std::string(sample.strip == 2 ? "second strip" : "")}) {
        if (!part.empty()) {
            name += (name.empty() ? "" : " · ") + part;
        }
    }
    return name.empty() ? "Without paper, preset and instrument" : name;
}

/// Targets of one name are told apart by the beginning of their identity, formulas by theirs.
void tellApart(std::vector<Series>& all, const std::vector<Sample>& samples) {
    std::map<std::string, std::vector<Series*>> byName;
    for (Series& series : all) {
        byName[series.name].push_back(&series);
    }
    constexpr std::size_t enoughDigits = 8;
    constexpr std::size_t identityDigits = 32;
    for (const auto& [name, alike] : byName) {
        const Sample& first = samples[alike[0]->samples[0]];
        for (Series* const series : alike) {
            const Sample& sample = samples[series->samples[0]];
            const bool targetsDiffer =
                std::any_of(alike.begin(), alike.end(), [&](const Series* other) {
                    return samples[other->samples[0]].targetKey != sample.targetKey;
                });
            const bool formulasDiffer =
                std::any_of(alike.begin(), alike.end(), [&](const Series* other) {
                    return samples[other->samples[0]].formula != first.formula;
                });
            if (targetsDiffer) {
                series->name += sample.targetKey.size() == identityDigits
                                    ? " · target " + sample.targetKey.substr(0, enoughDigits)
                                    : " · target known by its name only";
            }
            if (formulasDiffer) {
                series->name += " · " + sample.formula;
            }
        }
    }
}

std::string recentText(const Series& series, const std::vector<const Sample*>& samples) {
    const std::size_t recent = std::min(recentJobs, samples.size());
    const auto begin = samples.end() - static_cast<std::ptrdiff_t>(recent);
    const auto failed = std::count_if(begin, samples.end(), [](const Sample* sample) {
        return sample->verdict == Verdict::Failed;
    });
    if (failed == 0) {
        return {};
    }
    const CriterionTrend* worst = nullptr;
    std::size_t most = 0;
    for (const CriterionTrend& criterion : series.criteria) {
        const auto from = criterion.outcomes.end() - static_cast<std::ptrdiff_t>(recent);
        const auto count =
            static_cast<std::size_t>(std::count(from, criterion.outcomes.end(), Outcome::Fail));
        if (criterion.used && count != 0 && count >= most) { // Solids before the largest of them.
            most = count;
            worst = &criterion;
        }
    }
    return (recent == 1
                ? "The one job failed"
                : std::to_string(failed) + " of the last " + std::to_string(recent) + " failed") +
           (worst != nullptr ? (recent == 1 ? ", by " : ", most often by ") + worst->title : "");
}

/// "; to correct: 3.10 ΔE00 from the aim (L* +1.20, a* -0.40, b* +0.00)"
std::string correctionText(const InkTrend& ink) {
    if (ink.averageOff.empty()) {
        return {};
    }
    return "; it is " + ink.averageOff + " from the aim" +
           (ink.correction.empty() ? "" : " (" + ink.correction + ")");
}

void sayDrifting(Series& series) {
    std::vector<std::string> names;
    for (const InkTrend& ink : series.inks) {
        if (ink.movement != Movement::Drifting) {
            continue;
        }
        names.push_back(lower(inkName(ink.ink)));
        series.reasons.push_back(inkName(ink.ink) + std::string(": ") + ink.sentence +
                                 correctionText(ink));
    }
    series.word = "Drifting: " + listText(names);
    series.sentence = "The moving average of the latest jobs has left the mean of the first " +
                      std::to_string(series.beginning) + " jobs.";
}

void saySteady(Series& series) {
    const InkTrend* nearest = nullptr;
    for (const InkTrend& ink : series.inks) {
        if (!ink.tolerance.empty() && (nearest == nullptr || ink.fill > nearest->fill)) {
            nearest = &ink;
        }
    }
    series.word = series.failing ? "Steady, but the latest job failed" : "Steady";
    series.sentence = "The moving averages of paper and solids stay at the means of the first " +
                      std::to_string(series.beginning) + " jobs.";
    if (nearest != nullptr) {
        series.sentence +=
            " Nearest to its limit in the latest job: " + lower(inkName(nearest->ink)) + ", " +
            nearest->value + " of " + nearest->tolerance +
            (nearest->averageOff.empty()
                 ? "."
                 : "; its moving average is " + nearest->averageOff + " from the aim.");
    }
}

void sayState(Series& series, const std::vector<const Sample*>& samples) {
    const auto any = [&](Movement movement) {
        return std::any_of(series.inks.begin(), series.inks.end(),
                           [&](const InkTrend& ink) { return ink.movement == movement; });
    };
    series.failing = samples.back()->verdict == Verdict::Failed;
    series.movement = any(Movement::Drifting) ? Movement::Drifting
                      : any(Movement::Steady) ? Movement::Steady
                      : any(Movement::TooFew) ? Movement::TooFew
                                              : Movement::Unknown;
    switch (series.movement) {
    case Movement::Drifting:
        sayDrifting(series);
        break;
    case Movement::Steady:
        saySteady(series);
        break;
    case Movement::TooFew:
        series.word = "Too few jobs";
        series.sentence =
            "A drift can be told from " + std::to_string(fewestForDrift) + " jobs on; here " +
            (samples.size() == 1 ? "is 1." : "are " + std::to_string(samples.size()) + ".");
        break;
    case Movement::Unknown:
        series.word = "No paper or solids";
        series.sentence =
            "These results hold nothing of paper or solids, so a drift can't be told.";
        break;
    }
    if (const std::string recent = recentText(series, samples); !recent.empty()) {
        series.reasons.push_back(recent);
    }
}

Series seriesOf(const std::vector<Sample>& all, std::vector<std::size_t> indices) {
    Series series;
    series.samples = std::move(indices);
    std::vector<const Sample*> samples;
    for (const std::size_t index : series.samples) {
        samples.push_back(&all[index]);
    }
    series.name = nameOf(*samples[0]);
    series.span = dayText(samples.front()->time);
    if (const std::string last = dayText(samples.back()->time); last != series.span) {
        series.span += " to " + last;
    }
    for (const Sample* sample : samples) {
        ++(sample->verdict == Verdict::Passed   ? series.passed
           : sample->verdict == Verdict::Failed ? series.failed
                                                : series.incomplete);
    }
    series.beginning = beginningOf(samples.size());
    for (const Ink ink : allInks) {
        series.inks.push_back(inkTrend(ink, samples));
    }
    series.criteria = criterionTrends(samples);
    sayState(series, samples);
    return series;
}

} // namespace

std::string timeText(std::int64_t time) {
    const std::tm parts = partsOf(time);
    char clock[16];
    std::snprintf(clock, sizeof clock, ", %02u:%02u", unsigned(parts.tm_hour) % 24,
                  unsigned(parts.tm_min) % 60);
    return dayText(time) + clock;
}

std::string nearestText(const Sample& sample) {
    const auto furthest =
        std::max_element(sample.criteria.begin(), sample.criteria.end(),
                         [](const auto& a, const auto& b) { return excessOf(a) < excessOf(b); });
    if (furthest == sample.criteria.end() || excessOf(*furthest) < 0) {
        return {};
    }
    return furthest->title + " " + fixedText(judgedValue(*furthest), furthest->decimals) + " of " +
           fixedText(*furthest->tolerance, furthest->decimals);
}

TrendModel makeTrend(std::vector<Sample> samples, const std::string& source,
                     std::vector<std::string> notes) {
    TrendModel model;
    model.notes = std::move(notes);
    model.samples = std::move(samples);
    std::stable_sort(model.samples.begin(), model.samples.end(), [](const auto& a, const auto& b) {
        return std::tie(a.time, a.jobId, a.strip) < std::tie(b.time, b.jobId, b.strip);
    });
    using Key = decltype(keyOf(model.samples[0]));
    std::map<Key, std::vector<std::size_t>> groups;
    for (std::size_t i = 0; i < model.samples.size(); ++i) {
        groups[keyOf(model.samples[i])].push_back(i);
    }
    for (auto& [key, indices] : groups) {
        model.series.push_back(seriesOf(model.samples, std::move(indices)));
    }
    tellApart(model.series, model.samples);
    std::stable_sort(model.series.begin(), model.series.end(), [](const auto& a, const auto& b) {
        const bool first = a.movement == Movement::Drifting;
        const bool second = b.movement == Movement::Drifting;
        return first != second ? first : a.samples.size() > b.samples.size();
    });
    const std::size_t count = model.samples.size();
    model.subtitle =
        std::to_string(count) + (count == 1 ? " result" : " results") + " from " + source;
    return model;
}

} // namespace report
