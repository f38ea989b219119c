// SPDX-License-Identifier: Apache-2.0
// Target against measurement: which files, which patches, which differences.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "analysis/Inputs.h"
#include "analysis/Pairing.h"
#include "colour/Difference.h"

namespace analysis {

/// One of the files of a comparison, and how its patches were found.
struct Input {
    std::wstring path;
    SharedFile file;
    Pairing pairing;                 ///< Of the rows of `Comparison::selection` with this file's.
    std::vector<std::uint32_t> rows; ///< Of each patch its row. Empty for a profile.
    std::vector<std::uint32_t> unpaired; ///< Rows of this file without a counterpart.
};

/// Something that a person should know about a result and that is no failure.
struct Warning {
    const char* code;       ///< Never changes.
    std::string text;       ///< English, UTF-8.
    bool keepsOpen = false; ///< Because of this the verdict is at best "incomplete".
};

/// A further reading of a patch: a row of the measurement other than the patch's own.
struct FurtherReading {
    std::uint32_t row;
    std::uint32_t patch;
};

/// What is compared of patches that were measured more than once.
enum class RepeatMode {
    Each, ///< Every reading by itself.
    Mean, ///< The mean of the readings, taken in XYZ.
};

/// "each", "mean".
const char* repeatModeName(RepeatMode mode);

/// How far the readings of patches that were measured more than once lie apart. Distances are
/// colour differences of a reading from the mean of its patch's readings.
struct RepeatSpread {
    std::size_t patches = 0;  ///< Measured more than once.
    std::size_t readings = 0; ///< Of these patches.
    double mean = 0;          ///< Of all distances.
    double largest = 0;
    std::size_t worst = 0; ///< The patch with the largest distance. Only if there are patches.
};

/// Immovable, since it points into itself.
struct Comparison {
    Comparison() = default;
    Comparison(const Comparison&) = delete;
    Comparison& operator=(const Comparison&) = delete;

    std::size_t patchCount() const { return selectedRow.size(); }

    Input target;
    Input measurement;
    Input patchSet;
    std::vector<Warning> warnings;

    /// The file whose rows are compared, in their order, and whose ids the patches bear: the patch
    /// set, else the target, else (where the target is a profile) the measurement.
    Input* selection = nullptr;

    /// The file whose device values tell solids, greys and so on apart: the selection, or where
    /// only the other file has process colours, that one. Null where no file has device values.
    const Input* devices = nullptr;

    colour::Formula formula = colour::Formula::Cie76;

    // One entry a patch: in the order of the selection's rows, with repeats at the end.
    std::vector<std::uint32_t> selectedRow; ///< Row of the selection's set.
    std::vector<colour::Lab> targetLab;
    std::vector<colour::Lab> measuredLab;
    std::vector<double> difference;

    /// Of each patch a number that patches of equal device values share, from 0 without gaps.
    std::vector<std::uint32_t> groupOf;

    RepeatMode repeatMode = RepeatMode::Each;
    RepeatSpread spread;
    std::vector<FurtherReading> furtherReadings; ///< Empty unless means are compared.

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
    std::string condition; ///< "M1": read from files with several; empty: CgatsWants decides.
};

struct ComparisonWants {
    colour::Formula formula = colour::Formula::Cie76;
    RepeatMode repeats = RepeatMode::Each;
    bool spectra = false; ///< Keep the measurement's spectra.
};

/// Loads, pairs and compares.
///
/// Gives 0 or a code of docs/exit-codes.csv; `comparison` is good for nothing after a failure.
int compare(const ComparisonPaths& paths, const ComparisonWants& wants, Comparison& comparison);

/// The same with files that are already loaded. The references are only read, so threads may share
/// them. `path` is that of the measurement.
int compare(const References& references, const std::wstring& path, SharedFile measurement,
            const ComparisonWants& wants, Comparison& comparison);

/// Warns that target and measurement are the same file.
void warnOfSameFile(Comparison& comparison);

} // namespace analysis
