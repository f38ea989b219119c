// SPDX-License-Identifier: Apache-2.0
#include "text/LocaleSettings.h"

#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "Csv.h"

TEST(LocaleSettings, TakesTheFirstKnownLanguageOfTheUsersList) {
    for (const auto& row : support::readCsv("text/languages.csv")) {
        setenv("LANGUAGE", row[0].c_str(), 1);
        EXPECT_EQ(LocaleSettings::GetSystemLanguagewX(), std::stoi(row[1])) << row[0];
        EXPECT_EQ(LocaleSettings::GetSystemLanguageString(), row[2]) << row[0];
        EXPECT_EQ(LocaleSettings::GetMacSystemEncoding(), std::stoi(row[3])) << row[0];
    }
    // Ranges of numbers; a user's language is always the first number of a range.
    for (const auto& [number, identifier] :
         {std::pair{999, 1033}, {7, 1025}, {50, 1028}, {51, 1033}, {199, 3082}}) {
        EXPECT_EQ(LocaleSettings::GetSystemCodePage(number), identifier) << number;
    }
}

TEST(LocaleSettings, AsksTheVariablesInTheirOrder) {
    const char* const names[] = {"LANGUAGE", "LC_ALL", "LC_MESSAGES", "LANG"};
    const struct {
        const char* values[4]; ///< Null if the variable is not set.
        int number;
    } cases[] = {
        {{}, 59},
        {{nullptr, nullptr, "it_IT", "da_DK"}, 109},
        {{nullptr, "fi", "it_IT"}, 78},
        {{"", "fi"}, 78},
        {{"xx", "fi"}, 59},       // the first gives the whole list
        {{nullptr, "xx:fi"}, 59}, // only LANGUAGE is a list
    };
    for (const auto& [values, number] : cases) {
        for (int i = 0; i < 4; ++i) {
            values[i] == nullptr ? unsetenv(names[i]) : setenv(names[i], values[i], 1);
        }
        EXPECT_EQ(LocaleSettings::MacGetUserLocale(), number);
    }
}
