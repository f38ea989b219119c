// SPDX-License-Identifier: Apache-2.0
// The tables of texts: complete, with the same placeholders everywhere, and what is made of them.
#include <filesystem>
#include <regex>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "analysis/Criteria.h"
#include "report/languages/Texts.h"

namespace {

using languages::Language;
using languages::languageNamed;
using languages::Texts;
namespace fs = std::filesystem;

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

} // namespace
