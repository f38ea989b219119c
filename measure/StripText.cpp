// SPDX-License-Identifier: Apache-2.0
#include "measure/StripText.h"

#include <algorithm>
#include <cerrno>
#include <string>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <wx/convauto.h>

#include "measure/Paths.h"

namespace measure {

namespace {

/// The bytes of a regular file; none if it can't be read to the length that it states.
std::string bytesOf(const wxString& path) {
    std::string bytes;
    const int file = open(pathBytes(path).c_str(), O_RDONLY | O_CLOEXEC);
    struct stat status {};
    if (file >= 0 && fstat(file, &status) == 0) {
        bytes.resize(static_cast<std::size_t>(status.st_size));
    }
    std::size_t used = 0;
    while (used < bytes.size()) {
        const ssize_t count = ::read(file, bytes.data() + used, bytes.size() - used);
        if (count == 0 || (count < 0 && errno != EINTR)) {
            break;
        }
        used += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    if (file >= 0) {
        close(file);
    }
    bytes.resize(used);
    return bytes;
}

} // namespace

bool StripText::read(const wxString& path) {
    if (!fileExists(path)) {
        return false;
    }
    const std::string bytes = bytesOf(path);
    m_text = wxString(bytes.data(), wxConvAuto(), bytes.size());
    firstLine();
    return true;
}

// A line ends at CR, LF or both. Text without an end is a line too.
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
    // Hits are searched for in the whole text, which is faster than line by line: no needle has a
    // line end in it.
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
