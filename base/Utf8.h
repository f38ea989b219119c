// SPDX-License-Identifier: Apache-2.0
// UTF-8, character by character.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace base {

/// True for every code point that UTF-8 can express: up to U+10FFFF, surrogates excluded.
constexpr bool isCharacter(char32_t c) {
    return c <= 0x10FFFF && (c & 0xFFFFF800) != 0xD800;
}

/// Removes one character from the front of `text`, which must not be empty. Returns nothing and
/// leaves `text` untouched if it does not start with a valid sequence (cut off, overlong, a
/// surrogate, above U+10FFFF).
std::optional<char32_t> takeUtf8(std::string_view& text);

/// True if all of `text` is valid UTF-8. An empty text is.
bool isUtf8(std::string_view text);

/// The number of characters in valid UTF-8.
std::size_t charactersIn(std::string_view text);

/// The longest start of valid UTF-8 that has at most `most` bytes and no part of a character.
std::string_view cutUtf8(std::string_view text, std::size_t most);

/// Appends a character, for which isCharacter must be true.
void appendUtf8(std::string& text, char32_t c);

/// UTF-8 of text with one byte per character (ISO 8859-1).
std::string utf8FromLatin1(std::string_view text);

} // namespace base
