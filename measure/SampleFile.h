// SPDX-License-Identifier: Apache-2.0
// A measurement record as a text file for the analysis.
#pragma once

#include <wx/string.h>

struct measurementDataRecord;

namespace measure {

/// Writes the measurement as CGATS text. Returns -1 and leaves an empty file if there are no device
/// values. Does not report a file that can't be opened (C48).
int writeSampleFile(const wxString& path, int illuminationMode,
                    const measurementDataRecord& measurement);

} // namespace measure
