// SPDX-License-Identifier: Apache-2.0
// Checks that target, measurement and preset have the same light, observer and instrument filter.
#pragma once

#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Presets.h"

namespace analysis {

/// Compares the illuminants and observers that both sides state, and the measuring conditions (M0
/// to M3) that both sides and the preset state.
///
/// If a side states no illuminant or observer, it counts as D50, 2 degrees. So does a side with
/// values calculated from spectra. The verdict stays open if illuminants or observers differ, or if
/// the preset requires a measuring condition that is not found.
std::vector<Warning> conditionWarnings(const Comparison& comparison,
                                       const tolerancePresetParameterRecord& preset,
                                       const PresetOptions& options);

} // namespace analysis
