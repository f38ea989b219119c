// UTF-8, character by character.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

/// What UTF-8 can express: up to U+10FFFF, and no surrogate.
constexpr bool isCharacter(char32_t c) {
    return c <= 0x10FFFF && (c & 0xFFFFF800) != 0xD800;
}

/// Takes one character off the front of a text, which must not be empty. Nothing, with the text
/// untouched, where no valid sequence starts: cut off, a character in a longer form than it needs,
/// or none at all.
std::optional<char32_t> takeUtf8(std::string_view& text);

void appendUtf8(std::string& text, char32_t c);

} // namespace platform
