// SPDX-License-Identifier: Apache-2.0
// Strings of the desktop platform: UTF-16 internally, any known encoding externally.
#pragma once

#include <cstdint>
#include <string>

#include "platform/CoreFoundation.h"

namespace platform {

/// The target of a CFStringRef.
class String : public Object {
  public:
    explicit String(std::u16string text) : units(std::move(text)) {}

    const std::u16string units;
};

} // namespace platform

using CFStringRef = const platform::String*;
using CFStringEncoding = std::uint32_t;
using UniChar = char16_t;

/// Encodings that can be converted here. Japanese (1), traditional Chinese (2), Korean (3) and
/// simplified Chinese (25) can't: nothing is converted from or to them, not even ASCII.
enum : CFStringEncoding {
    kCFStringEncodingMacRoman = 0,
    kCFStringEncodingMacGreek = 6,
    kCFStringEncodingMacCyrillic = 7,
    kCFStringEncodingMacCentralEurRoman = 29,
    kCFStringEncodingMacTurkish = 35,
    kCFStringEncodingMacCroatian = 36,
    kCFStringEncodingMacRomanian = 38,
    kCFStringEncodingUTF8 = 0x08000100,
};

struct CFRange {
    CFIndex location;
    CFIndex length;
};

/// Null if the text is null or invalid in the encoding. UTF-8 is checked strictly: no surrogates,
/// no overlong forms, nothing above U+10FFFF.
CFStringRef CFStringCreateWithCString(CFAllocatorRef, const char* text, CFStringEncoding encoding);

/// Accepts any units, including zeros and lone surrogates.
CFStringRef CFStringCreateWithCharacters(CFAllocatorRef, const UniChar* units, CFIndex count);

/// Number of 16-bit units.
CFIndex CFStringGetLength(CFStringRef string);

/// Copies the units of the range, which must be inside the string.
void CFStringGetCharacters(CFStringRef string, CFRange range, UniChar* buffer);

/// Maximum bytes of a text of `length` units, without a terminator.
CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding);

/// Writes the text and a terminator. Returns false and leaves the buffer unchanged if they don't
/// fit into `size` bytes or if the encoding lacks a character.
bool CFStringGetCString(CFStringRef string, char* buffer, CFIndex size, CFStringEncoding encoding);
