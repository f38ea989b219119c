// SPDX-License-Identifier: Apache-2.0
// Lines of a control strip's text file and their values.
#pragma once

#include <cstddef>

#include <wx/string.h>
#include <wx/textfile.h>

/// Finds the first line of the file that contains the needle, and makes it the file's current line.
/// If there is none, moves to the file's end, returns false and leaves *line unchanged. The system
/// itself uses measure::StripText, which does the same with less memory (C171).
bool findStringInFile(wxTextFile* file, wxString needle, wxString* line);

/// Removes trailing control characters and appends "\r\n".
///
/// The line is cut at 511 bytes of UTF-8, so a list of 36 spectral columns with long names is cut
/// off. Drops one trailing byte for each multi-byte surplus, then any trailing non-ASCII bytes
/// (C50). A line of only control characters keeps them.
wxString StringConditioning(wxString line);

namespace measure {

/// The integer at the end of a line, after its first `offset` characters. 0 if there is anything
/// else.
long numberBehind(const wxString& line, std::size_t offset);

/// The instrument of a control-strip file, or 0 if it names none (C49). Returns 10 if there is no
/// such file, otherwise 0.
int readDeviceID(const wxString& strip, int* deviceID);

} // namespace measure
