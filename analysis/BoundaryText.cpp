// SPDX-License-Identifier: Apache-2.0
#include "analysis/BoundaryText.h"

#include <cstdint>

namespace analysis {
namespace {

constexpr std::uint32_t replacement = 0xFFFD;

bool isCharacter(std::uint32_t unit) {
    return unit < 0xD800 || (unit > 0xDFFF && unit <= 0x10FFFF);
}

/// A byte that was kept through wide text.
bool isEscapedByte(std::uint32_t unit) {
    return (unit >= 0xDC80 && unit <= 0xDCFF) || unit >= 0xFFFFFF80;
}

void appendUtf8(std::string& bytes, std::uint32_t c) {
    if (c < 0x80) {
        bytes += static_cast<char>(c);
    } else if (c < 0x800) {
        bytes += static_cast<char>(0xC0 | c >> 6);
        bytes += static_cast<char>(0x80 | (c & 0x3F));
    } else if (c < 0x10000) {
        bytes += static_cast<char>(0xE0 | c >> 12);
        bytes += static_cast<char>(0x80 | (c >> 6 & 0x3F));
        bytes += static_cast<char>(0x80 | (c & 0x3F));
    } else {
        bytes += static_cast<char>(0xF0 | c >> 18);
        bytes += static_cast<char>(0x80 | (c >> 12 & 0x3F));
        bytes += static_cast<char>(0x80 | (c >> 6 & 0x3F));
        bytes += static_cast<char>(0x80 | (c & 0x3F));
    }
}

} // namespace

int decodeUtf8(const char*& from, const char* end) {
    const auto lead = static_cast<unsigned char>(*from++);
    if (lead < 0x80) {
        return lead;
    }
    const int more = lead >= 0xF0 ? 3 : lead >= 0xE0 ? 2 : 1;
    if (lead < 0xC2 || lead > 0xF4 || end - from < more) {
        return -1;
    }
    std::uint32_t c = lead & (0x3Fu >> more);
    for (int i = 0; i < more; ++i) {
        const auto byte = static_cast<unsigned char>(from[i]);
        if ((byte & 0xC0) != 0x80) {
            return -1;
        }
        c = c << 6 | (byte & 0x3F);
    }
    constexpr std::uint32_t smallest[] = {0, 0x80, 0x800, 0x10000};
    if (c < smallest[more] || !isCharacter(c)) {
        return -1;
    }
    from += more;
    return static_cast<int>(c);
}

std::wstring widened(std::string_view bytes) {
    std::wstring text;
    text.reserve(bytes.size());
    const char* from = bytes.data();
    const char* const end = from + bytes.size();
    while (from != end) {
        const char* const at = from;
        const int c = decodeUtf8(from, end);
        text += static_cast<wchar_t>(c >= 0 ? c : 0xDC00 | static_cast<unsigned char>(*at));
    }
    return text;
}

std::string narrowed(std::wstring_view text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t w : text) {
        const auto unit = static_cast<std::uint32_t>(w);
        if (isEscapedByte(unit)) {
            bytes += static_cast<char>(unit & 0xFF);
        } else {
            appendUtf8(bytes, isCharacter(unit) ? unit : replacement);
        }
    }
    return bytes;
}

std::string documentText(std::wstring_view text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t w : text) {
        const auto unit = static_cast<std::uint32_t>(w);
        appendUtf8(bytes, isCharacter(unit) ? unit : replacement);
    }
    return bytes;
}

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view blanks = " \t\r\n";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

} // namespace analysis
