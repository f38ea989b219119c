#include "text/CharSetsWx.h"

#include <clocale>

#include <gtest/gtest.h>

using namespace std::string_literals;

namespace {

constexpr unsigned macRoman = 0;
constexpr unsigned utf8 = 0x08000100;

struct Case {
    std::string source;
    int result;
    std::string target; ///< "old" where it stays.
};

TEST(CharSetsWx, ConvertsWhatHoldsNoMultiByteSequence) {
    const Case toIo[] = {
        {"", 1, ""},
        {"ASCII", 1, "ASCII"},
        {"\x80", 1, "Ä"},
        {"\xDB\xF0\xFF", 1, "€\xEF\xA3\xBFˇ"},
        {"Grün", 0, "old"},
        {std::string(4094, 'a'), 1, std::string(4094, 'a')},
        {std::string(4095, 'a'), 2, "old"},
        {std::string(2047, '\x80') + "\xDB", 2, "old"}, // 4094 bytes and three
    };
    for (const Case& c : toIo) {
        std::string target = "old";
        EXPECT_EQ(CharSetsWx::TulControls2IO(CharSetsWx::Context, target, c.source.c_str()),
                  c.result);
        EXPECT_EQ(target, c.target);
    }
    const Case toControls[] = {
        {"ASCII", 1, "ASCII"},
        {"Grün", 0, "old"},
        {"\xE4", 2, "old"},
        {"ab\xFF", 2, "old"},
        {"\xF1\x80\x80\x80", 2, "old"}, // not seen as a sequence
    };
    for (const Case& c : toControls) {
        std::string target = "old";
        EXPECT_EQ(CharSetsWx::Io2Controls(CharSetsWx::Context, target, c.source.c_str()), c.result);
        EXPECT_EQ(target, c.target);
    }
    std::string target = "old";
    EXPECT_EQ(CharSetsWx::Controls2Io(nullptr, target, nullptr), 0);
    EXPECT_EQ(CharSetsWx::Io2Controls(nullptr, target, nullptr), 0);
    EXPECT_EQ(target, "old");
    EXPECT_FALSE(CharSetsWx::NeedsTranslation(nullptr));
}

TEST(CharSetsWx, ConvertsBetweenTwoEncodings) {
    const struct {
        const char* source;
        unsigned from, to;
        int result;
        const char* target;
    } cases[] = {
        {"\xE4", macRoman, macRoman, 0, "\xE4"},
        {"Grün", utf8, macRoman, 1, "Gr\x9Fn"},
        {"日", utf8, macRoman, 2, "old"},
        {"soft\u00ADhyphen", utf8, macRoman, 2, "old"}, // nothing is dropped in silence
        {"\x8D\xC6", 36, utf8, 1, "çĆ"},
        {"\xAF", 38, 7, 2, "old"},
        {"ASCII", 1, utf8, 2, "old"},
        {"ASCII", utf8, 2, 2, "old"},
        {"ASCII", 25, utf8, 2, "old"},
        {"ASCII", 4711, utf8, 2, "old"},
        {nullptr, utf8, macRoman, 0, "old"},
        {nullptr, utf8, utf8, 0, "old"},
    };
    for (const auto& c : cases) {
        std::string target = "old";
        EXPECT_EQ(CharSetsWx::Io2Controls(target, c.source, c.from, c.to), c.result) << c.from;
        EXPECT_EQ(target, c.target);
    }
}

TEST(CharSetsWx, ConvertsWxStringsThroughTheLocale) {
    ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
    EXPECT_EQ(CharSetsWx::Controls2Io(wxString("plain")), "plain");
    EXPECT_EQ(CharSetsWx::Io2Controls(wxString("plain")), "plain");
    const wxString umlaut = wxString::FromUTF8("Grün");
    EXPECT_EQ(CharSetsWx::Controls2Io(umlaut), umlaut);
    EXPECT_EQ(CharSetsWx::Io2Controls(umlaut), umlaut);
    ASSERT_NE(std::setlocale(LC_CTYPE, "C"), nullptr);
    EXPECT_EQ(CharSetsWx::Controls2Io(umlaut), umlaut); // no 8 bits in this locale
}

TEST(CharSetsWx, RedirectsTheCallersPointer) {
    const char* name = "\x80";
    const CharSetsWx::Controls2IoBuffered converted(name);
    EXPECT_STREQ(name, "Ä");

    char umlaut[] = "Grün";
    char* text = umlaut;
    const CharSetsWx::Io2ControlsBuffered kept(text);
    EXPECT_EQ(text, umlaut);

    const char* none = nullptr;
    const CharSetsWx::Controls2IoBuffered nothing(none);
    EXPECT_EQ(none, nullptr);
}

} // namespace
