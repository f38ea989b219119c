// SPDX-License-Identifier: Apache-2.0
#include "text/CharSetsWx.h"

#include <clocale>

#include <gtest/gtest.h>

TEST(CharSetsWx, ConvertsWhatHoldsNoMultiByteSequence) {
    const auto toIo = CharSetsWx::TulControls2IO;
    int (*const toControls)(void*, std::string&, const char*) = CharSetsWx::Io2Controls;
    const struct {
        int (*convert)(void*, std::string&, const char*);
        std::string source;
        int result;
        std::string target; ///< "old" if unchanged.
    } cases[] = {
        {toIo, "ASCII", 1, "ASCII"},
        {toIo, "\x80\xDB\xF0", 1, "Ä€\xEF\xA3\xBF"},
        {toIo, "Grün", 0, "old"},
        {toIo, std::string(4094, 'a'), 1, std::string(4094, 'a')},
        {toIo, std::string(4095, 'a'), 2, "old"},
        {toIo, std::string(2047, '\x80') + "\xDB", 2, "old"}, // 4094 bytes plus three
        {toControls, "ASCII", 1, "ASCII"},
        {toControls, "Grün", 0, "old"},
        {toControls, "ab\xE4", 2, "old"},
    };
    for (const auto& c : cases) {
        std::string target = "old";
        EXPECT_EQ(c.convert(CharSetsWx::Context, target, c.source.c_str()), c.result);
        EXPECT_EQ(target, c.target);
        EXPECT_EQ(c.convert(nullptr, target, nullptr), 0);
    }
}

TEST(CharSetsWx, ConvertsBetweenTwoEncodings) {
    constexpr unsigned utf8 = 0x08000100;
    std::string target = "old";
    // Nothing is dropped silently.
    EXPECT_EQ(CharSetsWx::Io2Controls(target, "soft\u00ADhyphen", utf8, 0), 2);
    EXPECT_EQ(CharSetsWx::Io2Controls(target, nullptr, utf8, 0), 0);
    EXPECT_EQ(target, "old");
    EXPECT_EQ(CharSetsWx::Io2Controls(target, "\xE4", 0, 0), 0);
    EXPECT_EQ(target, "\xE4");
    EXPECT_EQ(CharSetsWx::Io2Controls(target, "Grün", utf8, 0), 1);
    EXPECT_EQ(target, "Gr\x9Fn");
}

TEST(CharSetsWx, ConvertsWxStringsAndPointers) {
    const wxString umlaut = wxString::FromUTF8("Grün");
    for (const char* locale : {"C", "C.UTF-8"}) { // the first has no 8-bit form for it
        ASSERT_NE(std::setlocale(LC_CTYPE, locale), nullptr);
        EXPECT_EQ(CharSetsWx::Controls2Io(umlaut), umlaut);
    }
    const char* name = "\x80";
    const CharSetsWx::Controls2IoBuffered converted(name);
    EXPECT_STREQ(name, "Ä");
    const CharSetsWx::Controls2IoBuffered kept(name);
    EXPECT_STREQ(name, "Ä");
}
