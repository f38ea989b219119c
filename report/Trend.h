// SPDX-License-Identifier: Apache-2.0
// Everything that the page of a trend says, worked out of many results. The page itself
// (trend.html, trend.js) places and draws, and works nothing out.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "report/Sample.h"
#include "report/Swatch.h"
#include "report/languages/Texts.h"

namespace report {

enum class Movement { Unknown, TooFew, Steady, Drifting };

/// Paper or a solid over time.
struct InkTrend {
    Ink ink = Ink::Paper;
    Movement movement = Movement::Unknown;
    std::string word; ///< "Drifting", "Steady", "Too few jobs", "No data".
    /// What the moving average has done: "moving average 1.84 from the mean of the first jobs:
    /// lighter (L* +1.20)".
    std::string sentence;
    colour::Lab began; ///< Mean of the first jobs; NaN without colours, as is `now`.
    colour::Lab now;   ///< Moving average at the latest job.
    colour::Lab aim;   ///< The target's; NaN where it is not known.
    Swatch beganSwatch;
    Swatch nowSwatch;
    Swatch aimSwatch;
    /// How far `now` is from `aim`, which is what a person would correct by: "3.10 ΔE00" and "L*
    /// +1.20, a* -0.40, b* +0.00" (`now` less `aim`). Empty if either is not known; `correction`
    /// also if only differences are known, as their moving average.
    std::string averageOff;
    std::string correction;
    double shift = 0; ///< Distance of the two in CIELAB; without colours, change of the difference.
    /// L*, a*, b* of each job less `began`: as measured, and averaged. NaN where nothing is known;
    /// empty without any colours.
    std::array<std::vector<double>, 3> changes;
    std::array<std::vector<double>, 3> averages;
    /// The latest job's difference from the target with its tolerance; empty where not judged.
    std::string value;
    std::string tolerance;
    double fill = 0;    ///< Value as a share of twice the tolerance, 0 to 1.
    bool above = false; ///< The latest job is above the tolerance.
};

/// A criterion over time.
struct CriterionTrend {
    std::string title;
    std::string unit;
    bool used = false;     ///< By at least one job.
    bool followed = false; ///< Shown with the used ones: tone values at 50 %, mid-tone spread.
    int decimals = 2;
    std::vector<double> values;    ///< One a job, as judged; NaN for none.
    std::vector<Outcome> outcomes; ///< One a job.
    /// The tolerance and the index of the job from which it holds; NaN for none.
    std::vector<std::pair<std::size_t, double>> tolerances;
    std::size_t failed = 0;
    std::size_t answered = 0;
    std::string latest;    ///< The last value that there is.
    std::string tolerance; ///< The last one.
};

/// Results that may be compared with each other: aimed at the same colours, and of one paper,
/// preset, formula, instrument, printer, folder, workflow and strip.
struct Series {
    std::string name; ///< These in words, as many as tell the series of a trend apart.
    std::string preset;
    std::string paper;
    Movement movement = Movement::Unknown;
    bool failing = false; ///< The latest job failed.
    std::string word;     ///< "Drifting: cyan, black", "Steady", ...
    std::string sentence;
    std::vector<std::string> reasons;
    std::string span; ///< "3 November 2026 to 24 November 2026".
    std::size_t passed = 0;
    std::size_t failed = 0;
    std::size_t incomplete = 0;
    std::vector<InkTrend> inks;           ///< All five, in the order of Ink.
    std::vector<CriterionTrend> criteria; ///< Used ones first, else in the results' order.
    std::vector<std::size_t> samples;     ///< Indices into TrendModel::samples, by time.
    std::size_t beginning = 0;            ///< How many jobs make the beginning.
};

struct TrendModel {
    std::string subtitle;
    std::vector<std::string> notes; ///< What a person should know of the data as a whole.
    std::vector<Sample> samples;    ///< By time.
    std::vector<Series> series;     ///< Drifting ones first, then those of the most jobs.
};

/// `store` is the address of the store that the samples come from; empty if they are from files.
/// REQUIRES: samples.
TrendModel makeTrend(std::vector<Sample> samples, const std::string& store,
                     std::vector<std::string> notes, const languages::Texts& say);

/// "Drifting", "Steady", "Too few jobs", "No data".
std::string wordOf(Movement movement, const languages::Texts& say);

/// "Paper white", "Cyan" and so on.
std::string inkName(Ink ink, const languages::Texts& say);

/// "Order 1234, second strip"
std::string titleOf(const Sample& sample, const languages::Texts& say);

/// The furthest of a job's used criteria, as "Solid cyan 4.75 of 3.00"; empty without any.
std::string nearestText(const Sample& sample, const languages::Texts& say);

/// "24 November 2026, 21:53", of a time as samples have it.
std::string timeText(std::int64_t time, const languages::Texts& say);

} // namespace report
