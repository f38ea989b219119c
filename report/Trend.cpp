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

using languages::Texts;

constexpr double none = std::numeric_limits<double>::quiet_NaN();
constexpr std::size_t recentJobs = 20;

std::tm partsOf(std::int64_t time) {
    const std::time_t seconds = time;
    std::tm parts{};
    gmtime_r(&seconds, &parts);
    return parts;
}

std::string dayText(std::int64_t time, const Texts& say) {
    const std::tm parts = partsOf(time);
    return say.day(parts.tm_mday, parts.tm_mon + 1, parts.tm_year + 1900);
}

/// "cyan": as a word within a sentence.
std::string inText(Ink ink, const Texts& say) {
    return say.find(std::string("inkInText.") + inkCriterion(ink)).value_or("");
}

const Criterion* criterionOf(const Sample& sample, const std::string& name) {
    const auto found = std::find_if(sample.criteria.begin(), sample.criteria.end(),
                                    [&](const Criterion& c) { return c.name == name; });
    return found == sample.criteria.end() ? nullptr : &*found;
}

/// The value that was compared with the tolerance.
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

constexpr const char* axes[3] = {"L*", "a*", "b*"};

/// "lighter", "greener": where a colour has moved along an axis.
std::string directionOf(std::size_t axis, bool more, const Texts& say) {
    switch (axis) {
    case 0:
        return more ? say("trend.lighter") : say("trend.darker");
    case 1:
        return more ? say("trend.redder") : say("trend.greener");
    default:
        return more ? say("trend.yellower") : say("trend.bluer");
    }
}

double axisOf(const colour::Lab& lab, std::size_t axis) {
    return axis == 0 ? lab.L : axis == 1 ? lab.a : lab.b;
}

std::string signedText(double value, const Texts& say) {
    const double rounded = std::round(value * 100) / 100 + 0.0; // No "-0.00".
    return (std::signbit(rounded) ? "" : "+") + say.number(rounded, 2);
}

std::string shiftText(const Drift (&drifts)[3], const Texts& say) {
    std::vector<std::string> parts;
    for (std::size_t i = 0; i < 3; ++i) {
        if (drifts[i].significant) {
            parts.push_back(directionOf(i, drifts[i].shift > 0, say) + " (" + axes[i] + "\u00a0" +
                            signedText(drifts[i].shift, say) + ")");
        }
    }
    return say.list(parts);
}

void sayMovement(InkTrend& trend, bool significant, std::size_t known, const Texts& say) {
    if (known == 0) {
        trend.word = say("movement.noData");
        return;
    }
    trend.movement = known < fewestForDrift                       ? Movement::TooFew
                     : significant && trend.shift > smallestDrift ? Movement::Drifting
                                                                  : Movement::Steady;
    trend.word = wordOf(trend.movement, say);
}

/// What the latest job that was judged says of the ink.
void addLatest(InkTrend& trend, const std::vector<const Sample*>& samples, const Texts& say) {
    for (auto at = samples.rbegin(); at != samples.rend(); ++at) {
        const Criterion* const criterion = criterionOf(**at, inkCriterion(trend.ink));
        if (criterion == nullptr || !std::isfinite(judgedValue(*criterion))) {
            continue;
        }
        trend.value = say.number(judgedValue(*criterion), criterion->decimals);
        if (criterion->tolerance && *criterion->tolerance > 0) {
            trend.tolerance = say.number(*criterion->tolerance, criterion->decimals);
            trend.fill = std::clamp(judgedValue(*criterion) / *criterion->tolerance / 2, 0.0, 1.0);
        }
        trend.above = criterion->used && criterion->outcome == Outcome::Fail;
        return;
    }
}

/// Without colours the difference from the target has to do, which tells less: where to is unknown.
void sayByDifference(InkTrend& trend, const std::vector<const Sample*>& samples, const Texts& say) {
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
    sayMovement(trend, drift.significant, known, say);
    if (known == 0) {
        return;
    }
    trend.averageOff = say.number(drift.averages.back(), 2) + " " + unit;
    const std::string shift = say.number(std::abs(drift.shift), 2);
    trend.sentence = drift.shift < 0 ? say("trend.differenceSmaller", {{"shift", shift}})
                                     : say("trend.differenceLarger", {{"shift", shift}});
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
void addCorrection(InkTrend& trend, const std::vector<const Sample*>& samples, const Texts& say) {
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
    trend.averageOff = say.number(colour::difference(*formula, trend.aim, trend.now), 2) + " " +
                       unitOf(difference, samples.back()->formula);
    for (std::size_t i = 0; i < 3; ++i) {
        trend.correction += std::string(i == 0 ? "" : say("list.comma")) + axes[i] + "\u00a0" +
                            signedText(axisOf(trend.now, i) - axisOf(trend.aim, i), say);
    }
}

InkTrend inkTrend(Ink ink, const std::vector<const Sample*>& samples, const Texts& say) {
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
    addLatest(trend, samples, say);
    const Drift drifts[3] = {driftOf(values[0]), driftOf(values[1]), driftOf(values[2])};
    trend.began = {drifts[0].began, drifts[1].began, drifts[2].began};
    trend.now = {trend.began.L + drifts[0].shift, trend.began.a + drifts[1].shift,
                 trend.began.b + drifts[2].shift};
    if (known == 0) {
        sayByDifference(trend, samples, say);
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
                known, say);
    addCorrection(trend, samples, say);
    const std::string shift = say.number(trend.shift, 2);
    trend.sentence =
        trend.movement == Movement::Drifting
            ? say("trend.shiftTo", {{"shift", shift}, {"axes", shiftText(drifts, say)}})
            : say("trend.shift", {{"shift", shift}});
    return trend;
}

// ---- Criteria

void add(CriterionTrend& trend, std::size_t job, const Criterion* criterion, const Texts& say) {
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
        trend.latest = say.number(value, criterion->decimals);
    }
    trend.tolerance = std::isfinite(tolerance) ? say.number(tolerance, criterion->decimals) : "";
}

std::vector<CriterionTrend> criterionTrends(const std::vector<const Sample*>& samples,
                                            const Texts& say) {
    std::vector<std::string> names;
    std::vector<CriterionTrend> trends;
    for (const Sample* sample : samples) {
        for (const Criterion& criterion : sample->criteria) {
            if (std::find(names.begin(), names.end(), criterion.name) == names.end()) {
                names.push_back(criterion.name);
                trends.emplace_back().title = titleOf(criterion, say);
                trends.back().followed =
                    criterion.name == "midToneSpread" || criterion.name.starts_with(toneAtHalf);
                trends.back().unit = unitOf(criterion, sample->formula);
            }
        }
    }
    for (std::size_t job = 0; job < samples.size(); ++job) {
        for (std::size_t i = 0; i < names.size(); ++i) {
            add(trends[i], job, criterionOf(*samples[job], names[i]), say);
        }
    }
    std::erase_if(trends,
                  [](const CriterionTrend& trend) { return trend.answered == 0 && !trend.used; });
    std::stable_sort(trends.begin(), trends.end(),
                     [](const auto& a, const auto& b) { return a.used > b.used; });
    return trends;
}

// ---- Series

/// Results with equal keys can be compared with each other.
auto keyOf(const Sample& s) {
    return std::tie(s.paper, s.preset, s.presetId, s.formula, s.instrument, s.workflow, s.strip,
                    s.targetKey, s.printer, s.folder);
}

std::string nameOf(const Sample& sample, const Texts& say) {
    std::string name;
    for (const std::string& part : {sample.folder, sample.printer, sample.paper, sample.target,
                                    sample.preset, sample.instrument, sample.workflow,
                                    sample.strip == 2 ? say("trend.secondStrip") : std::string()}) {
        if (!part.empty()) {
            name += (name.empty() ? "" : " · ") + part;
        }
    }
    return name.empty() ? say("trend.unnamed") : name;
}

/// Targets of one name are told apart by the beginning of their identity, formulas by theirs.
void tellApart(std::vector<Series>& all, const std::vector<Sample>& samples, const Texts& say) {
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
                series->name +=
                    " · " + (sample.targetKey.size() == identityDigits
                                 ? say("trend.targetDigits",
                                       {{"digits", sample.targetKey.substr(0, enoughDigits)}})
                                 : say("trend.targetByName"));
            }
            if (formulasDiffer) {
                series->name += " · " + sample.formula;
            }
        }
    }
}

std::string recentText(const Series& series, const std::vector<const Sample*>& samples,
                       const Texts& say) {
    const std::size_t recent = std::min(recentJobs, samples.size());
    const auto begin = samples.end() - static_cast<std::ptrdiff_t>(recent);
    const auto failed = static_cast<std::size_t>(std::count_if(
        begin, samples.end(), [](const Sample* s) { return s->verdict == Verdict::Failed; }));
    if (failed == 0) {
        return {};
    }
    const CriterionTrend* worst = nullptr;
    std::size_t most = 0;
    for (const CriterionTrend& criterion : series.criteria) {
        const auto from = criterion.outcomes.end() - static_cast<std::ptrdiff_t>(recent);
        const auto count =
            static_cast<std::size_t>(std::count(from, criterion.outcomes.end(), Outcome::Fail));
        if (criterion.used && count != 0 && count >= most) { // Solids before the largest solid.
            most = count;
            worst = &criterion;
        }
    }
    const std::string criterion = worst != nullptr ? worst->title : "";
    if (recent == 1) {
        return worst != nullptr ? say("trend.oneFailedBy", {{"criterion", criterion}})
                                : say("trend.oneFailed");
    }
    return worst != nullptr
               ? say("trend.failedBy",
                     {{"failed", failed}, {"recent", recent}, {"criterion", criterion}})
               : say("trend.failed", {{"failed", failed}, {"recent", recent}});
}

/// "Cyan: moving average 2.10 ΔE*ab from the mean of the first jobs: lighter (L* +1.20); it is 3.10
/// ΔE00 from the aim (L* +1.20, a* -0.40, b* +0.00)"
std::string driftReason(const InkTrend& ink, const Texts& say) {
    const std::string name = inkName(ink.ink, say);
    if (ink.averageOff.empty()) {
        return say("trend.reason", {{"ink", name}, {"movement", ink.sentence}});
    }
    return ink.correction.empty()
               ? say("trend.reasonToAim",
                     {{"ink", name}, {"movement", ink.sentence}, {"off", ink.averageOff}})
               : say("trend.reasonToCorrect", {{"ink", name},
                                               {"movement", ink.sentence},
                                               {"off", ink.averageOff},
                                               {"axes", ink.correction}});
}

void sayDrifting(Series& series, const Texts& say) {
    std::vector<std::string> names;
    for (const InkTrend& ink : series.inks) {
        if (ink.movement == Movement::Drifting) {
            names.push_back(inText(ink.ink, say));
            series.reasons.push_back(driftReason(ink, say));
        }
    }
    series.word = say("trend.drifting", {{"inks", say.list(names)}});
    series.sentence = say("trend.driftingSentence", {{"beginning", series.beginning}});
}

void saySteady(Series& series, const Texts& say) {
    const InkTrend* nearest = nullptr;
    for (const InkTrend& ink : series.inks) {
        if (!ink.tolerance.empty() && (nearest == nullptr || ink.fill > nearest->fill)) {
            nearest = &ink;
        }
    }
    series.word = series.failing ? say("trend.steadyButFailed") : say("movement.steady");
    series.sentence = say("trend.steadySentence", {{"beginning", series.beginning}});
    if (nearest != nullptr) {
        series.sentence += say("sentence.gap") +
                           (nearest->averageOff.empty()
                                ? say("trend.nearest", {{"ink", inText(nearest->ink, say)},
                                                        {"value", nearest->value},
                                                        {"tolerance", nearest->tolerance}})
                                : say("trend.nearestToAim", {{"ink", inText(nearest->ink, say)},
                                                             {"value", nearest->value},
                                                             {"tolerance", nearest->tolerance},
                                                             {"off", nearest->averageOff}}));
    }
}

void sayState(Series& series, const std::vector<const Sample*>& samples, const Texts& say) {
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
        sayDrifting(series, say);
        break;
    case Movement::Steady:
        saySteady(series, say);
        break;
    case Movement::TooFew:
        series.word = say("movement.tooFew");
        series.sentence =
            say("trend.tooFew", {{"fewest", fewestForDrift}, {"count", samples.size()}});
        break;
    case Movement::Unknown:
        series.word = say("trend.noInks");
        series.sentence = say("trend.noInksSentence");
        break;
    }
    if (const std::string recent = recentText(series, samples, say); !recent.empty()) {
        series.reasons.push_back(recent);
    }
}

Series seriesOf(const std::vector<Sample>& all, std::vector<std::size_t> indices,
                const Texts& say) {
    Series series;
    series.samples = std::move(indices);
    std::vector<const Sample*> samples;
    for (const std::size_t index : series.samples) {
        samples.push_back(&all[index]);
    }
    series.name = nameOf(*samples[0], say);
    series.span = dayText(samples.front()->time, say);
    if (const std::string last = dayText(samples.back()->time, say); last != series.span) {
        series.span = say("trend.span", {{"from", series.span}, {"to", last}});
    }
    for (const Sample* sample : samples) {
        ++(sample->verdict == Verdict::Passed   ? series.passed
           : sample->verdict == Verdict::Failed ? series.failed
                                                : series.incomplete);
    }
    series.beginning = beginningOf(samples.size());
    for (const Ink ink : allInks) {
        series.inks.push_back(inkTrend(ink, samples, say));
    }
    series.criteria = criterionTrends(samples, say);
    sayState(series, samples, say);
    return series;
}

} // namespace

std::string wordOf(Movement movement, const Texts& say) {
    switch (movement) {
    case Movement::Drifting:
        return say("movement.drifting");
    case Movement::Steady:
        return say("movement.steady");
    case Movement::TooFew:
        return say("movement.tooFew");
    case Movement::Unknown:
        break;
    }
    return say("movement.noData");
}

std::string inkName(Ink ink, const Texts& say) {
    return say.find(std::string("ink.") + inkCriterion(ink)).value_or("");
}

std::string timeText(std::int64_t time, const Texts& say) {
    const std::tm parts = partsOf(time);
    char clock[8];
    std::snprintf(clock, sizeof clock, "%02u:%02u", unsigned(parts.tm_hour) % 24,
                  unsigned(parts.tm_min) % 60);
    return say.time(dayText(time, say), clock);
}

std::string titleOf(const Sample& sample, const Texts& say) {
    const std::string title = sample.title.empty() && sample.jobId
                                  ? say("page.job", {{"job", std::to_string(*sample.jobId)}})
                                  : sample.title;
    return sample.strip == 2 ? say("trend.secondStripOf", {{"job", title}}) : title;
}

std::string nearestText(const Sample& sample, const Texts& say) {
    const auto furthest =
        std::max_element(sample.criteria.begin(), sample.criteria.end(),
                         [](const auto& a, const auto& b) { return excessOf(a) < excessOf(b); });
    if (furthest == sample.criteria.end() || excessOf(*furthest) < 0) {
        return {};
    }
    return say("trend.nearestOfJob",
               {{"criterion", titleOf(*furthest, say)},
                {"value", say.number(judgedValue(*furthest), furthest->decimals)},
                {"tolerance", say.number(*furthest->tolerance, furthest->decimals)}});
}

TrendModel makeTrend(std::vector<Sample> samples, const std::string& source,
                     std::vector<std::string> notes, const Texts& say) {
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
        model.series.push_back(seriesOf(model.samples, std::move(indices), say));
    }
    tellApart(model.series, model.samples, say);
    std::stable_sort(model.series.begin(), model.series.end(), [](const auto& a, const auto& b) {
        const bool first = a.movement == Movement::Drifting;
        const bool second = b.movement == Movement::Drifting;
        return first != second ? first : a.samples.size() > b.samples.size();
    });
    model.subtitle = source.empty() ? say("trend.fromFiles", {{"count", model.samples.size()}})
                                    : say("trend.fromStore",
                                          {{"count", model.samples.size()}, {"store", source}});
    return model;
}

} // namespace report
