// SPDX-License-Identifier: Apache-2.0
// The result of a comparison, read from its JSON (docs/result.md).
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "colour/DataSet.h"

namespace report {

enum class Verdict { Passed, Failed, Incomplete };
enum class Outcome { Pass, Fail, Unanswered, Unjudged };

struct Criterion {
    std::string name; ///< For example "average"; docs/criteria.md lists them.
    std::string title;
    std::string unit; ///< "dE", "dH", "dCh", "dL" or "dTV".
    bool used = false;
    Outcome outcome = Outcome::Unjudged;
    std::optional<double> tolerance;
    std::optional<double> value;
    std::optional<double> rounded; ///< The value that was judged.
    int decimals = 2;              ///< 0 to 6.
    std::size_t patches = 0;
    std::optional<std::size_t> worstPatch; ///< Index into `patches`.
    std::size_t needed = 1;                ///< Distinct patches needed for an answer.
    std::size_t found = 0;                 ///< Distinct patches found.
    std::size_t listed = 0; ///< Length of the list from which they are selected; 0 without one.
};

/// Numbers are NaN if the result has null.
struct Patch {
    std::string id;
    std::string name;
    colour::Lab target;
    colour::Lab measured;
    double difference = 0;
    std::string measuredId = {}; ///< On the sheet; often the same as the id and name.
    std::string measuredName = {};
};

/// One side of the comparison with its file's own statements. Empty if not stated.
struct Input {
    std::string path;
    std::string kind;     ///< "text" or "profile".
    std::string identity; ///< Of a target's colours; empty in results of versions before it.
    /// The result's key and the file's words, such as "originator". "calculatedFromSpectra" has an
    /// empty text.
    std::vector<std::pair<std::string, std::string>> statements;
    std::string measurementCondition; ///< "M0" to "M3", or empty.
};

struct Warning {
    std::string text;       ///< In English.
    bool keepsOpen = false; ///< Because of this the verdict is at best "incomplete".
    std::string code = {};  ///< docs/result.md lists them; empty for one that a program adds.
};

/// One tint of an ink. NaN where the result has null.
struct ToneStep {
    double nominal = 0;
    double measured = 0;
    double aim = 0;
    std::size_t patch = 0; ///< Index into `patches`.
};

struct InkTones {
    std::size_t channel = 0;
    std::string aims; ///< "target", "A", "B" or "C"; empty for spot colour tone values.
    std::vector<ToneStep> steps;
};

/// Tone values, of results under presets that ask for them.
struct Tones {
    std::string method; ///< "density", "colorimetric", or empty without tone values.
    std::string aims;   ///< Of spot colour tone values: "nominal" or "target".
    std::vector<InkTones> inks;
};

/// A balanced grey.
struct Grey {
    std::size_t patch = 0;
    double tone = 0; ///< Nominal cyan.
    colour::Lab measured;
    double aimA = 0; ///< NaN if the paper is not known, as is `aimB`.
    double aimB = 0;
};

/// The papers of both sides, and which aims were judged because of them.
struct Papers {
    std::string aims; ///< "absolute", "corrected" or "relative".
    bool adjusted = false;
    std::optional<colour::Lab> target;
    std::optional<colour::Lab> measured;
    double difference = 0; ///< CIEDE2000; NaN if one of them is not known.
};

/// One patch that was measured more than once.
struct RepeatedPatch {
    std::size_t patch = 0;
    std::size_t readings = 0;
    double mean = 0; ///< Distance of its readings from their mean.
    double largest = 0;
};

/// Patches that were measured more than once. Distances are of a reading from the mean of its
/// patch's readings.
struct Repeats {
    bool averaged = false; ///< Their means were compared, instead of each reading.
    std::size_t patches = 0;
    std::size_t readings = 0; ///< Number of readings of these patches.
    std::optional<double> largestDistance;
    std::optional<std::size_t> worstPatch; ///< Index into `patches` of the result.
    std::vector<RepeatedPatch> each;       ///< Empty unless the preset asks for it.
};

struct Statistics {
    double mean = 0;
    double median = 0;
    double percentile95 = 0;
    double maximum = 0;
    double standardDeviation = 0;
};

struct Unpaired {
    std::size_t count = 0;
    std::vector<std::string> labels; ///< Ids or names of the first `Result::mostLabels` of them.
};

struct Result {
    static constexpr std::size_t mostLabels = 20;

    std::string toolVersion;
    std::string libraryVersion;
    Verdict verdict = Verdict::Incomplete;
    std::string formula; ///< For example "CIE2000".
    std::string presetName;
    std::int64_t presetId = 0;
    std::int64_t presetCondition = -1; ///< 0 to 3 are M0 to M3; others mean none.
    bool conditionRequired = false;
    Input target;
    Input measurement;
    std::optional<Input> patchSet;
    std::string selection;     ///< Source of the patches: "target", "measurement" or "patchSet".
    std::string measurementBy; ///< How the measured patches were found (docs/result.md).
    std::string targetBy;
    Statistics statistics;
    std::vector<Criterion> criteria;
    std::vector<Warning> warnings;
    Repeats repeats;
    std::optional<Papers> papers; ///< These four only if the preset asks for them.
    std::optional<Tones> tones;
    std::optional<Tones> spotTones;
    std::vector<Grey> greys;
    Unpaired unpairedTarget;
    Unpaired unpairedMeasurement;
    Unpaired unpairedPatchSet;
    std::vector<std::string> channels; ///< Names of the device values.
    std::vector<Patch> patches;        ///< In the result's order.
    std::vector<double> device;        ///< In percent; channels.size() per patch.
};

/// Reads a whole result, with patches row by row instead of in a tree. Members that older versions
/// of the library did not write keep their initial values. Nothing if the text is not a result in a
/// known format; `problem` then describes why.
std::optional<Result> readResult(std::string_view json, std::string& problem);

} // namespace report
