#include "platform/CoreFoundationStrings.h"

#include <fstream>

#include <gtest/gtest.h>

#include "Csv.h"

namespace {

std::u16string decoded(const std::string& text, CFStringEncoding encoding) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, text.c_str(), encoding));
    return string == nullptr ? u"" : string->units;
}

bool isLoaded(const std::string& library) {
    std::ifstream maps("/proc/self/maps");
    for (std::string line; std::getline(maps, line);) {
        if (line.find(library) != std::string::npos) {
            return true;
        }
    }
    return false;
}

// First of all tests, since others load it.
TEST(CodePages, LoadIcuForNothingButItsOwnPages) {
    EXPECT_EQ(decoded("ASCII", kCFStringEncodingMacRoman), u"ASCII");
    EXPECT_EQ(decoded("ä", kCFStringEncodingUTF8), u"ä");
    EXPECT_EQ(decoded("\x8A", kCFStringEncodingMacCroatian), u"ä");
    EXPECT_FALSE(isLoaded("libicuuc"));
    EXPECT_EQ(decoded("\x8A", kCFStringEncodingMacRoman), u"ä");
    EXPECT_TRUE(isLoaded("libicuuc"));
}

TEST(CodePages, AgreeWithThePublishedTablesBothWays) {
    const CFStringEncoding encodings[] = {
        kCFStringEncodingMacRoman,    kCFStringEncodingMacGreek,
        kCFStringEncodingMacCyrillic, kCFStringEncodingMacCentralEurRoman,
        kCFStringEncodingMacTurkish,  kCFStringEncodingMacCroatian,
        kCFStringEncodingMacRomanian,
    };
    for (const auto& row : support::readCsv("text/code-pages.csv")) {
        const std::string text =
            "a" + std::string(1, static_cast<char>(std::stoi(row[0], nullptr, 16)));
        ASSERT_EQ(row.size(), 1 + std::size(encodings));
        for (std::size_t i = 0; i < std::size(encodings); ++i) {
            const std::u16string expected{
                u'a', static_cast<char16_t>(std::stoi(row[i + 1], nullptr, 16))};
            const platform::Owned<CFStringRef> string(
                CFStringCreateWithCString(kCFAllocatorDefault, text.c_str(), encodings[i]));
            ASSERT_NE(string, nullptr);
            EXPECT_EQ(string->units, expected) << row[0] << " in " << encodings[i];
            char back[3];
            EXPECT_TRUE(CFStringGetCString(string.get(), back, sizeof back, encodings[i]));
            EXPECT_EQ(back, text);
            EXPECT_FALSE(CFStringGetCString(string.get(), back, 2, encodings[i]));
        }
    }
}

TEST(Strings, ConvertEveryCharacterThroughUtf8) {
    for (char32_t c = 1; c <= 0x10FFFF; c += c < 0x11000 ? 1 : 251) {
        std::u16string units(1, static_cast<char16_t>(c));
        if (c > 0xFFFF) {
            units = {static_cast<char16_t>(0xD800 + ((c - 0x10000) >> 10)),
                     static_cast<char16_t>(0xDC00 + ((c - 0x10000) & 0x3FF))};
        }
        const platform::Owned<CFStringRef> string(CFStringCreateWithCharacters(
            kCFAllocatorDefault, units.data(), static_cast<CFIndex>(units.size())));
        char bytes[5] = {};
        const bool isSurrogate = c >= 0xD800 && c <= 0xDFFF;
        ASSERT_EQ(CFStringGetCString(string.get(), bytes, sizeof bytes, kCFStringEncodingUTF8),
                  !isSurrogate);
        ASSERT_EQ(decoded(bytes, kCFStringEncodingUTF8), isSurrogate ? u"" : units);
        const std::size_t length = c < 0x80 ? 1 : c < 0x800 ? 2 : c < 0x10000 ? 3 : 4;
        ASSERT_EQ(std::string(bytes).size(), isSurrogate ? 0 : length);
        ASSERT_LE(static_cast<CFIndex>(length),
                  CFStringGetMaximumSizeForEncoding(CFStringGetLength(string.get()),
                                                    kCFStringEncodingUTF8));
    }
}

} // namespace
