// SPDX-License-Identifier: Apache-2.0
// The members of a result that are there only if a preset asks for them.
#pragma once

#include "analysis/Comparison.h"
#include "analysis/JsonWriter.h"
#include "analysis/Measures.h"
#include "analysis/Presets.h"

namespace analysis {

/// Options of tone values, greys and paper, within the preset's object.
void writeMeasureOptions(JsonWriter& json, const PresetOptions& options);

/// "each": the patches of `spread` one by one, within the object of the repeats.
void writeRepeatedPatches(JsonWriter& json, const RepeatSpread& spread);

/// "papers", and as far as the options ask for them "tones", "spotTones" and "greys".
void writeMeasures(JsonWriter& json, const Comparison& comparison, const Measures& measures,
                   const PresetOptions& options);

} // namespace analysis
