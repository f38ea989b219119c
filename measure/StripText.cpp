// SPDX-License-Identifier: Apache-2.0
#include "measure/StripText.h"

#include <algorithm>
#include <limits>
#include <string>

#include <wx/convauto.h>

#include "base/WholeFile.h"
#include "measure/Paths.h"

namespace measure {

bool StripText::read(const wxString& path) {
    if (!fileExists(path)) {
        return false;
    }
    std::string bytes;
    base::readWholeFile(pathBytes(path), std::numeric_limits<std::size_t>::max(), bytes);
    m_text = wxString(bytes.data(), wxConvAuto(), bytes.size());
    firstLine();
    return true;
}

// A line ends with CR, LF or both. Text without a line end is a line too.
std::wstring_view StripText::lineAt(std::size_t start) {
    const std::wstring_view all = text();
    m_start = start;
    const std::size_t end = std::min(all.find_first_of(L"\r\n", start), all.size());
    m_next = std::min(end + (all.substr(end, 2) == L"\r\n" ? 2 : 1), all.size());
    return all.substr(start, end - start);
}

std::wstring_view StripText::firstLine() {
    return lineAt(0);
}

std::wstring_view StripText::nextLine() {
    return lineAt(m_next);
}

bool StripText::find(const char* needle, wxString* line) {
    const std::wstring wanted(needle, needle + std::char_traits<char>::length(needle));
    // Searches the whole text, which is faster than line by line. No needle contains a line end.
    const std::wstring_view all = text();
    const std::size_t hit = all.find(wanted);
    if (hit == all.npos) {
        lineAt(all.size());
        return false;
    }
    const std::size_t before = hit == 0 ? all.npos : all.find_last_of(L"\r\n", hit - 1);
    const std::wstring_view found = lineAt(before == all.npos ? 0 : before + 1);
    line->assign(found.data(), found.size());
    return true;
}

} // namespace measure
