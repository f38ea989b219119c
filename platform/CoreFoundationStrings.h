// SPDX-License-Identifier: Apache-2.0
// Strings of the desktop platform: UTF-16 inside, any known encoding outside.
#pragma once

#include <cstdint>
#include <string>

#include "platform/CoreFoundation.h"

namespace platform {

/// What a CFStringRef stands for.
class String : public Object {
  public:
    explicit String(std::u16string text) : units(std::move(text)) {}

    const std::u16string units;
};

} // namespace platform

using CFStringRef = const platform::String*;
using CFStringEncoding = std::uint32_t;
using UniChar = char16_t;

/// Encodings with a conversion here. Japanese (1), traditional Chinese (2), Korean (3) and
/// simplified Chinese (25) have none: nothing converts from or to them, not even ASCII.
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

/// Null if text is null, or not valid in the encoding. UTF-8 is taken strictly: no surrogates,
/// nothing above U+10FFFF, no longer form than needed.
CFStringRef CFStringCreateWithCString(CFAllocatorRef, const char* text, CFStringEncoding encoding);

/// Takes any units, zeros and lone surrogates included.
CFStringRef CFStringCreateWithCharacters(CFAllocatorRef, const UniChar* units, CFIndex count);

/// Number of 16-bit units.
CFIndex CFStringGetLength(CFStringRef string);

/// Copies the units of the range, which must lie within the string.
void CFStringGetCharacters(CFStringRef string, CFRange range, UniChar* buffer);

/// Bytes that a text of `length` units can need, without a terminator.
CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding);

/// Writes the text and a terminator. False, with the buffer untouched, if both don't fit into size
/// bytes or a character has no place in the encoding.
bool CFStringGetCString(CFStringRef string, char* buffer, CFIndex size, CFStringEncoding encoding);
