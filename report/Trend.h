// SPDX-License-Identifier: Apache-2.0
// The content of a trend's page, derived from many results. The page (trend.html, trend.js) only
// arranges and draws.
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
    /// The change of the moving average: "moving average 1.84 from the mean of the first jobs:
    /// lighter (L* +1.20)".
    std::string sentence;
    colour::Lab began; ///< Mean of the first jobs; NaN without colours, as is `now`.
    colour::Lab now;   ///< Moving average at the latest job.
    colour::Lab aim;   ///< The target's colour; NaN if unknown.
    Swatch beganSwatch;
    Swatch nowSwatch;
    Swatch aimSwatch;
    /// Distance from `now` to `aim`, for corrections: "3.10 ΔE00" and "L* +1.20, a* -0.40, b*
    /// +0.00" (`now` minus `aim`). Empty if either is unknown. If only differences are known,
    /// averageOff is their moving average and `correction` is empty.
    std::string averageOff;
    std::string correction;
    double shift = 0; ///< CIELAB distance of `began` and `now`, or change of the difference.
    /// L*, a*, b* of each job minus `began`: measured and averaged. NaN if unknown; empty without
    /// any colours.
    std::array<std::vector<double>, 3> changes;
    std::array<std::vector<double>, 3> averages;
    /// The latest job's difference from the target with its tolerance; empty if not judged.
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
    std::vector<double> values;    ///< One per job, as judged; NaN if missing.
    std::vector<Outcome> outcomes; ///< One per job.
    /// Each tolerance with the index of the first job that used it; NaN for none.
    std::vector<std::pair<std::size_t, double>> tolerances;
    std::size_t failed = 0;
    std::size_t answered = 0;
    std::string latest;    ///< The latest existing value.
    std::string tolerance; ///< The latest one.
};

/// Results that can be compared with each other: the same target colours, paper, preset, formula,
/// instrument, printer, folder, workflow and strip.
struct Series {
    std::string name; ///< As many of these, in words, as are needed to distinguish the series.
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
    std::vector<CriterionTrend> criteria; ///< Used ones first, otherwise in the results' order.
    std::vector<std::size_t> samples;     ///< Indices into TrendModel::samples, by time.
    std::size_t beginning = 0;            ///< Number of jobs in the beginning.
};

struct TrendModel {
    std::string subtitle;
    std::vector<std::string> notes; ///< Remarks on the data as a whole.
    std::vector<Sample> samples;    ///< By time.
    std::vector<Series> series;     ///< Drifting ones first, then those with the most jobs.
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
