// SPDX-License-Identifier: Apache-2.0
// The definition file for the measuring tool.
#pragma once

#include <wx/string.h>

struct KZJobDataStruct;

namespace measure {

inline constexpr const char* definitionName = "NMPatchSetDefinition.it8";

/// Creates the definition from a control-strip file, in the same folder. Uses the job's instrument,
/// illumination mode, strip number and whether the strip is dynamic. Returns the definition's path.
/// On failure returns an empty text and can leave a partial file.
wxString writeDefinition(const wxString& strip, const KZJobDataStruct& job);

} // namespace measure
