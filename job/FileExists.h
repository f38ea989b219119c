// SPDX-License-Identifier: Apache-2.0
// Files of a job's folder.
#pragma once

#include <wx/string.h>

/// Whether there is a regular file of this name.
bool fileExists(const wxString& path);

/// The same, with a line in the log where there is none: the complaint, " file not found = " and
/// the path.
bool isThere(const wxString& path, const char* complaint);
