// SPDX-License-Identifier: Apache-2.0
// A measurement record as a text file for the analysis.
#pragma once

#include <wx/string.h>

struct measurementDataRecord;

namespace measure {

/// Writes the measurement as CGATS text. -1 without device values, with an empty file left; a file
/// that can't be opened is not reported (C48).
int writeSampleFile(const wxString& path, int illuminationMode,
                    const measurementDataRecord& measurement);

} // namespace measure
