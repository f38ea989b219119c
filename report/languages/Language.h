// SPDX-License-Identifier: Apache-2.0
// The languages that pages, labels and screens are written in.
#pragma once

#include <optional>
#include <string_view>

namespace languages {

enum class Language { English, German, French, Spanish, Italian, Japanese, Chinese };

inline constexpr Language allLanguages[] = {
    Language::English, Language::German,   Language::French, Language::Spanish,
    Language::Italian, Language::Japanese, Language::Chinese};

/// Language tag as HTML's lang attribute takes it: "en", "de", "fr", "es", "it", "ja", "zh-Hans".
std::string_view tagOf(Language language);

/// The language of a locale's name or of a language tag, such as "de", "de_DE.UTF-8" or "zh-Hans".
/// Upper and lower case are equal. Nothing for a language without a table: traditional Chinese
/// (zh_TW, zh_HK, zh-Hant) is one of these.
std::optional<Language> languageNamed(std::string_view name);

/// The first of the user's preferred languages (platform/Locale.h) that has a table, otherwise
/// English.
Language languageOfUser();

} // namespace languages
