// SPDX-License-Identifier: Apache-2.0
// Compares a target with a measurement: the files, their patches and the differences.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "analysis/Inputs.h"
#include "analysis/Pairing.h"
#include "colour/Difference.h"

namespace analysis {

/// One of the files of a comparison, and how its patches were found.
struct Input {
    std::wstring path;
    SharedFile file;
    Pairing pairing;                     ///< Of the rows of `Comparison::selection` to this file's.
    std::vector<std::uint32_t> rows;     ///< The row of each patch. Empty for a profile.
    std::vector<std::uint32_t> unpaired; ///< Rows of this file without a counterpart.
};

/// Information about a result that people should have, but not a failure.
struct Warning {
    const char* code;       ///< Never changes.
    std::string text;       ///< English, UTF-8.
    bool keepsOpen = false; ///< The verdict can't be "passed".
};

/// A further reading of a patch: a row of the measurement other than the patch's own.
struct FurtherReading {
    std::uint32_t row;
    std::uint32_t patch;
};

/// What is compared if patches were measured more than once.
enum class RepeatMode {
    Each, ///< Each reading separately.
    Mean, ///< The mean of the readings, taken in XYZ.
};

/// "each", "mean".
const char* repeatModeName(RepeatMode mode);

/// One patch that was measured more than once.
struct RepeatedPatch {
    std::size_t patch = 0; ///< The first of its patches.
    std::size_t readings = 0;
    double mean = 0; ///< Of the distances of its readings.
    double largest = 0;
};

/// How far the readings of patches that were measured more than once lie apart. Distances are
/// colour differences of a reading from the mean of its patch's readings.
struct RepeatSpread {
    std::size_t patches = 0;  ///< Measured more than once.
    std::size_t readings = 0; ///< Of these patches.
    double mean = 0;          ///< Of all distances.
    double largest = 0;
    std::size_t worst = 0; ///< The patch with the largest distance. Only if there are patches.
    std::vector<RepeatedPatch> each; ///< In the order of their first patches.
};

/// What the measured colours are held against.
enum class PaperAims {
    Absolute,  ///< The target as it is.
    Corrected, ///< The target corrected for the measured paper (SCCA).
    Relative,  ///< Both sides relative to their own paper.
};

/// "absolute", "corrected", "relative".
const char* paperAimsName(PaperAims aims);

/// The papers of both sides, and what was made of the aims because of them (analysis/PaperAims.h).
struct Papers {
    PaperAims aims = PaperAims::Absolute; ///< As asked for.
    bool adjusted = false;                ///< False also if the papers are not known.
    std::optional<colour::Lab> target;    ///< Means of the paper patches as they are.
    std::optional<colour::Lab> measured;
    std::optional<colour::Lab> darkest; ///< What a correction leaves in place.

    /// Measured colours of all patches before they were made relative; empty otherwise.
    std::vector<colour::Lab> measuredBefore;
    /// Differences of the paper patches before the aims were adjusted, with their patches.
    std::vector<std::pair<std::size_t, double>> differences;
};

/// All that was paired, before means were taken and aims adjusted. One entry a pair of rows.
struct Readings {
    std::vector<std::uint32_t> targetRow; ///< Empty for a profile, as is measuredRow.
    std::vector<std::uint32_t> measuredRow;
    std::vector<std::uint32_t> deviceRow; ///< Row of the set that the device values are from.
    std::vector<colour::Lab> target;
    std::vector<colour::Lab> measured;
    std::vector<std::uint32_t> patch; ///< The patch of the comparison that it is part of.
};

/// Immovable, because it contains pointers to itself.
struct Comparison {
    Comparison() = default;
    Comparison(const Comparison&) = delete;
    Comparison& operator=(const Comparison&) = delete;

    std::size_t patchCount() const { return selectedRow.size(); }

    Input target;
    Input measurement;
    Input patchSet;
    std::vector<Warning> warnings;

    /// The file whose rows are compared in their order, and whose ids identify the patches: the
    /// patch set, otherwise the target, or the measurement if the target is a profile.
    Input* selection = nullptr;

    /// The file whose device values identify solids, greys and so on: the selection, or the other
    /// file if only that has process colours. Null if no file has device values.
    const Input* devices = nullptr;

    colour::Formula formula = colour::Formula::Cie76;

    // One entry per patch, in the order of the selection's rows, with repeats at the end.
    std::vector<std::uint32_t> selectedRow; ///< Row of the selection's set.
    std::vector<colour::Lab> targetLab;
    std::vector<colour::Lab> measuredLab;
    std::vector<double> difference;

    /// A number for each patch, equal for patches with equal device values, from 0 without gaps.
    std::vector<std::uint32_t> groupOf;

    RepeatMode repeatMode = RepeatMode::Each;
    RepeatSpread spread;
    std::vector<FurtherReading> furtherReadings; ///< Empty unless means are compared.
    Papers papers;     ///< Filled if readings are, or if aims are to be adjusted.
    Readings readings; ///< Empty unless wanted.

    /// The measured colour of a patch as it is, whatever it was made relative to.
    const colour::Lab& measuredAsIs(std::size_t patch) const {
        return papers.measuredBefore.empty() ? measuredLab[patch] : papers.measuredBefore[patch];
    }

    /// Device values of a patch. REQUIRES: devices is not null.
    const double* deviceOf(std::size_t patch) const {
        const colour::DataSet& set = *devices->file.set;
        return &set.device[devices->rows[patch] * set.channels.size()];
    }
};

struct ComparisonPaths {
    std::wstring target;
    std::wstring measurement;
    std::wstring patchSet; ///< May be empty.
    std::string condition; ///< "M1": read from files with several. Empty: see CgatsWants.
};

struct ComparisonWants {
    colour::Formula formula = colour::Formula::Cie76;
    RepeatMode repeats = RepeatMode::Each;
    bool spectra = false;       ///< Keep the measurement's spectra.
    bool targetSpectra = false; ///< Keep the target's.
    bool singleInks = false;    ///< Spectra of overprints may be 0.
    bool readings = false;      ///< Fill Comparison::readings and papers.
    PaperAims paperAims = PaperAims::Absolute;
};

/// What a comparison needs of its files. `condition` as in colour::CgatsWants.
colour::CgatsWants targetWants(const ComparisonWants& wants, const std::string& condition);
colour::CgatsWants measurementWants(const ComparisonWants& wants, const std::string& condition);

/// Loads, pairs and compares.
///
/// Returns 0 or a code of docs/exit-codes.csv. After a failure `comparison` must not be used.
int compare(const ComparisonPaths& paths, const ComparisonWants& wants, Comparison& comparison);

/// The same with files that are already loaded. The references are only read, so threads can share
/// them. `path` is the measurement's.
int compare(const References& references, const std::wstring& path, SharedFile measurement,
            const ComparisonWants& wants, Comparison& comparison);

/// Warns that target and measurement are the same file.
void warnOfSameFile(Comparison& comparison);

} // namespace analysis
