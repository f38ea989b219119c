// SPDX-License-Identifier: Apache-2.0
// Whether target, measurement and preset are about the same light, observer and instrument filter.
#pragma once

#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Presets.h"

namespace analysis {

/// Compares what both sides state of illuminant and observer, and what both sides and the preset
/// state of the measuring condition (M0 to M3).
///
/// A side that states no illuminant or observer counts as D50, 2 degrees. So does a side with
/// values calculated from spectra. The verdict is kept open by illuminants or observers that
/// differ, and by a measuring condition that the preset requires and does not find.
std::vector<Warning> conditionWarnings(const Comparison& comparison,
                                       const tolerancePresetParameterRecord& preset,
                                       const PresetOptions& options);

} // namespace analysis
