// Files of a job's folder.
#pragma once

#include <string>
#include <string_view>

#include <wx/string.h>

/// Whether there is a regular file of this name.
bool fileExists(const wxString& path);

/// The same, with a line in the log where there is none: the complaint, " file not found = " and
/// the path.
bool isThere(const wxString& path, const char* complaint);

/// Replaces a file's contents by a text in UTF-8, in place, so that links and devices work. False
/// where not all of it could be written.
bool writeTextFile(const std::string& path, std::wstring_view text);
