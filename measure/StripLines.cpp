// SPDX-License-Identifier: Apache-2.0
#include "measure/StripLines.h"

#include <algorithm>
#include <limits>
#include <string>
#include <string_view>

#include "base/Utf8.h"
#include "measure/StripText.h"

namespace {

constexpr std::size_t longestLine = 511; ///< Maximum bytes of a conditioned line.
constexpr int noSuchFile = 10;           ///< Result code.

} // namespace

bool findStringInFile(wxTextFile* file, wxString needle, wxString* line) {
    for (const wxString* text = &file->GetFirstLine(); !file->Eof(); text = &file->GetNextLine()) {
        if (text->Contains(needle)) {
            *line = *text;
            return true;
        }
    }
    return false;
}

// The loop starts at a character index but inspects bytes (C50).
wxString StringConditioning(wxString line) {
    const std::string utf8 = line.utf8_string();
    // Up to a NUL, and never half a character.
    std::string bytes(
        base::cutUtf8(std::string_view(utf8).substr(0, utf8.find('\0')), longestLine));
    for (std::size_t end = std::min(line.length(), longestLine); end > 0; --end) {
        const bool isText = end <= bytes.size() && static_cast<signed char>(bytes[end - 1]) > 31;
        if (isText) {
            bytes.resize(end);
            break;
        }
    }
    return wxString::FromUTF8(bytes) + "\r\n";
}

long measure::numberBehind(const wxString& line, std::size_t offset) {
    long number = 0;
    // ToLong stores a number even if other text follows it.
    return line.Mid(offset).BeforeFirst('\n').ToLong(&number, 10) ? number : 0;
}

int measure::readDeviceID(const wxString& strip, int* deviceID) {
    *deviceID = 0;
    StripText text;
    if (!text.read(strip)) {
        return noSuchFile;
    }
    wxString line;
    constexpr std::size_t afterKeyword = 6;
    if (text.find("DEVICE", &line)) {
        const long number = numberBehind(line, afterKeyword);
        using Limits = std::numeric_limits<int>;
        *deviceID = number < Limits::min() || number > Limits::max() ? 0 : static_cast<int>(number);
    }
    return 0;
}
