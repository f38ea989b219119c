// Target against measurement: which files, which patches, which differences.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "analysis/Pairing.h"
#include "colour/ColourFile.h"
#include "colour/Difference.h"

namespace analysis {

/// One of the files of a comparison, and how its patches were found.
struct Input {
    std::wstring path;
    colour::ColourFile file; ///< Neither member is set for a patch set that is not given.
    Pairing pairing;         ///< Of the rows of `Comparison::selection` with this file's.
    std::vector<std::uint32_t> unpaired; ///< Rows of this file without a counterpart.
};

/// Something that a person should know about a result and that is no failure.
struct Warning {
    const char* code; ///< Never changes.
    std::string text; ///< English, UTF-8.
};

/// Immovable, since it points into itself.
struct Comparison {
    Comparison() = default;
    Comparison(const Comparison&) = delete;
    Comparison& operator=(const Comparison&) = delete;

    std::size_t patchCount() const { return difference.size(); }

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

    // One entry a patch.
    colour::Formula formula = colour::Formula::Cie76;
    std::vector<std::uint32_t> selectedRow; ///< Row of the selection's set.
    std::vector<colour::Lab> targetLab;
    std::vector<colour::Lab> measuredLab;
    std::vector<double> difference;

    /// Row of a file's set that patch `patch` was taken from. REQUIRES: the file has a set.
    std::uint32_t rowOf(const Input& input, std::size_t patch) const {
        return input.pairing.partner[selectedRow[patch]];
    }

    /// Device values of a patch. REQUIRES: devices is not null.
    const double* deviceOf(std::size_t patch) const {
        const colour::DataSet& set = *devices->file.set;
        return &set.device[rowOf(*devices, patch) * set.channels.size()];
    }
};

struct ComparisonPaths {
    std::wstring target;
    std::wstring measurement;
    std::wstring patchSet; ///< May be empty.
    std::string condition; ///< "M1": read from files with several; empty: CgatsWants decides.
};

/// Loads, pairs and compares. `keepSpectra`: the measurement's spectra are wanted too.
///
/// Gives 0 or a code of docs/exit-codes.csv; `comparison` is good for nothing after a failure.
int compare(const ComparisonPaths& paths, colour::Formula formula, bool keepSpectra,
            Comparison& comparison);

} // namespace analysis
