// SPDX-License-Identifier: Apache-2.0
// The lines of a control strip's text file.
#pragma once

#include <cstddef>
#include <string_view>

#include <wx/string.h>

namespace measure {

/// A text file that is walked line by line, with the lines, the conversion and the current line of
/// a wxTextFile opened with wxConvAuto. It keeps the text and no list of lines, which for a file of
/// short lines is 80 times as large as the file: reading takes 9 bytes for each byte of the file,
/// and keeping the text 4.
class StripText {
  public:
    /// Reads a file; its first line becomes the current one. False if there is no regular file of
    /// this name. A file that can't be read or converted has no lines.
    bool read(const wxString& path);

    /// These return the new current line. It is empty at the end.
    std::wstring_view firstLine();
    /// REQUIRES: not atEnd().
    std::wstring_view nextLine();

    /// True if the current line is the one that follows the last.
    bool atEnd() const { return m_start == m_text.length(); }

    /// Makes the first line that contains the needle the current one, or the end if there is none;
    /// then returns false and leaves *line alone.
    bool find(const char* needle, wxString* line);

  private:
    std::wstring_view text() const { return {m_text.wx_str(), m_text.length()}; }
    std::wstring_view lineAt(std::size_t start);

    wxString m_text;
    std::size_t m_start = 0; ///< Of the current line, and of the line that follows it.
    std::size_t m_next = 0;
};

} // namespace measure
