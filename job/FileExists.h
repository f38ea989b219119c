// SPDX-License-Identifier: Apache-2.0
// Files of a job's folder.
#pragma once

#include <wx/string.h>

/// Whether the path is a regular file.
bool fileExists(const wxString& path);

/// Same. If there is no such file, logs the complaint, " file not found = " and the path.
bool isThere(const wxString& path, const char* complaint);
