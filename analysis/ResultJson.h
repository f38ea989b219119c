// SPDX-License-Identifier: Apache-2.0
// The result of a comparison as JSON text. docs/result.md and docs/result.schema.json describe it.
#pragma once

#include <string>

#include "analysis/Comparison.h"
#include "analysis/JsonWriter.h"
#include "analysis/Judgement.h"
#include "job/AnalysisLibrary.h"

namespace analysis {

/// ASCII JSON with a line end. Equal inputs give equal text.
std::wstring resultJson(const Comparison& comparison, const Judgement& judgement,
                        const tolerancePresetParameterRecord& preset, const PresetOptions& options);

/// Writes the members from "verdict" to "warnings" into the object that `json` is writing: the
/// result without patches and lists of patches.
void writeFindings(JsonWriter& json, const Comparison& comparison, const Judgement& judgement,
                   const tolerancePresetParameterRecord& preset, const PresetOptions& options);

} // namespace analysis
