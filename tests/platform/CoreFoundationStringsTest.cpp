// SPDX-License-Identifier: Apache-2.0
#include "platform/CoreFoundationStrings.h"

#include <gtest/gtest.h>

#include "Csv.h"
#include "ScratchFolder.h"

namespace {

std::u16string decoded(const std::string& text, CFStringEncoding encoding) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, text.c_str(), encoding));
    return string == nullptr ? u"" : string->units;
}

bool isIcuLoaded() {
    return support::contentsOf("/proc/self/maps").find("libicuuc") != std::string::npos;
}

} // namespace

// Must be the first test, because others load the library.
TEST(CodePages, LoadIcuForNothingButItsOwnPages) {
    EXPECT_EQ(decoded("ASCII", kCFStringEncodingMacRoman), u"ASCII");
    EXPECT_EQ(decoded("\x8A", kCFStringEncodingMacCroatian), u"ä");
    EXPECT_FALSE(isIcuLoaded());
    EXPECT_EQ(decoded("\x8A", kCFStringEncodingMacRoman), u"ä");
    EXPECT_TRUE(isIcuLoaded());
}

TEST(CodePages, AgreeWithThePublishedTablesBothWays) {
    const CFStringEncoding encodings[] = {0, 6, 7, 29, 35, 36, 38}; // The columns of the file.
    for (const auto& row : support::readCsv("text/code-pages.csv")) {
        const char text[] = {'a', static_cast<char>(std::stoi(row[0], nullptr, 16)), '\0'};
        ASSERT_EQ(row.size(), 1 + std::size(encodings));
        for (std::size_t i = 0; i < std::size(encodings); ++i) {
            SCOPED_TRACE(row[0] + " in " + std::to_string(encodings[i]));
            const char16_t expected[] = {
                u'a', static_cast<char16_t>(std::stoi(row[i + 1], nullptr, 16)), u'\0'};
            const platform::Owned<CFStringRef> string(
                CFStringCreateWithCString(kCFAllocatorDefault, text, encodings[i]));
            ASSERT_NE(string, nullptr);
            EXPECT_EQ(string->units, expected);
            char back[3];
            EXPECT_TRUE(CFStringGetCString(string.get(), back, sizeof back, encodings[i]));
            EXPECT_STREQ(back, text);
            EXPECT_FALSE(CFStringGetCString(string.get(), back, 2, encodings[i]));
        }
    }
}
