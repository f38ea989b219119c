// SPDX-License-Identifier: Apache-2.0
#include "base/Utf8.h"

#include <algorithm>
#include <iterator>

namespace base {
namespace {

/// Lead bytes by the number of bytes that follow, each with the smallest character that needs this
/// many.
constexpr struct {
    unsigned char mask;
    unsigned char lead;
    char32_t smallest;
} sequences[] = {{0x80, 0x00, 0x0}, {0xE0, 0xC0, 0x80}, {0xF0, 0xE0, 0x800}, {0xF8, 0xF0, 0x10000}};

constexpr bool continues(char byte) {
    return (byte & 0xC0) == 0x80;
}

} // namespace

std::optional<char32_t> takeUtf8(std::string_view& text) {
    const auto lead = static_cast<unsigned char>(text.front());
    for (std::size_t following = 0; following < std::size(sequences); ++following) {
        const auto& form = sequences[following];
        if ((lead & form.mask) != form.lead) {
            continue;
        }
        if (text.size() <= following) {
            return std::nullopt;
        }
        char32_t c = lead & static_cast<unsigned char>(~form.mask);
        for (const char next : text.substr(1, following)) {
            if (!continues(next)) {
                return std::nullopt;
            }
            c = c << 6 | (next & 0x3F);
        }
        if (c < form.smallest || !isCharacter(c)) {
            return std::nullopt;
        }
        text.remove_prefix(following + 1);
        return c;
    }
    return std::nullopt;
}

bool isUtf8(std::string_view text) {
    while (!text.empty()) {
        if (!takeUtf8(text)) {
            return false;
        }
    }
    return true;
}

std::size_t charactersIn(std::string_view text) {
    return static_cast<std::size_t>(
        std::count_if(text.begin(), text.end(), [](char byte) { return !continues(byte); }));
}

std::string_view cutUtf8(std::string_view text, std::size_t most) {
    if (text.size() <= most) {
        return text;
    }
    while (most > 0 && continues(text[most])) {
        --most;
    }
    return text.substr(0, most);
}

void appendUtf8(std::string& text, char32_t c) {
    std::size_t following = std::size(sequences) - 1;
    while (c < sequences[following].smallest) {
        --following;
    }
    text += static_cast<char>(sequences[following].lead | c >> 6 * following);
    while (following-- > 0) {
        text += static_cast<char>(0x80 | (c >> 6 * following & 0x3F));
    }
}

std::string utf8FromLatin1(std::string_view text) {
    std::string utf8;
    for (const char c : text) {
        appendUtf8(utf8, static_cast<unsigned char>(c));
    }
    return utf8;
}

} // namespace base
