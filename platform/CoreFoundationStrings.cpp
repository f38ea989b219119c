#include "platform/CoreFoundationStrings.h"

#include <cstring>
#include <optional>
#include <string_view>

#include "platform/CodePage.h"

namespace {

bool isHighSurrogate(char16_t unit) {
    return (unit & 0xFC00) == 0xD800;
}

bool isLowSurrogate(char16_t unit) {
    return (unit & 0xFC00) == 0xDC00;
}

bool isCharacter(char32_t c) {
    return c <= 0x10FFFF && (c & 0xFFFFF800) != 0xD800;
}

/// Lead bytes of UTF-8 by the number of bytes that follow, and the smallest character that needs
/// as many.
constexpr struct {
    unsigned char mask;
    unsigned char lead;
    char32_t smallest;
} sequences[] = {{0x80, 0x00, 0x0}, {0xE0, 0xC0, 0x80}, {0xF0, 0xE0, 0x800}, {0xF8, 0xF0, 0x10000}};

/// Takes one character off the front of a text that is not empty.
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
            if ((next & 0xC0) != 0x80) {
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

std::optional<std::u16string> decodeUtf8(std::string_view text) {
    std::u16string units;
    units.reserve(text.size());
    while (!text.empty()) {
        const auto c = takeUtf8(text);
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

std::optional<std::string> encodeUtf8(std::u16string_view units) {
    std::string text;
    text.reserve(units.size());
    for (std::size_t i = 0; i < units.size(); ++i) {
        char32_t c = units[i];
        if (isHighSurrogate(units[i]) && i + 1 < units.size() && isLowSurrogate(units[i + 1])) {
            c = 0x10000 + ((c & 0x3FF) << 10 | (units[++i] & 0x3FF));
        }
        if (!isCharacter(c)) {
            return std::nullopt;
        }
        appendUtf8(text, c);
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
    // A surrogate pair takes four bytes, which is less than two units of three bytes each.
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
