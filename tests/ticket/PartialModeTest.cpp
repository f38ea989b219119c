// SPDX-License-Identifier: Apache-2.0
#include "ticket/PartialMode.h"

#include <sstream>

#include <gtest/gtest.h>

namespace {

/// Words "+key" insert and "-key" erase, in order.
PARTIAL_MODE modeOf(const std::string& script) {
    PARTIAL_MODE mode;
    std::istringstream words(script);
    for (std::string word; words >> word;) {
        word[0] == '+' ? mode.insert(word.substr(1)) : mode.erase(word.substr(1));
    }
    return mode;
}

/// The mode's table as words; "null" if there is none.
std::string tableOf(const PARTIAL_MODE& mode) {
    const PARTIAL_TABLE table(mode);
    std::string words;
    for (const char* const* key = table; key != nullptr && *key != nullptr; ++key) {
        words += (words.empty() ? "" : " ") + std::string(*key);
    }
    return static_cast<const char* const*>(table) == nullptr ? "null" : words;
}

TEST(PartialMode, KeepsOnePrefixOfAFamilyAndFiltersByIt) {
    struct Case {
        const char *script, *table, *hits, *misses;
    };
    const Case cases[] = {
        {"+abc* +ab* +abd*", "ab*", "ab abc abd", "a aB AB b"},
        {"+abc* +abd* +ab*", "abd*", "abd abdx", "ab abc"}, // only the first is removed
        {"+x* +*", "*", "x anything", ""},
        {"+* -x*", "null", "", "x"}, // `x` begins with the empty prefix
        {"+ab* -abc*", "null", "", "ab"},
        {"+ab* -a* -ab", "ab*", "ab abc", "a"},
        {"+abc +ab* -ab*", "abc", "abc", "ab abcd"},
        {"+ab** +a*b", "a*b ab**", "a*b ab* ab*c", "ab a*bc axb"},
        {"+ab* +A +c* +abc", "A ab* abc c*", "A abc cd", "B Ab"},
        {"+\xC3\xA4* +z*", "z* \xC3\xA4*", "\xC3\xA4x z", "\xC3"}, // bytes are ordered as unsigned
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.script);
        const PARTIAL_MODE mode = modeOf(c.script);
        EXPECT_EQ(tableOf(mode), c.table);
        EXPECT_EQ(mode.partial(), std::string(c.table) != "null");
        for (const bool hit : {true, false}) {
            std::istringstream keys(hit ? c.hits : c.misses);
            for (std::string key; keys >> key;) {
                EXPECT_EQ(mode.multi_contains(key), hit) << key;
            }
        }
    }
}

TEST(PartialMode, TakesTablesAndSetsOfKeys) {
    const char* const more[] = {"c", "d*", nullptr};
    const char* const less[] = {"", "x", "ab*", nullptr};
    const char* const nothing[] = {nullptr};
    const std::set<std::string> keys{"x", "ab*"};
    const auto after = [](auto... arguments) {
        PARTIAL_MODE mode = modeOf("+x +y +ab*");
        mode.set(arguments...);
        return tableOf(mode);
    };
    EXPECT_EQ(after(more), "ab* c d* x y");
    EXPECT_EQ(after(less), "y");
    EXPECT_EQ(after(nothing), "ab* x y");
    EXPECT_EQ(after(nullptr), "null");
    EXPECT_EQ(after(keys, true), "y");
    EXPECT_EQ(after(std::set<std::string>(), true), "null");
    EXPECT_EQ(tableOf(PARTIAL_MODE(nullptr)), "null");
}

} // namespace
