// SPDX-License-Identifier: Apache-2.0
// The tables of texts: complete, with the same placeholders everywhere, and what is made of them.
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "ScratchFolder.h"
#include "analysis/Criteria.h"
#include "report/Model.h"
#include "report/languages/Texts.h"

namespace {

using languages::Language;
using languages::languageNamed;
using languages::Texts;
using Json = nlohmann::json;
using Forms = std::vector<std::string>;

namespace fs = std::filesystem;

void flatten(const Json& table, const std::string& prefix, std::map<std::string, Forms>& texts) {
    for (const auto& [name, value] : table.items()) {
        const std::string key = prefix + name;
        if (value.is_string()) {
            texts[key] = {value};
        } else if (value.size() == 2 && value.contains("one") && value.contains("other")) {
            texts[key] = {value["one"], value["other"]};
        } else {
            flatten(value, key + ".", texts);
        }
    }
}

std::map<std::string, Forms> tableOf(const std::string& language) {
    std::map<std::string, Forms> texts;
    const std::string path = TINTGATE_SOURCE_DIR "/report/languages/" + language + ".json";
    flatten(Json::parse(support::contentsOf(path)), "", texts);
    return texts;
}

/// A role's case is the language's business: {roleOf} stands for {role} in another table.
std::set<std::string> placeholdersOf(const std::string& text) {
    static const std::regex placeholder(R"(\{(\w+?)(Of|In)?\})");
    std::set<std::string> names;
    for (std::sregex_iterator at(text.begin(), text.end(), placeholder), end; at != end; ++at) {
        names.insert((*at)[1]);
    }
    return names;
}

TEST(LanguageTables, HaveTheSameTextsWithTheSamePlaceholders) {
    const auto english = tableOf("en");
    ASSERT_EQ(english.size(), std::size(languages::textKeys));
    for (const char* language : {"de", "fr", "es", "it", "ja", "zh"}) {
        SCOPED_TRACE(language);
        const auto texts = tableOf(language);
        for (const auto& [key, forms] : english) {
            const auto found = texts.find(key);
            if (found == texts.end()) {
                ADD_FAILURE() << key << " is missing";
                continue;
            }
            // The form for one may write its number out.
            EXPECT_EQ(placeholdersOf(found->second.back()), placeholdersOf(forms.back())) << key;
            auto most = placeholdersOf(forms.back());
            for (const std::string& name : placeholdersOf(found->second.front())) {
                EXPECT_TRUE(most.contains(name)) << key << " has no {" << name << "} in English";
            }
            auto least = placeholdersOf(forms.front());
            least.erase("count");
            for (const std::string& name : least) {
                EXPECT_TRUE(placeholdersOf(found->second.front()).contains(name)) << key << name;
            }
            // Chinese and Japanese put no gap between sentences.
            const bool isText = forms.back().find_first_not_of(' ') != std::string::npos;
            EXPECT_FALSE(isText && found->second.back().empty()) << key;
        }
        for (const auto& [key, forms] : texts) {
            EXPECT_TRUE(english.contains(key)) << key << " is not in en.json";
        }
    }
}

/// Texts that nobody shows are a burden for six translators.
TEST(LanguageTables, HaveNoTextThatIsNotUsed) {
    std::string sources;
    for (const char* folder : {"report", "companions"}) {
        for (const auto& entry :
             fs::recursive_directory_iterator(std::string(TINTGATE_SOURCE_DIR "/") + folder)) {
            const auto extension = entry.path().extension();
            if (extension == ".cpp" || extension == ".js" || extension == ".html") {
                sources += support::contentsOf(entry.path().string());
            }
        }
    }
    // Of keys that are put together, the beginning is in the source.
    std::vector<std::string> beginnings;
    static const std::regex beginning(R"re(["`]([a-zA-Z.]+\.)(?:"|\$\{))re");
    for (std::sregex_iterator at(sources.begin(), sources.end(), beginning), end; at != end; ++at) {
        beginnings.push_back((*at)[1]);
    }
    for (const std::string_view whole : languages::textKeys) {
        const std::string key(whole.starts_with("script.") ? whole.substr(7) : whole);
        const bool used = sources.find('"' + key + '"') != sources.npos ||
                          sources.find("{{text " + key + "}}") != sources.npos ||
                          std::any_of(beginnings.begin(), beginnings.end(),
                                      [&](const std::string& b) { return key.starts_with(b); });
        EXPECT_TRUE(used) << key;
    }
}

TEST(LanguageTables, NameEveryCriterionAsTheResultDoes) {
    const Texts say(Language::English);
    for (const analysis::Criterion& criterion : analysis::criteria) {
        EXPECT_EQ(say.find("criterion." + std::string(criterion.name)), criterion.title);
    }
}

TEST(Language, IsFoundByTheNamesThatLocalesAndJobsUse) {
    const struct {
        const char* name;
        std::optional<Language> language;
    } cases[] = {
        {"en_US", Language::English},
        {"de_DE.UTF-8@euro", Language::German},
        {"FR", Language::French},
        {"es-419", Language::Spanish},
        {"it_CH.utf8", Language::Italian},
        {"ja_JP", Language::Japanese},
        {"zh_CN", Language::Chinese},
        {"zh", Language::Chinese},
        {"zh-Hans-HK", Language::Chinese},
        {"zh_TW", std::nullopt},
        {"zh-Hant", std::nullopt},
        {"C", std::nullopt},
        {"ko_KR", std::nullopt},
        {"den", std::nullopt},
        {"", std::nullopt},
    };
    for (const auto& [name, language] : cases) {
        EXPECT_EQ(languageNamed(name), language) << name;
    }
}

// Expected as CLDR 42 has it, except that numbers below 10,000 stay whole and French has "1er".
TEST(Texts, WriteNumbersAndDatesByTheHabitsOfTheLanguage) {
    const struct {
        Language language;
        const char* number;
        const char* time;
    } cases[] = {
        {Language::English, "-12,345.50", "1 May 2024, 12:34"},
        {Language::German, "-12.345,50", "1. Mai 2024, 12:34"},
        {Language::French, "-12\u202f345,50", "1er mai 2024, 12:34"},
        {Language::Spanish, "-12.345,50", "1 de mayo de 2024, 12:34"},
        {Language::Italian, "-12.345,50", "1 maggio 2024, 12:34"},
        {Language::Japanese, "-12,345.50", "2024年5月1日 12:34"},
        {Language::Chinese, "-12,345.50", "2024年5月1日 12:34"},
    };
    for (const auto& [language, number, time] : cases) {
        const Texts say(language);
        EXPECT_EQ(say.number(-12345.5, 2), number);
        EXPECT_EQ(say.time(say.day(1, 5, 2024), "12:34"), time);
        EXPECT_EQ(say.count(1617), "1617");
    }
    const Texts german(Language::German);
    EXPECT_EQ(german("count.patches", {{"count", 1u}}), "1 Messfeld");
    EXPECT_EQ(german("count.patches", {{"count", 12345u}}), "12.345 Messfelder");
    EXPECT_EQ(Texts(Language::French)("count.patches", {{"count", 0u}}), "0 plage");
}

// Sentences as libTintgate writes them.
TEST(Warnings, AreTranslatedByTheirEnglishSentences) {
    const struct {
        const char* code;
        const char* english;
        const char* german;
    } cases[] = {
        {"patchesUnpaired", "1 patch of the patch set had no counterpart.",
         "1 Messfeld der Messfeldliste hat kein Gegenstück."},
        {"patchesUnpaired", "12 patches of the measurement had no counterpart.",
         "12 Messfelder der Messung haben kein Gegenstück."},
        {"deviceSpacesDiffer",
         "The device values of the target and of the measurement are of different kinds, so "
         "nothing "
         "proves that equal labels or places mean equal patches.",
         "Die Gerätewerte der Referenz und der Messung sind verschiedener Art; nichts belegt, dass "
         "gleiche Kennungen oder Plätze gleiche Messfelder bedeuten."},
        {"calculatedFromSpectra",
         "The target states D65, 10 degrees; its colours were calculated from its spectra for D50, "
         "2 degrees instead.",
         "Angabe der Referenz: D65, 10°; die Farben wurden stattdessen aus den Spektren für D50, "
         "2° "
         "berechnet."},
        {"readerNote",
         "In the measurement: NUMBER_OF_SETS is 4, but there are 5 rows, which are used.",
         "Hinweis zu der Messung: NUMBER_OF_SETS ist 4, vorhanden sind 5 Zeilen; diese werden "
         "verwendet."},
        {"readerNote", "In the target: A remark of another version.",
         "Hinweis zu der Referenz: A remark of another version."},
        {"ofAnotherVersion", "A warning that nobody knows.", "A warning that nobody knows."},
    };
    const Texts german(Language::German);
    for (const auto& [code, english, translated] : cases) {
        const report::Warning warning{english, false, code};
        EXPECT_EQ(report::warningText(warning, german), translated);
        EXPECT_EQ(report::warningText(warning, Texts(Language::English)), english);
    }
}

} // namespace
