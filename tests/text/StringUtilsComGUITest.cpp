#include "text/StringUtilsComGUI.h"

#include <climits>

#include <gtest/gtest.h>

using namespace std::string_literals;

namespace {

namespace utils = StringUtilsComGUI;

TEST(StringUtilsComGUI, NarrowsAndWidensWithoutConversion) {
    EXPECT_EQ(utils::stringFromwstring(L"a\u0141\u00FF\0b"s), "aA\xFF\0b"s);
    const std::wstring wide = utils::wstringFromstring("a\0\xFF"s);
    ASSERT_EQ(wide.size(), 3U);
    EXPECT_EQ(static_cast<unsigned>(wide[2]), 0xFFFFFFFFU);
    EXPECT_EQ(utils::stringFromwstring(wide), "a\0\xFF"s);
}

TEST(StringUtilsComGUI, ConvertsWideTextToUtf8) {
    const struct {
        std::wstring text;
        std::size_t result;
        std::string target;
    } cases[] = {
        {L"", 0, ""},
        {L"aä€", 6, "aä€"},
        {{0xD83D, 0xDE00}, 4, "\U0001F600"}, // a pair is one character,
        {L"\U0001F600", 3, "\uF600"},        // and one that needs a pair is cut to 16 bits
        {L"a\0b"s, 1, "a"},
        {L"a\U00010000b", 1, "a"}, // cut to zero
        {{0xDE00, 0xD83D}, 0, "old"},
        {{L'a', 0xD83D}, 0, "old"},
    };
    for (const auto& c : cases) {
        std::string target = "old";
        EXPECT_EQ(utils::UnicodeToUTF8(c.text, target), c.result);
        EXPECT_EQ(target, c.target);
        EXPECT_EQ(utils::UTF8FromUni(c.text), c.target == "old" ? "" : c.target);
    }
}

TEST(StringUtilsComGUI, ConvertsUtf8ToAsManyCharactersAsBytes) {
    const struct {
        std::string text;
        std::wstring target;
    } cases[] = {
        {"", L""},
        {"abc", L"abc"},
        {"aäb", L"aäb\0"s},
        {"\U0001F600", {0xD83D, 0xDE00, 0, 0}},
        {"a\0b"s, L"a\0\0"s},
        {"\xED\xA0\x80", L"old"},     // a surrogate
        {"\xF4\x90\x80\x80", L"old"}, // above U+10FFFF
        {"\xC0\x80", L"old"},         // longer than needed
        {"\xE0\x9F\xBF", L"old"},
        {"a\xC3", L"old"},
        {"a\xC3x", L"old"},
        {"\x80", L"old"},
        {"\xFF", L"old"},
    };
    for (const auto& c : cases) {
        std::wstring target = L"old";
        const bool valid = c.target != target;
        EXPECT_EQ(utils::UTF8ToUnicode(c.text, target), valid ? c.text.size() : 0U);
        EXPECT_EQ(target, c.target);
        EXPECT_EQ(utils::UniFromUTF8(c.text), valid ? c.target : L"");
    }
}

TEST(StringUtilsComGUI, ReadsAndWritesHexadecimal) {
    const std::pair<const char*, int> cases[] = {
        {nullptr, -1},
        {"ff", 255},
        {"FF", 255},
        {"  0x1F", 31},
        {"12xyz", 0x12},
        {"-10", -16},
        {"zz", 0},
        {"7fffffff", INT_MAX},
        {"80000000", INT_MAX},
        {"", -1},
        {" \t", -1},
        {"0xg", 0},
        {"1 2", 1},
        {"-80000001", INT_MIN},
    };
    for (const auto& [text, value] : cases) {
        EXPECT_EQ(utils::ConvertHexStrToInt(text), value) << (text ? text : "null");
    }
    EXPECT_EQ(utils::ConvertIntToHexStr(255), "ff");
    EXPECT_EQ(utils::ConvertIntToHexStr(0), "0");
    EXPECT_EQ(utils::ConvertIntToHexStr(-1), "ffffffff");

    char text[] = "AbC Ä[";
    EXPECT_STREQ(utils::lower(text), "abc Ä[");
    EXPECT_EQ(utils::lower(nullptr), nullptr);
}

} // namespace
