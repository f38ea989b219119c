#include "text/LocaleSettings.h"

#include <cstdlib>
#include <map>
#include <string>

#include <gtest/gtest.h>

#include "Csv.h"

namespace {

/// Sets the variables that name the user's languages, and unsets the others of them.
void setLanguages(const std::map<std::string, std::string>& values) {
    for (const char* name : {"LANGUAGE", "LC_ALL", "LC_MESSAGES", "LANG"}) {
        const auto value = values.find(name);
        value == values.end() ? unsetenv(name) : setenv(name, value->second.c_str(), 1);
    }
}

TEST(LocaleSettings, TakesTheFirstKnownLanguageOfTheUsersList) {
    for (const auto& row : support::readCsv("text/languages.csv")) {
        setLanguages({{"LANGUAGE", row[0]}});
        EXPECT_EQ(LocaleSettings::GetSystemLanguagewX(), std::stoi(row[1])) << row[0];
        EXPECT_EQ(LocaleSettings::GetSystemCodePage(), std::stoi(row[2])) << row[0];
        EXPECT_EQ(LocaleSettings::GetMacSystemEncoding(), std::stoi(row[3])) << row[0];
    }
}

TEST(LocaleSettings, AsksTheVariablesInTheirOrder) {
    const std::pair<std::map<std::string, std::string>, int> cases[] = {
        {{}, 59},
        {{{"LANG", "da_DK"}}, 54},
        {{{"LC_MESSAGES", "it_IT"}, {"LANG", "da_DK"}}, 109},
        {{{"LC_ALL", "fi"}, {"LC_MESSAGES", "it_IT"}}, 78},
        {{{"LANGUAGE", ""}, {"LC_ALL", "fi"}}, 78},
        {{{"LANGUAGE", "xx"}, {"LC_ALL", "fi"}}, 59}, // the first gives the whole list
        {{{"LC_ALL", "xx:fi"}}, 59},                  // only LANGUAGE is a list
    };
    for (const auto& [values, number] : cases) {
        setLanguages(values);
        EXPECT_EQ(LocaleSettings::MacGetUserLocale(), number);
    }
    setLanguages({{"LANG", "de"}});
    EXPECT_EQ(LocaleSettings::GetSystemLanguageString(), "1031");
    EXPECT_EQ(LocaleSettings::GetSystemCodePage(-1), 1031);
}

TEST(LocaleSettings, KnowsRangesOfLanguageNumbers) {
    for (const auto& [number, identifier] :
         {std::pair{999, 1033}, {7, 1025}, {50, 1028}, {51, 1033}, {84, 1036}, {199, 3082}}) {
        EXPECT_EQ(LocaleSettings::GetSystemCodePage(number), identifier) << number;
    }
}

} // namespace
