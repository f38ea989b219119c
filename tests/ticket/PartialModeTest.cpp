#include "ticket/PartialMode.h"

#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace {

/// Words "+key" insert and "-key" erase, in order.
PARTIAL_MODE modeOf(const std::string& script) {
    PARTIAL_MODE mode;
    std::istringstream words(script);
    for (std::string word; words >> word;) {
        if (word[0] == '+') {
            mode.insert(word.substr(1));
        } else {
            mode.erase(word.substr(1));
        }
    }
    return mode;
}

/// The mode's table as words; "null" where there is none.
std::string tableOf(const PARTIAL_MODE& mode) {
    const PARTIAL_TABLE table(mode);
    const char* const* key = table;
    if (key == nullptr) {
        return "null";
    }
    std::string words;
    for (; *key != nullptr; ++key) {
        words += (words.empty() ? "" : " ") + std::string(*key);
    }
    return words;
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
        {"+ab* -a*", "ab*", "abc", "a"},
        {"+ab* -ab", "ab*", "ab", "a"}, // an exact key, which was not there
        {"+abc +ab*", "ab* abc", "abc", "a"},
        {"+abc +ab* -ab*", "abc", "abc", "ab abcd"},
        {"+ab**", "ab**", "ab* ab*c", "ab abc"},
        {"+a*b", "a*b", "a*b", "ab a*bc axb"},
        {"+ab* +A +c*", "A ab* c*", "A abc cd", "B Ab"},
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
    }
}

TEST(PartialMode, TheEmptyKeyMatchesOnlyWhatIsEmpty) {
    EXPECT_FALSE(modeOf("+a +b*").multi_contains(""));
    EXPECT_TRUE(modeOf("+*").multi_contains(""));
    PARTIAL_MODE exact;
    exact.insert("");
    EXPECT_TRUE(exact.multi_contains(""));
    EXPECT_FALSE(exact.multi_contains("a"));
}

TEST(PartialMode, TakesTablesAndSetsOfKeys) {
    const char* const more[] = {"c", "d*", nullptr};
    const char* const less[] = {"", "x", "ab*", nullptr};
    const char* const nothing[] = {nullptr};
    const char* const emptyText[] = {"", nullptr};
    const std::set<std::string> keys{"x", "ab*"};
    struct Case {
        const char* name;
        void (*change)(PARTIAL_MODE&, const char* const*, const std::set<std::string>&);
        const char* const* table;
        const char* left;
    };
    const auto byTable = [](PARTIAL_MODE& mode, const char* const* table,
                            const std::set<std::string>&) { mode.set(table); };
    const Case cases[] = {
        {"added", byTable, more, "ab* c d* x y"},
        {"taken out", byTable, less, "y"},
        {"no entry", byTable, nothing, "ab* x y"},
        {"nothing to take out", byTable, emptyText, "ab* x y"},
        {"no table", byTable, nullptr, "null"},
        {"set added",
         [](PARTIAL_MODE& mode, const char* const*, const auto& set) { mode.set(set, false); },
         nullptr, "ab* x y"},
        {"set removed",
         [](PARTIAL_MODE& mode, const char* const*, const auto& set) { mode.set(set, true); },
         nullptr, "y"},
        {"empty set, added",
         [](PARTIAL_MODE& mode, const char* const*, const auto&) { mode.set({}, false); }, nullptr,
         "null"},
        {"empty set, removed",
         [](PARTIAL_MODE& mode, const char* const*, const auto&) { mode.set({}, true); }, nullptr,
         "null"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        PARTIAL_MODE mode = modeOf("+x +y +ab*");
        c.change(mode, c.table, keys);
        EXPECT_EQ(tableOf(mode), c.left);
    }
    EXPECT_EQ(tableOf(PARTIAL_MODE(nullptr)), "null");
    EXPECT_EQ(tableOf(PARTIAL_MODE(more)), "c d*");
}

TEST(PartialTable, IsASnapshot) {
    PARTIAL_MODE mode = modeOf("+ab* +A");
    const PARTIAL_TABLE table(mode);
    mode.clear();
    const char* const* keys = table;
    EXPECT_STREQ(keys[0], "A");
    EXPECT_STREQ(keys[1], "ab*");
    EXPECT_EQ(keys[2], nullptr);
}

} // namespace
