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

/// The mode's table as words; "null" where there is none.
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
        const char* script;
        const char* table;
        const char* hits;
        const char* misses;
    };
    const Case cases[] = {
        {"", "null", "", "a"},
        {"+ab* +abc*", "ab*", "ab abc abd", "a aB AB b"},
        {"+abc* +ab*", "ab*", "ab abc abd", "a"},
        {"+abc* +abd* +ab*", "abd*", "abd abdx", "ab abc"}, // the first alone gives way
        {"+abc* +abd* +*", "abd*", "abd", "abc x"},
        {"+x* +*", "*", "x anything", ""},
        {"+* +x*", "*", "x anything", ""},
        {"+* -x*", "null", "", "x"}, // the empty prefix is what `x` begins with
        {"+ab* -abc*", "null", "", "ab"},
        {"+ab* -a* -ab", "ab*", "ab abc", "a"},
        {"+abc +ab* -ab*", "abc", "abc", "ab abcd"},
        {"+ab**", "ab**", "ab* ab*c", "ab abc"},
        {"+a*b", "a*b", "a*b", "ab a*bc axb"},
        {"+ab* +A +c* +abc", "A ab* abc c*", "A abc cd", "B Ab"},
        {"+\xC3\xA4* +z*", "z* \xC3\xA4*", "\xC3\xA4x z", "\xC3"}, // bytes order unsigned
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.script);
        const PARTIAL_MODE mode = modeOf(c.script);
        EXPECT_EQ(tableOf(mode), c.table);
        EXPECT_EQ(mode.partial(), std::string(c.table) != "null");
        std::string key;
        for (std::istringstream hits(c.hits); hits >> key;) {
            EXPECT_TRUE(mode.multi_contains(key)) << key;
        }
        for (std::istringstream misses(c.misses); misses >> key;) {
            EXPECT_FALSE(mode.multi_contains(key)) << key;
        }
        EXPECT_EQ(mode.multi_contains(""), std::string(c.table) == "*");
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
    EXPECT_EQ(after(keys, false), "ab* x y");
    EXPECT_EQ(after(keys, true), "y");
    EXPECT_EQ(after(std::set<std::string>(), false), "null");
    EXPECT_EQ(after(std::set<std::string>(), true), "null");
    EXPECT_EQ(tableOf(PARTIAL_MODE(nullptr)), "null");
    EXPECT_EQ(tableOf(PARTIAL_MODE(more)), "c d*");
}

} // namespace
