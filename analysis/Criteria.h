// SPDX-License-Identifier: Apache-2.0
// What a comparison is judged by: one table, from which presets, results and docs take their words.
#pragma once

#include <cstddef>
#include <iterator>
#include <string_view>

#include "job/AnalysisLibrary.h"

namespace analysis {

/// The patches that a criterion looks at, told by their device values and never by their row.
enum class Patches {
    All,
    Paper,     ///< No ink.
    SolidCyan, ///< One process ink at 100, the rest 0.
    SolidMagenta,
    SolidYellow,
    SolidBlack,
    Solids,          ///< The four solids.
    ChromaticSolids, ///< The solids of cyan, magenta and yellow.
    Red,             ///< Two of cyan, magenta and yellow at 100, the rest 0.
    Green,
    Blue,
    Secondaries,  ///< The three overprints.
    Greys,        ///< The triplets of greyTriplets.
    OuterGamut,   ///< The list of analysis/OuterGamut.h.
    SurfaceGamut, ///< No black, at most two of cyan, magenta and yellow, and not paper.
    Spots,        ///< One spot colour at 100, the rest 0.
    Repeated,     ///< Measured more than once.
};

/// What is taken of each patch.
enum class Quantity {
    DeltaE,  ///< By the formula of the preset.
    DeltaH,  ///< CIELAB hue difference, whatever the formula.
    DeltaCh, ///< CIELAB chromaticness difference, whatever the formula.
    Spread,  ///< Of a reading from the mean of its patch's readings, by the formula of the preset.
};

/// How the patches of a criterion become one figure.
enum class Statistic {
    Mean,
    Maximum,
    Percentile95, ///< Nearest rank: the ceil(0.95 n)-th smallest.
};

/// Of a criterion that the records at the boundary have no entry for: it is known by its name
/// alone, in presets and in results.
inline constexpr int noEntry = -1;

struct Criterion {
    int index;        ///< Entry of presetValues, usedForResult, decimalPlaces, approvals, decimals.
    const char* name; ///< In presets and results; never changes.
    const char* title; ///< For a person.
    int value;         ///< Entry of analyseResultsRecord::values.
    int psdEntry;      ///< Entry of psdPresetValues and usedForPSDResult.
    Patches patches;
    Quantity quantity;
    Statistic statistic;
};

/// All criteria, by rising index. After them come those without an entry; PresetOptions::named has
/// their settings. The indices that are absent have no meaning: their tolerances are ignored
/// and their approvals are false.
///
/// The server's table of results fixes which of its entries take which value: values 0 to 7 go with
/// criteria 6 to 9, 4, 0, 1 and 5; 12, 13, 14, 19 and 20 with 10, 11, 12, 13 and 3; 26 to 30 with
/// 18 to 22. It has no place for the value of criterion 2. Criteria 14 to 16 never reach it; their
/// largest one does, as 13. Of PSD presets it shows criteria 0 to 9 alone, and the value of
/// criterion 19 in place of 18's where PSD entry 21 takes part: hence those entries.
inline constexpr Criterion criteria[] = {
    {0, "average", "All patches, average", 5, 0, Patches::All, Quantity::DeltaE, Statistic::Mean},
    {1, "maximum", "All patches, largest", 6, 1, Patches::All, Quantity::DeltaE,
     Statistic::Maximum},
    {3, "percentile95", "All patches, 95th percentile", 20, 3, Patches::All, Quantity::DeltaE,
     Statistic::Percentile95},
    {4, "paperWhite", "Paper white", 4, 4, Patches::Paper, Quantity::DeltaE, Statistic::Maximum},
    {5, "solidMaximum", "Solids, largest", 7, 5, Patches::Solids, Quantity::DeltaE,
     Statistic::Maximum},
    {6, "solidCyan", "Solid cyan", 0, 6, Patches::SolidCyan, Quantity::DeltaE, Statistic::Maximum},
    {7, "solidMagenta", "Solid magenta", 1, 7, Patches::SolidMagenta, Quantity::DeltaE,
     Statistic::Maximum},
    {8, "solidYellow", "Solid yellow", 2, 8, Patches::SolidYellow, Quantity::DeltaE,
     Statistic::Maximum},
    {9, "solidBlack", "Solid black", 3, 9, Patches::SolidBlack, Quantity::DeltaE,
     Statistic::Maximum},
    {10, "solidHueMaximum", "Solids C, M, Y, largest hue difference", 12, 10,
     Patches::ChromaticSolids, Quantity::DeltaH, Statistic::Maximum},
    {11, "greyMaximum", "CMY greys, largest chromaticness difference", 13, 11, Patches::Greys,
     Quantity::DeltaCh, Statistic::Maximum},
    {12, "greyAverage", "CMY greys, average chromaticness difference", 14, 12, Patches::Greys,
     Quantity::DeltaCh, Statistic::Mean},
    {13, "secondaryMaximum", "Secondaries, largest", 19, 13, Patches::Secondaries, Quantity::DeltaE,
     Statistic::Maximum},
    {14, "secondaryRed", "Secondary red (M + Y)", 15, 14, Patches::Red, Quantity::DeltaE,
     Statistic::Maximum},
    {15, "secondaryGreen", "Secondary green (C + Y)", 16, 15, Patches::Green, Quantity::DeltaE,
     Statistic::Maximum},
    {16, "secondaryBlue", "Secondary blue (C + M)", 17, 16, Patches::Blue, Quantity::DeltaE,
     Statistic::Maximum},
    {18, "spotAverage", "Spot-colour solids, average", 26, 20, Patches::Spots, Quantity::DeltaE,
     Statistic::Mean},
    {19, "spotMaximum", "Spot-colour solids, largest", 27, 21, Patches::Spots, Quantity::DeltaE,
     Statistic::Maximum},
    {20, "outerGamutAverage", "Outer gamut, average", 28, 18, Patches::OuterGamut, Quantity::DeltaE,
     Statistic::Mean},
    {21, "outerGamutMaximum", "Outer gamut, largest", 29, 19, Patches::OuterGamut, Quantity::DeltaE,
     Statistic::Maximum},
    {22, "greyHueAverage", "CMY greys, average hue difference", 30, 22, Patches::Greys,
     Quantity::DeltaH, Statistic::Mean},
    {noEntry, "surfaceGamutAverage", "Surface of the gamut, average", noEntry, noEntry,
     Patches::SurfaceGamut, Quantity::DeltaE, Statistic::Mean},
    {noEntry, "repeatSpread", "Repeated readings, largest distance from their mean", noEntry,
     noEntry, Patches::Repeated, Quantity::Spread, Statistic::Maximum},
};

inline constexpr std::size_t criterionCount = std::size(criteria);

/// Place of a criterion in the table.
inline std::size_t placeOf(const Criterion& criterion) {
    return static_cast<std::size_t>(&criterion - criteria);
}

/// "dE", "dH" or "dCh".
constexpr const char* unit(Quantity quantity) {
    switch (quantity) {
    case Quantity::DeltaH:
        return "dH";
    case Quantity::DeltaCh:
        return "dCh";
    case Quantity::DeltaE:
    case Quantity::Spread:
        break;
    }
    return "dE";
}

/// The criterion of a name, else null.
constexpr const Criterion* criterionOfName(std::string_view name) {
    for (const Criterion& criterion : criteria) {
        if (name == criterion.name) {
            return &criterion;
        }
    }
    return nullptr;
}

} // namespace analysis
