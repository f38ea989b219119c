// SPDX-License-Identifier: Apache-2.0
// Text files of control strips, line by line, as the definition for the measuring tool is made from
// them.
#pragma once

#include <cstddef>
#include <string>

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

inline constexpr const char* definitionName = "NMPatchSetDefinition.it8";

/// A file of this name in the folder of another one.
wxString pathBeside(const wxString& path, const char* name);

/// A path as the bytes that the system knows it by.
std::string pathBytes(const wxString& path);

/// The whole number that a line ends with, behind its first `offset` characters; 0 where that is
/// anything else.
long numberBehind(const wxString& line, std::size_t offset);

} // namespace measure
