// SPDX-License-Identifier: Apache-2.0
// The measuring tool's definition of what to measure.
#pragma once

#include <wx/string.h>

struct KZJobDataStruct;

namespace measure {

inline constexpr const char* definitionName = "NMPatchSetDefinition.it8";

/// Makes the definition from a control-strip file, in the same folder. Of the job it uses the
/// instrument, the illumination mode, the strip and whether that is dynamic. Returns the
/// definition's path, or an empty text, in which case a partial file can remain.
wxString writeDefinition(const wxString& strip, const KZJobDataStruct& job);

} // namespace measure
