// SPDX-License-Identifier: Apache-2.0
// The two text forms at the library's boundary: bytes as the file system has them, and wide text of
// one 32-bit unit a character.
#pragma once

#include <string>
#include <string_view>

namespace analysis {

/// UTF-8 to wide text. Each byte that is no part of valid UTF-8 becomes U+DC80 to U+DCFF, so that
/// narrowed() gives back the same bytes whatever they were.
std::wstring widened(std::string_view bytes);

/// The reverse of widened(). U+DC80 to U+DCFF, and 0xFFFFFF80 to 0xFFFFFFFF as other converters
/// make of such bytes, become their low byte; other units that are no character become U+FFFD.
std::string narrowed(std::wstring_view text);

/// Wide text as valid UTF-8, for documents: all units that are no character become U+FFFD.
std::string documentText(std::wstring_view text);

/// Reads one character of UTF-8 at `from` (before `end`) and moves `from` behind it. Gives -1 and
/// moves by one byte where the bytes are not valid: overlong, a surrogate, beyond U+10FFFF, cut
/// off.
int decodeUtf8(const char*& from, const char* end);

/// The text without the blanks, tabs and line ends around it.
std::string_view trimmed(std::string_view text);

} // namespace analysis
