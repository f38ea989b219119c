// SPDX-License-Identifier: Apache-2.0
#include "base/WideBytes.h"

#include "base/Utf8.h"

namespace base {
namespace {

constexpr char32_t replacement = 0xFFFD;

constexpr bool isKeptByte(char32_t unit) {
    return (unit >= 0xDC80 && unit <= 0xDCFF) || unit >= 0xFFFFFF80;
}

void appendCharacter(std::string& bytes, char32_t unit) {
    appendUtf8(bytes, isCharacter(unit) ? unit : replacement);
}

} // namespace

std::wstring wideFromBytes(std::string_view bytes) {
    std::wstring text;
    text.reserve(bytes.size());
    while (!bytes.empty()) {
        if (const auto c = takeUtf8(bytes)) {
            text += static_cast<wchar_t>(*c);
        } else {
            text += static_cast<wchar_t>(0xDC00 | static_cast<unsigned char>(bytes.front()));
            bytes.remove_prefix(1);
        }
    }
    return text;
}

std::string bytesFromWide(std::wstring_view text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t wide : text) {
        const auto unit = static_cast<char32_t>(wide);
        if (isKeptByte(unit)) {
            bytes += static_cast<char>(unit & 0xFF);
        } else {
            appendCharacter(bytes, unit);
        }
    }
    return bytes;
}

std::string utf8FromWide(std::wstring_view text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t wide : text) {
        appendCharacter(bytes, static_cast<char32_t>(wide));
    }
    return bytes;
}

} // namespace base
