// SPDX-License-Identifier: Apache-2.0
#include "report/languages/Language.h"

#include <string>

#include "platform/CoreFoundationStrings.h"
#include "platform/Locale.h"

namespace languages {
namespace {

constexpr struct {
    Language language;
    std::string_view tag;
    std::string_view code; ///< ISO 639-1.
} names[] = {
    {Language::English, "en", "en"},      {Language::German, "de", "de"},
    {Language::French, "fr", "fr"},       {Language::Spanish, "es", "es"},
    {Language::Italian, "it", "it"},      {Language::Japanese, "ja", "ja"},
    {Language::Chinese, "zh-Hans", "zh"},
};

std::string lower(std::string_view text) {
    std::string small;
    for (const char c : text) {
        small += c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    }
    return small;
}

/// A script that is named decides; otherwise the region does.
bool isTraditional(std::string_view subtags) {
    if (subtags.find("hans") != subtags.npos) {
        return false;
    }
    for (const char* mark : {"hant", "tw", "hk", "mo"}) {
        if (subtags.find(mark) != subtags.npos) {
            return true;
        }
    }
    return false;
}

} // namespace

std::string_view tagOf(Language language) {
    return names[static_cast<std::size_t>(language)].tag;
}

std::optional<Language> languageNamed(std::string_view name) {
    const std::string locale = lower(name.substr(0, name.find_first_of(".@")));
    const std::string_view code = std::string_view(locale).substr(0, locale.find_first_of("_-"));
    for (const auto& known : names) {
        if (code == known.code) {
            return known.language == Language::Chinese &&
                           isTraditional(std::string_view(locale).substr(code.size()))
                       ? std::nullopt
                       : std::optional(known.language);
        }
    }
    return std::nullopt;
}

Language languageOfUser() {
    const platform::Owned<CFArrayRef> list(CFPreferencesCopyValue("AppleLanguages"));
    const CFIndex count = list == nullptr ? 0 : CFArrayGetCount(list.get());
    for (CFIndex i = 0; i < count; ++i) {
        char name[64];
        const auto entry = static_cast<CFStringRef>(CFArrayGetValueAtIndex(list.get(), i));
        if (CFStringGetCString(entry, name, sizeof name, kCFStringEncodingMacRoman)) {
            if (const auto language = languageNamed(name)) {
                return *language;
            }
        }
    }
    return Language::English;
}

} // namespace languages
