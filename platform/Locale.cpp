// SPDX-License-Identifier: Apache-2.0
#include "platform/Locale.h"

#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/CoreFoundationStrings.h"

namespace {

constexpr int invalidParameter = -50;

void appendLanguage(platform::Array& languages, std::string_view name) {
    const std::string language(name.substr(0, name.find_first_of(".@")));
    languages.elements.emplace_back(CFStringCreateWithCString(kCFAllocatorDefault, language.c_str(),
                                                              kCFStringEncodingMacRoman));
}

void appendLanguages(platform::Array& languages, std::string_view list) {
    for (auto end = list.find(':'); end != std::string_view::npos; end = list.find(':')) {
        appendLanguage(languages, list.substr(0, end));
        list.remove_prefix(end + 1);
    }
    appendLanguage(languages, list);
}

} // namespace

CFArrayRef CFPreferencesCopyValue(const char* key) {
    if (std::strcmp(key, "AppleLanguages") != 0) {
        return nullptr;
    }
    for (const char* name : {"LANGUAGE", "LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char* value = std::getenv(name);
        if (value == nullptr || *value == '\0') {
            continue;
        }
        auto* languages = new platform::Array;
        if (std::strcmp(name, "LANGUAGE") == 0) {
            appendLanguages(*languages, value);
        } else {
            appendLanguage(*languages, value);
        }
        return languages;
    }
    return nullptr;
}

int LocaleRefFromLocaleString(const char* text, LocaleRef* locale) {
    *locale = {};
    const std::string_view name(text);
    name.substr(0, name.find_first_of("_-")).copy(locale->language, sizeof locale->language - 1);
    return 0;
}

int LocaleRefGetPartString(const LocaleRef& locale, unsigned part, unsigned long size,
                           char* buffer) {
    const std::size_t needed = std::strlen(locale.language) + 1;
    if (part != kLocaleLanguageMask || needed > size) {
        return invalidParameter;
    }
    std::memcpy(buffer, locale.language, needed);
    return 0;
}
