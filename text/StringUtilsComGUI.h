// SPDX-License-Identifier: Apache-2.0
// Conversions between wide strings (32 bits per character) and 8-bit strings, and helpers (C166).
#pragma once

#include <string>

namespace StringUtilsComGUI {

// The plain pair converts nothing. Use it only for text below U+0080: above that, the two functions
// are not inverses of each other (C153).

/// Truncates each character to its low 8 bits.
std::string stringFromwstring(const std::wstring& text);

/// Sign-extends each byte: 0xFF becomes 0xFFFFFFFF.
std::wstring wstringFromstring(const std::string& text);

/// Converts wide text to UTF-8, up to the first zero. Uses the low 16 bits of each character: a
/// surrogate pair becomes one character, a character above U+FFFF a different one. Returns the
/// length in bytes; 0, with the target unchanged, for an unpaired surrogate.
std::string::size_type UnicodeToUTF8(const std::wstring& text, std::string& target);

/// Same, but returns the text. Returns an empty text on failure.
std::string UTF8FromUni(const std::wstring& text);

/// Converts UTF-8 text, up to the first zero, to 16-bit units. The target gets as many characters
/// as the text has bytes (C154), so zeros follow the units if the text has multi-byte sequences.
/// Returns this length. If the UTF-8 is invalid, returns 0 and leaves the target unchanged.
std::wstring::size_type UTF8ToUnicode(const std::string& text, std::wstring& target);

/// Same, but returns the text. Returns an empty text on failure.
std::wstring UniFromUTF8(const std::string& text);

/// Reads a hexadecimal int as a stream does: leading blanks and 0x are accepted, no digit gives 0,
/// overflow gives the largest or smallest int. Returns -1 for null and for only blanks.
int ConvertHexStrToInt(const char* text);

/// Lower-case hexadecimal. A negative number gives its 32-bit pattern.
std::string ConvertIntToHexStr(int value);

/// Converts to lower case in place, as LC_CTYPE defines it. Returns the text; null is allowed.
char* lower(char* text);

} // namespace StringUtilsComGUI
