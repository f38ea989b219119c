// SPDX-License-Identifier: Apache-2.0
#include "platform/CodePage.h"

#include <algorithm>

#include <unicode/ucnv.h>

#include "base/SharedObject.h"

namespace platform {
namespace {

constexpr std::size_t upperSize = 128;

// ICU has no converter for these two. Source: CROATIAN.TXT and ROMANIAN.TXT, published by the
// Unicode Consortium under MAPPINGS/VENDORS.
constexpr std::u16string_view croatian = u"ÄÅÇÉÑÖÜáàâäãåçéèêëíìîïñóòôöõúùûü"
                                         u"†°¢£§•¶ß®Š™´¨≠ŽØ∞±≤≥∆µ∂∑∏š∫ªºΩžø"
                                         u"¿¡¬√ƒ≈Ć«Č…\u00A0ÀÃÕŒœĐ—“”‘’÷◊\uF8FF©⁄€‹›Æ»"
                                         u"–·‚„‰ÂćÁčÈÍÎÏÌÓÔđÒÚÛÙıˆ˜¯πË˚¸Êæˇ";
constexpr std::u16string_view romanian = u"ÄÅÇÉÑÖÜáàâäãåçéèêëíìîïñóòôöõúùûü"
                                         u"†°¢£§•¶ß®©™´¨≠ĂȘ∞±≤≥¥µ∂∑∏π∫ªºΩăș"
                                         u"¿¡¬√ƒ≈∆«»…\u00A0ÀÃÕŒœ–—“”‘’÷◊ÿŸ⁄€‹›Țț"
                                         u"‡·‚„‰ÂÊÁËÈÍÎÏÌÓÔ\uF8FFÒÚÛÙıˆ˜¯˘˙˚¸˝˛ˇ";
static_assert(croatian.size() == upperSize && romanian.size() == upperSize);

// ICU's function names include its version; its headers hide that behind macros.
#define TINTGATE_TEXT(name) #name
#define TINTGATE_FIND(function, name)                                                              \
    decltype(&name) function = nullptr;                                                            \
    library.find(TINTGATE_TEXT(name), function)

/// The upper half of a converter, or nothing. The library stays open because it has its own caches.
std::u16string upperFromIcu(const char* converter) {
    const base::SharedObject library("libicuuc.so." U_ICU_VERSION_SHORT);
    TINTGATE_FIND(open, ucnv_open);
    TINTGATE_FIND(toUChars, ucnv_toUChars);
    TINTGATE_FIND(close, ucnv_close);
    if (open == nullptr || toUChars == nullptr || close == nullptr) {
        return {};
    }
    char bytes[upperSize];
    for (std::size_t i = 0; i < upperSize; ++i) {
        bytes[i] = static_cast<char>(0x80 + i);
    }
    UErrorCode status = U_ZERO_ERROR;
    UConverter* const table = open(converter, &status);
    std::u16string upper(upperSize, u'\0');
    const int length = toUChars(table, upper.data(), upperSize, bytes, upperSize, &status);
    close(table);
    return U_SUCCESS(status) && length == upperSize ? upper : std::u16string();
}

#undef TINTGATE_FIND
#undef TINTGATE_TEXT

} // namespace

const CodePage* CodePage::find(CFStringEncoding encoding) {
    static const CodePage pages[] = {
        {kCFStringEncodingMacRoman, "macos-0_2-10.2"},
        {kCFStringEncodingMacGreek, "macos-6_2-10.4"},
        {kCFStringEncodingMacCyrillic, "macos-7_3-10.2"},
        {kCFStringEncodingMacCentralEurRoman, "macos-29-10.2"},
        {kCFStringEncodingMacTurkish, "macos-35-10.2"},
        {kCFStringEncodingMacCroatian, croatian},
        {kCFStringEncodingMacRomanian, romanian},
    };
    const auto page = std::find_if(std::begin(pages), std::end(pages),
                                   [&](const CodePage& p) { return p.m_encoding == encoding; });
    return page == std::end(pages) ? nullptr : page;
}

std::u16string_view CodePage::upper() const {
    if (m_converter != nullptr) {
        std::call_once(m_loaded, [this] { m_upper = upperFromIcu(m_converter); });
    }
    return m_upper;
}

std::optional<std::u16string> CodePage::decode(std::string_view bytes) const {
    std::u16string units;
    units.reserve(bytes.size());
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80) {
            units += static_cast<char16_t>(byte);
        } else if (const auto half = upper(); !half.empty()) {
            units += half[byte - 0x80];
        } else {
            return std::nullopt;
        }
    }
    return units;
}

std::optional<std::string> CodePage::encode(std::u16string_view units) const {
    std::string bytes;
    bytes.reserve(units.size());
    for (const char16_t unit : units) {
        if (unit < 0x80) {
            bytes += static_cast<char>(unit);
        } else if (const auto at = upper().find(unit); at != std::u16string_view::npos) {
            bytes += static_cast<char>(0x80 + at);
        } else {
            return std::nullopt;
        }
    }
    return bytes;
}

} // namespace platform
