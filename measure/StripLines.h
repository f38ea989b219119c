// SPDX-License-Identifier: Apache-2.0
// Lines of a control strip's text file, and what they name.
#pragma once

#include <cstddef>

#include <wx/string.h>
#include <wx/textfile.h>

/// Finds the first line of the file that contains the needle. The file's current line stays there,
/// or at the file's end where there is none; then false, and *line is left alone. The system itself
/// walks strips with measure::StripText, which does the same in less memory (C171).
bool findStringInFile(wxTextFile* file, wxString needle, wxString* line);

/// The line without the control characters at its end, and with "\r\n" there.
///
/// It is cut at 511 bytes of UTF-8, so that a list of 36 spectral columns with long names arrives
/// short. A line with characters of several bytes loses one byte at its end for each byte that it
/// has more than characters, then any trailing bytes that are not ASCII (C50). A line of control
/// characters alone keeps them.
wxString StringConditioning(wxString line);

namespace measure {

/// The whole number that a line ends with, behind its first `offset` characters; 0 where that is
/// anything else.
long numberBehind(const wxString& line, std::size_t offset);

/// The instrument of a control-strip file; 0 if it names none (C49). Returns 10 if there is no such
/// file, otherwise 0.
int readDeviceID(const wxString& strip, int* deviceID);

} // namespace measure
