// SPDX-License-Identifier: Apache-2.0
// Everything that the page of a report says, worked out of a result and, for a job, its meta file.
// The page itself (page.html, page.js) places, sorts and draws, and works nothing out.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "report/Meta.h"
#include "report/Result.h"
#include "report/Swatch.h"
#include "report/languages/Texts.h"

namespace report {

/// One criterion. Numbers are texts of the page's language, with the decimals of the preset.
struct Figure {
    std::string title;
    std::string unit;
    Outcome outcome = Outcome::Unjudged;
    std::string word; ///< The outcome in a word: "Passed", "Failed", "No data", "Not judged".
    std::string value;
    std::string tolerance;
    std::string
        distance; ///< "2.63 above", "0.40 below" or "at the tolerance"; empty without a judgement.
    double fill = 0; ///< Value as a share of twice the tolerance, 0 to 1: half is the limit.
    std::size_t patches = 0;
    std::string worstLabel; ///< Worst patch with its device values, or empty.
    std::string missing;    ///< Why there is no data; empty with an answer.
    double excess = 0;      ///< Value over tolerance, for the order; infinite for a tolerance of 0.
};

struct Bin {
    double from = 0;
    double to = 0;
    std::size_t count = 0;
};

/// A vertical line in the histogram.
struct Mark {
    std::string label;
    double value = 0;
    bool limit = false; ///< A tolerance, drawn apart from the figures.
};

/// One patch with what the page shows of it. Differences are measured less target.
struct Row {
    std::size_t patch = 0; ///< Index into the result's patches.
    Swatch target;
    Swatch measured;
};

/// One tint in a chart of tone values.
struct TonePoint {
    double nominal = 0;
    double measured = 0; ///< Tone value less nominal, as is `aim`.
    double aim = 0;
    double tolerance = 0; ///< The narrowest that applies; NaN without one.
    bool above = false;   ///< Further from the aim than that.
};

/// Tone values of one ink.
struct ToneChart {
    std::string title;
    std::string text; ///< What the lines are, with the largest deviation.
    std::vector<TonePoint> points;
};

/// A bar of the chart of repeated readings.
struct SpreadBar {
    std::string label;
    double mean = 0;
    double largest = 0;
};

/// The papers of both sides.
struct PaperPair {
    std::string sentence; ///< Which aims were judged.
    std::string target;   ///< Lab, as is `measured`; "–" if it is not known.
    std::string measured;
    std::string difference;
    Swatch targetSwatch;
    Swatch measuredSwatch;
};

using Facts = std::vector<std::pair<std::string, std::string>>; ///< Label and text.

struct Model {
    std::string title;    ///< Of the job, else of the measurement.
    std::string subtitle; ///< Strip, paper, instrument: what is known, parted by middle dots.
    Verdict verdict = Verdict::Incomplete;
    std::string word;                 ///< "Passed", "Failed", "Incomplete".
    std::string sentence;             ///< What the verdict rests on.
    std::vector<std::string> doubts;  ///< Of an incomplete verdict: warnings that keep it open.
    std::vector<std::string> reasons; ///< Failed criteria, the furthest above first; then those
                                      ///< without data.
    std::string condition;      ///< Of the measurement, the target and the preset; may be empty.
    Facts basis;                ///< Reference, preset, date, instrument, condition: what is known.
    std::string unit;           ///< Of the differences, such as "ΔE00".
    std::vector<Figure> judged; ///< Used criteria: failed, without data, passed.
    std::vector<Figure> others; ///< The rest, in the result's order.
    Facts statistics;
    std::vector<std::string> warnings; ///< Without the doubts.
    std::vector<Bin> histogram;
    std::vector<Mark> marks;
    std::string histogramText; ///< The same in words, for those who can't see it.
    /// The first `shown` are for the table: all patches, or the worst ones, in either case the
    /// largest difference first, no number last. Rows that only the charts need follow.
    std::vector<Row> rows;
    std::size_t shown = 0;
    std::string shownText;          ///< States that the table has not all patches; else empty.
    std::vector<std::size_t> drawn; ///< Indices of `rows` for the charts.
    std::string drawnText;          ///< Says so where the charts don't draw all.
    std::vector<std::pair<std::string, Facts>> sections; ///< Job, inputs, pairing, programs.
    std::optional<PaperPair> papers; ///< These four only if the preset asks for them.
    std::vector<ToneChart> tones;
    std::vector<Grey> greys;        ///< By rising tone.
    std::vector<SpreadBar> spreads; ///< The widest first, at most mostSpreads.
    std::string spreadsText;
    std::string created; ///< Of the meta file, as a person reads it.
};

/// Charts draw all patches up to this number; beyond it, half of it from the worst and half evenly
/// from the rest, which keeps a chart of any size quick and its outline true.
inline constexpr std::size_t mostDrawn = 2000;
inline constexpr std::size_t mostSpreads = 60;

/// A page has all patches up to this number; beyond it, the worst of them (a page of a million rows
/// would be 130 MB, and no one would look at its end).
inline constexpr std::size_t mostRows = 20000;
inline constexpr std::size_t worstRows = 5000;

/// `meta` may be null: a result of files has no job. `print` is what else is known of the print,
/// such as its paper; it may be empty.
Model makeModel(const Result& result, const Meta* meta,
                const languages::Texts& say = languages::english(), const Facts& print = {});

/// Bins of equal, round width (1, 2 or 5 times a power of ten) from 0 to behind the largest value:
/// about 12 to 30 of them. Values that are not finite are left out, negative ones count as 0.
std::vector<Bin> histogramOf(const std::vector<double>& values);

/// "Passed", "Failed", "Incomplete".
std::string wordOf(Verdict verdict, const languages::Texts& say = languages::english());

/// A criterion's name for people; the result's own title if it is not in the tables.
std::string titleOf(const Criterion& criterion, const languages::Texts& say);

/// The warning's sentence; the English one of the result if it is not in the tables.
std::string warningText(const Warning& warning, const languages::Texts& say);

/// The title of the job, otherwise "Job 4711".
std::string jobTitle(const Meta& meta, const languages::Texts& say);

/// A patch for a person who looks for it on the sheet: its id and name there or, without either, in
/// the target, or its row; its device values; and its label in the target if that is another.
std::string labelOf(const Result& result, std::size_t patch,
                    const languages::Texts& say = languages::english());

/// Fixed decimals with a point in every locale; "–" where not finite.
std::string fixedText(double value, int decimals);

/// What a criterion is measured in, such as "ΔE00" under the formula "CIE2000".
std::string unitOf(const Criterion& criterion, const std::string& formula);

/// 2024-05-01T12:34:56+02:00 as "1 May 2024, 12:34 (UTC+02:00)".
std::string dateText(const std::string& created,
                     const languages::Texts& say = languages::english());

} // namespace report
