// SPDX-License-Identifier: Apache-2.0
// What a comparison says of tone values, ramps and grey balance. It is worked out only as far as
// the criteria of a preset ask for it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Criteria.h"
#include "analysis/Presets.h"

namespace analysis {

/// One tint of an ink. The readings of one tint are averaged, in what tone values are made of.
struct ToneStep {
    double nominal = 0;
    double measured = 0;
    double aim = 0;
    std::size_t readings = 0;
    std::size_t patch = 0; ///< The first of its patches.

    double deviation() const { return measured - aim; }
};

/// The tints of one ink by rising nominal value, without paper and solid. Empty if paper or solid
/// is missing, on the measured side or, if aims come from the target, on its side.
struct InkTones {
    std::size_t channel = 0;
    ToneAims aims = ToneAims::Target; ///< Of process inks.
    std::vector<ToneStep> steps;
};

/// Spread of cyan, magenta and yellow at one mid-tone that all three have.
struct MidToneSpread {
    double nominal = 0;
    double spread = 0;
    std::size_t readings = 0; ///< Of the three tints.
    std::size_t patch = 0;    ///< Of the ink that is furthest from its aim.
};

/// One reading of a balanced grey, or of a tint of black.
struct Grey {
    std::size_t patch = 0;
    double tone = 0; ///< Nominal cyan or black.
    double weight = 1;
};

struct Measures {
    bool byDensity = false;      ///< Tone values are from spectra, otherwise from colours.
    std::vector<InkTones> tones; ///< Cyan, magenta, yellow, black.
    std::vector<MidToneSpread> spreads;
    std::vector<InkTones> spotTones; ///< Of each channel.

    std::vector<std::size_t> ramp; ///< Patches of one ink at 30 to 70, by rising index.
    std::vector<Grey> greys;       ///< By rising index, as is `blacks`.
    std::vector<Grey> blacks;
    /// Aim of the balanced greys, a patch each: chromaticness of the measured paper as far as no
    /// ink covers it. Empty if the paper is not known.
    std::vector<colour::Lab> greyAims;
};

/// REQUIRES: comparison.readings are filled if the options ask for any measure, and spectra are
/// loaded if tone values are to be from density.
Measures measuresOf(const Comparison& comparison, const PresetOptions& options);

/// Whether a nominal value is one of these tones.
bool isOf(Tones tones, double nominal);

} // namespace analysis
