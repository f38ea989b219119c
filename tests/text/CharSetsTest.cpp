// SPDX-License-Identifier: Apache-2.0
#include "text/CharSets.h"

#include <memory>

#include <gtest/gtest.h>

using namespace std::string_literals;

TEST(CharSets, EscapesEachCharacterBehindTheLastReplacement) {
    const std::pair<std::string, std::string> cases[] = {
        {"&\"", "&&quot;"}, // the ampersand lies in front of the quote
        {"\"&'<>", "&quot;&amp;&apos;&lt;&gt;"},
        {"'&>&<", "'&amp;>&amp;&lt;"},
        {"\xC4\xD6\xDC\xDF\xE4\xF6\xFC", "&#196;&#214;&#220;&#223;&#228;&#246;&#252;"},
        {"x\0\"y"s, "x\0&quot;y"s},
    };
    for (const auto& [text, escaped] : cases) {
        std::string changed = text;
        CharSets::ReplaceConflictingXMLDataInString(changed);
        EXPECT_EQ(changed, escaped);
    }
}

TEST(CharSets, FindsMultiByteSequences) {
    for (const char* text :
         {"a\xC3\xA4", "\xE2\x82\xAC", "\xF2\x80\x80\x80", "\xFE\x80\x80\x80", "\xC4\xC3\xA4"}) {
        EXPECT_TRUE(CharSets::IsUtf8Coded(text)) << text;
    }
    for (const char* text :
         {"", "ASCII", "\xC4", "\xE2\x82x", "\x80\x80", "\xF0\x9F\x98", "\xF1\x80\x80\x80"}) {
        EXPECT_FALSE(CharSets::IsUtf8Coded(text)) << text;
    }
    EXPECT_FALSE(CharSets::IsUtf8Coded("\0\xC3\xA4"s)); // after the terminator
}

TEST(CharSets, CopiesWithinBounds) {
    char field[8] = "ZZZZZZZ";
    EXPECT_EQ(CharSets::stracpy(field, "ab", 5), field);
    EXPECT_EQ(std::string(field, 8), "ab\0\0\0ZZ\0"s); // the rest of the field is zero
    CharSets::Win2Utf8(field, "abcdefgh", 4);
    CharSets::Utf82Win(field, "X", 0);
    EXPECT_EQ(std::string(field, 8), "abc\0\0ZZ\0"s);

    // Any method but the first is new[], which a sanitizer distinguishes from malloc.
    const std::unique_ptr<char[]> copy(
        CharSets::DuplicateAndConvert("\xE4 b", CharSets::WIN2UTF8, CharSets::ALLOC_METHOD(7)));
    EXPECT_STREQ(copy.get(), "\xE4 b");
}

TEST(FilterString, AppliesRulesInTheirOrder) {
    CharSets::FilterString only(false);
    only.setBypass('a', 'c');
    only.setBypass("\xE4");
    EXPECT_EQ(only("abcd\xE4\xF6"), "abc\xE4");

    CharSets::FilterString all(true);
    all.setRemove('\x80', '\xFF'); // unsigned, so not an inverted range
    all.setReplace('x', 'z', '.');
    all.setReplace("qr", '\0');
    all.setRemove('9', '0'); // inverted range
    all.setBypass("z");
    EXPECT_EQ(all("a0q9\xE4xyz\xFF"), "a09..z");
}
