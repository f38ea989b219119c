// SPDX-License-Identifier: Apache-2.0
// The lines of a control strip's text file.
#pragma once

#include <cstddef>
#include <string_view>

#include <wx/string.h>

namespace measure {

/// Reads a text file line by line, with the lines, the conversion and the current line of a
/// wxTextFile opened with wxConvAuto. Keeps the text instead of a list of lines, which can be 80
/// times the file's size for short lines. Reading needs 9 bytes for each byte of the file, and the
/// text 4.
class StripText {
  public:
    /// Reads a file and moves to its first line. False if there is no regular file of this name. A
    /// file that can't be read or converted has no lines.
    bool read(const wxString& path);

    /// These return the new current line, which is empty at the end.
    std::wstring_view firstLine();
    /// REQUIRES: not atEnd().
    std::wstring_view nextLine();

    /// True if the current line is after the last one.
    bool atEnd() const { return m_start == m_text.length(); }

    /// Moves to the first line that contains the needle. If there is none, moves to the end,
    /// returns false and leaves *line unchanged.
    bool find(const char* needle, wxString* line);

  private:
    std::wstring_view text() const { return {m_text.wx_str(), m_text.length()}; }
    std::wstring_view lineAt(std::size_t start);

    wxString m_text;
    std::size_t m_start = 0; ///< Start of the current line; then of the next.
    std::size_t m_next = 0;
};

} // namespace measure
