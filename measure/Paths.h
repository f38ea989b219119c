// SPDX-License-Identifier: Apache-2.0
// Names of files in a job's folder.
#pragma once

#include <string>

#include <wx/string.h>

namespace measure {

/// A path as the system's bytes.
std::string pathBytes(const wxString& path);

/// A name in the folder of another file.
wxString pathBeside(const wxString& path, const char* name);

/// True if the path leads to a regular file.
bool fileExists(const wxString& path);

} // namespace measure
