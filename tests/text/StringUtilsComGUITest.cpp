// SPDX-License-Identifier: Apache-2.0
#include "text/StringUtilsComGUI.h"

#include <climits>

#include <gtest/gtest.h>

using namespace std::string_literals;
namespace utils = StringUtilsComGUI;

TEST(StringUtilsComGUI, NarrowsAndWidensWithoutConversion) {
    EXPECT_EQ(utils::stringFromwstring(L"a\u0141\u00FF\0b"s), "aA\xFF\0b"s);
    EXPECT_EQ(utils::wstringFromstring("a\0\xFF"s), (L"a\0"s + wchar_t(0xFFFFFFFF)));
}

TEST(StringUtilsComGUI, ConvertsWideTextToUtf8) {
    const std::pair<std::wstring, std::string> cases[] = {
        {L"aä€", "aä€"},           {{0xD83D, 0xDE00}, "\U0001F600"}, // a pair is one character,
        {L"\U0001F600", "\uF600"},                                   // above 16 bits: truncated
        {L"a\U00010000b", "a"},    {{L'a', 0xD83D}, "old"},
    };
    for (const auto& [text, expected] : cases) {
        std::string target = "old";
        EXPECT_EQ(utils::UnicodeToUTF8(text, target), expected == "old" ? 0 : expected.size());
        EXPECT_EQ(target, expected);
    }
}

TEST(StringUtilsComGUI, ConvertsUtf8ToAsManyCharactersAsBytes) {
    const std::pair<std::string, std::wstring> cases[] = {
        {"aäb", L"aäb\0"s},           {"\U0001F600", {0xD83D, 0xDE00, 0, 0}},
        {"a\0b"s, L"a\0\0"s},         {"\xED\xA0\x80", L"old"}, // a surrogate
        {"\xF4\x90\x80\x80", L"old"}, {"\xC0\x80", L"old"},
    };
    for (const auto& [text, expected] : cases) {
        std::wstring target = L"old";
        EXPECT_EQ(utils::UTF8ToUnicode(text, target), expected == L"old" ? 0 : text.size());
        EXPECT_EQ(target, expected);
    }
}

TEST(StringUtilsComGUI, ReadsAndWritesHexadecimal) {
    const std::pair<const char*, int> cases[] = {
        {nullptr, -1}, {" 0x1F", 31}, {"12xyz", 18}, {"-10", -16},
        {"zz", 0},     {" ", -1},     {"ff 1", 255}, {"80000000", INT_MAX},
    };
    for (const auto& [text, value] : cases) {
        EXPECT_EQ(utils::ConvertHexStrToInt(text), value) << (text ? text : "null");
    }
    EXPECT_EQ(utils::ConvertIntToHexStr(-1), "ffffffff");
}
