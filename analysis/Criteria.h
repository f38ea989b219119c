// SPDX-License-Identifier: Apache-2.0
// The criteria of a judgement, in one table. Presets, results and docs use its names.
#pragma once

#include <cstddef>
#include <iterator>
#include <string_view>

#include "job/AnalysisLibrary.h"

namespace analysis {

/// The patches that a criterion evaluates. Device values identify them, never their rows.
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
    // Those of here on are gathered by analysis/Measures.h, and only if a preset asks for them.
    Tints,         ///< One ink of more than 0 and less than 100, the rest 0; Criterion::tints.
    BalancedGreys, ///< The triplets of greyTriplets that follow the near-neutral formula.
};

/// Which tints, by their nominal percentage.
enum class Tones {
    All,
    MidTones,      ///< 40 and 50.
    ThreeQuarters, ///< 70 to 80.
    Ramp,          ///< 30 to 70.
};

/// Of which inks.
enum class Inks {
    Cyan,
    Magenta,
    Yellow,
    Black,
    Chromatic, ///< Cyan, magenta and yellow together.
    Spots,
    All,
};

struct Tints {
    Inks inks = Inks::All;
    Tones tones = Tones::All;
};

/// What is taken of each patch.
enum class Quantity {
    DeltaE,   ///< By the formula of the preset.
    DeltaH,   ///< CIELAB hue difference, whatever the formula.
    DeltaCh,  ///< CIELAB chromaticness difference, whatever the formula.
    Spread,   ///< Of a reading from the mean of its patch's readings, by the formula of the preset.
    DeltaL,   ///< CIELAB lightness difference as a magnitude.
    GreyCh,   ///< Chromaticness difference from the grey that the measured paper asks for.
    Tone,     ///< Tone value less its aim, as a magnitude; of several inks their spread.
    SpotTone, ///< Spot colour tone value (ISO 20654) less its aim, as a magnitude.
};

/// How a criterion combines its patches into one value.
enum class Statistic {
    Mean,
    Maximum,
    Percentile95, ///< Nearest rank: the ceil(0.95 n)-th smallest.
};

/// A criterion without an entry in the library's records. Presets and results know it by name only.
inline constexpr int noEntry = -1;

struct Criterion {
    int index;        ///< Entry of presetValues, usedForResult, decimalPlaces, approvals, decimals.
    const char* name; ///< In presets and results. Never changes.
    const char* title; ///< For people.
    int value;         ///< Entry of analyseResultsRecord::values.
    int psdEntry;      ///< Entry of psdPresetValues and usedForPSDResult.
    Patches patches;
    Quantity quantity;
    Statistic statistic;
    /// Answered only if the preset's file names it: it takes work that other presets need not pay.
    bool onRequest = false;
    Tints tints = {};
};

/// All criteria, in ascending order of index, then those without an entry; PresetOptions::named has
/// their settings. Absent indices have no meaning: their tolerances are ignored and their approvals
/// are false.
///
/// The server's table of results determines which of its entries have which value: values 0 to 7
/// belong to criteria 6 to 9, 4, 0, 1 and 5; 12, 13, 14, 19 and 20 to 10, 11, 12, 13 and 3; 26 to
/// 30 to 18 to 22. It has no entry for the values of criteria 2 and 14 to 16; the largest of the
/// last three is 13's value. For PSD presets it shows only criteria 0 to 9, and it shows the value
/// of criterion 19 instead of 18's if PSD entry 21 is used. Hence the entries below.
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
    {noEntry, "repeatAverage", "Repeated readings, average distance from their mean", noEntry,
     noEntry, Patches::Repeated, Quantity::Spread, Statistic::Mean, true},
    {noEntry,
     "toneCyan",
     "Tone values of cyan, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Cyan, Tones::All}},
    {noEntry,
     "toneCyanMiddle",
     "Tone value of cyan at 40 and 50 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Cyan, Tones::MidTones}},
    {noEntry,
     "toneCyanThreeQuarters",
     "Tone value of cyan at 70 to 80 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Cyan, Tones::ThreeQuarters}},
    {noEntry,
     "toneMagenta",
     "Tone values of magenta, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Magenta, Tones::All}},
    {noEntry,
     "toneMagentaMiddle",
     "Tone value of magenta at 40 and 50 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Magenta, Tones::MidTones}},
    {noEntry,
     "toneMagentaThreeQuarters",
     "Tone value of magenta at 70 to 80 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Magenta, Tones::ThreeQuarters}},
    {noEntry,
     "toneYellow",
     "Tone values of yellow, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Yellow, Tones::All}},
    {noEntry,
     "toneYellowMiddle",
     "Tone value of yellow at 40 and 50 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Yellow, Tones::MidTones}},
    {noEntry,
     "toneYellowThreeQuarters",
     "Tone value of yellow at 70 to 80 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Yellow, Tones::ThreeQuarters}},
    {noEntry,
     "toneBlack",
     "Tone values of black, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Black, Tones::All}},
    {noEntry,
     "toneBlackMiddle",
     "Tone value of black at 40 and 50 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Black, Tones::MidTones}},
    {noEntry,
     "toneBlackThreeQuarters",
     "Tone value of black at 70 to 80 %, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Black, Tones::ThreeQuarters}},
    {noEntry,
     "midToneSpread",
     "Mid-tone spread of C, M, Y",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::Tone,
     Statistic::Maximum,
     true,
     {Inks::Chromatic, Tones::MidTones}},
    {noEntry,
     "sctvSpotAverage",
     "Spot colour tone values of spot inks, average deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::SpotTone,
     Statistic::Mean,
     true,
     {Inks::Spots, Tones::All}},
    {noEntry,
     "sctvSpotMaximum",
     "Spot colour tone values of spot inks, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::SpotTone,
     Statistic::Maximum,
     true,
     {Inks::Spots, Tones::All}},
    {noEntry,
     "sctvAverage",
     "Spot colour tone values of all inks, average deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::SpotTone,
     Statistic::Mean,
     true,
     {Inks::All, Tones::All}},
    {noEntry,
     "sctvMaximum",
     "Spot colour tone values of all inks, largest deviation",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::SpotTone,
     Statistic::Maximum,
     true,
     {Inks::All, Tones::All}},
    {noEntry,
     "rampLightness",
     "Single inks, 30 to 70 %, largest lightness difference",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::DeltaL,
     Statistic::Maximum,
     true,
     {Inks::All, Tones::Ramp}},
    {noEntry, "greyBalanceAverage", "Balanced greys, average distance from the grey of the paper",
     noEntry, noEntry, Patches::BalancedGreys, Quantity::GreyCh, Statistic::Mean, true},
    {noEntry, "greyBalanceMaximum", "Balanced greys, largest distance from the grey of the paper",
     noEntry, noEntry, Patches::BalancedGreys, Quantity::GreyCh, Statistic::Maximum, true},
    {noEntry, "greyLightnessAverage", "Balanced greys, average lightness difference", noEntry,
     noEntry, Patches::BalancedGreys, Quantity::DeltaL, Statistic::Mean, true},
    {noEntry, "greyLightnessMaximum", "Balanced greys, largest lightness difference", noEntry,
     noEntry, Patches::BalancedGreys, Quantity::DeltaL, Statistic::Maximum, true},
    {noEntry,
     "blackLightnessAverage",
     "Tints of black, average lightness difference",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::DeltaL,
     Statistic::Mean,
     true,
     {Inks::Black, Tones::All}},
    {noEntry,
     "blackLightnessMaximum",
     "Tints of black, largest lightness difference",
     noEntry,
     noEntry,
     Patches::Tints,
     Quantity::DeltaL,
     Statistic::Maximum,
     true,
     {Inks::Black, Tones::All}},
};

inline constexpr std::size_t criterionCount = std::size(criteria);

/// Position of a criterion in the table.
inline std::size_t placeOf(const Criterion& criterion) {
    return static_cast<std::size_t>(&criterion - criteria);
}

/// "dE", "dH", "dCh", "dL" or "dTV".
constexpr const char* unit(Quantity quantity) {
    switch (quantity) {
    case Quantity::DeltaH:
        return "dH";
    case Quantity::DeltaCh:
    case Quantity::GreyCh:
        return "dCh";
    case Quantity::DeltaL:
        return "dL";
    case Quantity::Tone:
    case Quantity::SpotTone:
        return "dTV";
    case Quantity::DeltaE:
    case Quantity::Spread:
        break;
    }
    return "dE";
}

/// Finds a criterion by name. Null if there is none.
constexpr const Criterion* criterionOfName(std::string_view name) {
    for (const Criterion& criterion : criteria) {
        if (name == criterion.name) {
            return &criterion;
        }
    }
    return nullptr;
}

} // namespace analysis
