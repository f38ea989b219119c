// SPDX-License-Identifier: Apache-2.0
#include "platform/CoreFoundationStrings.h"

#include <cstring>
#include <optional>
#include <string_view>

#include "base/Utf8.h"
#include "platform/CodePage.h"

namespace {

bool isHighSurrogate(char16_t unit) {
    return (unit & 0xFC00) == 0xD800;
}

bool isLowSurrogate(char16_t unit) {
    return (unit & 0xFC00) == 0xDC00;
}

std::optional<std::u16string> decodeUtf8(std::string_view text) {
    std::u16string units;
    units.reserve(text.size());
    while (!text.empty()) {
        const auto c = base::takeUtf8(text);
        if (!c) {
            return std::nullopt;
        }
        if (*c < 0x10000) {
            units += static_cast<char16_t>(*c);
        } else {
            units += static_cast<char16_t>(0xD7C0 + (*c >> 10));
            units += static_cast<char16_t>(0xDC00 | (*c & 0x3FF));
        }
    }
    return units;
}

std::optional<std::string> encodeUtf8(std::u16string_view units) {
    std::string text;
    text.reserve(units.size());
    for (std::size_t i = 0; i < units.size(); ++i) {
        char32_t c = units[i];
        if (isHighSurrogate(units[i]) && i + 1 < units.size() && isLowSurrogate(units[i + 1])) {
            c = 0x10000 + ((c & 0x3FF) << 10 | (units[++i] & 0x3FF));
        }
        if (!base::isCharacter(c)) {
            return std::nullopt;
        }
        base::appendUtf8(text, c);
    }
    return text;
}

std::optional<std::u16string> decode(std::string_view bytes, CFStringEncoding encoding) {
    if (encoding == kCFStringEncodingUTF8) {
        return decodeUtf8(bytes);
    }
    const auto* page = platform::CodePage::find(encoding);
    return page == nullptr ? std::nullopt : page->decode(bytes);
}

std::optional<std::string> encode(std::u16string_view units, CFStringEncoding encoding) {
    if (encoding == kCFStringEncodingUTF8) {
        return encodeUtf8(units);
    }
    const auto* page = platform::CodePage::find(encoding);
    return page == nullptr ? std::nullopt : page->encode(units);
}

} // namespace

CFStringRef CFStringCreateWithCString(CFAllocatorRef, const char* text, CFStringEncoding encoding) {
    auto units = text == nullptr ? std::nullopt : decode(text, encoding);
    return units ? new platform::String(*std::move(units)) : nullptr;
}

CFStringRef CFStringCreateWithCharacters(CFAllocatorRef, const UniChar* units, CFIndex count) {
    return new platform::String(std::u16string(units, static_cast<std::size_t>(count)));
}

CFIndex CFStringGetLength(CFStringRef string) {
    return static_cast<CFIndex>(string->units.size());
}

void CFStringGetCharacters(CFStringRef string, CFRange range, UniChar* buffer) {
    string->units.copy(buffer, static_cast<std::size_t>(range.length),
                       static_cast<std::size_t>(range.location));
}

CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding) {
    // A surrogate pair takes four bytes, fewer than the six of two three-byte units.
    return encoding == kCFStringEncodingUTF8 ? length * 3 : length;
}

bool CFStringGetCString(CFStringRef string, char* buffer, CFIndex size, CFStringEncoding encoding) {
    const auto bytes = encode(string->units, encoding);
    if (!bytes || static_cast<CFIndex>(bytes->size()) >= size) {
        return false;
    }
    std::memcpy(buffer, bytes->c_str(), bytes->size() + 1);
    return true;
}
