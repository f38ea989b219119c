// SPDX-License-Identifier: Apache-2.0
// Strings between wide characters (one 32-bit unit each) and 8 bits, and small helpers (C166).
#pragma once

#include <string>

namespace StringUtilsComGUI {

// The plain pair: no conversion. For text below U+0080 only; above, the two are not each other's
// inverse (C153).

/// Cuts each character to its low 8 bits.
std::string stringFromwstring(const std::wstring& text);

/// Widens each byte as a signed number: 0xFF becomes 0xFFFFFFFF.
std::wstring wstringFromstring(const std::string& text);

/// UTF-8 of a wide text, up to its first zero and of each character the low 16 bits: a pair of
/// surrogates becomes one character, a character above U+FFFF another one. Returns the length in
/// bytes; 0, with the target untouched, for a surrogate that stands alone.
std::string::size_type UnicodeToUTF8(const std::wstring& text, std::string& target);

/// The same; an empty text where it fails.
std::string UTF8FromUni(const std::wstring& text);

/// The 16-bit units of a UTF-8 text, which ends at its first zero. The target gets as many
/// characters as the text has bytes (C154): after the units of multi-byte sequences zeros
/// remain. Returns this length; 0, with the target untouched, for invalid UTF-8.
std::wstring::size_type UTF8ToUnicode(const std::string& text, std::wstring& target);

/// The same; an empty text where it fails.
std::wstring UniFromUTF8(const std::string& text);

/// As a stream reads a hexadecimal int: leading blanks and 0x are accepted, 0 without a digit, the
/// largest or smallest int beyond the range. -1 for null and for nothing but blanks.
int ConvertHexStrToInt(const char* text);

/// Lower-case hexadecimal; a negative number as its 32-bit pattern.
std::string ConvertIntToHexStr(int value);

/// To lower case in place, after LC_CTYPE. Returns the text; null is harmless.
char* lower(char* text);

} // namespace StringUtilsComGUI
