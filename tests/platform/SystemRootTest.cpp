#include <clocale>
#include <cstdlib>
#include <cwchar>
#include <string>

#include <gtest/gtest.h>

#include "platform/CoreFoundationStrings.h"
#include "platform/SystemRoot.h"
#include "platform/WideBytes.h"

TEST(SystemRoot, CountsOnlyWhereItCanStandInACommand) {
    unsetenv("TINTGATE_ROOT");
    const std::string none = platform::underRoot("/x"); // Below the root given at build time.
    for (const char* root : {"", "/", "/a\"b", "/a'b", "/a$b", "/a`b", "/a\\b"}) {
        setenv("TINTGATE_ROOT", root, 1);
        EXPECT_EQ(platform::underRoot("/x"), none) << root;
    }
    setenv("TINTGATE_ROOT", "/a b; c&(d)*\n\xff//", 1);
    EXPECT_EQ(platform::underRoot("/x"), "/a b; c&(d)*\n\xff/x");
    unsetenv("TINTGATE_ROOT");
}

TEST(WideBytes, GiveBackWhatIsNoUtf8) {
    const std::pair<const char*, std::wstring> cases[] = {
        {"\xff/\xc3", L"\xdcff/\xdcc3"},
        {"\xed\xa0\x80", L"\xdced\xdca0\xdc80"}, // A surrogate,
        {"\xc0\xaf", L"\xdcc0\xdcaf"},           // longer than needed,
        {"\xe0\x9f\xbf", L"\xdce0\xdc9f\xdcbf"},
        {"\xf4\x90\x80\x80", L"\xdcf4\xdc90\xdc80\xdc80"}, // and above U+10FFFF.
    };
    for (const auto& [bytes, wide] : cases) {
        EXPECT_EQ(platform::wideFromBytes(bytes), wide);
        EXPECT_EQ(platform::bytesFromWide(wide), bytes);
    }
    EXPECT_EQ(platform::bytesFromWide({wchar_t(0xFFFFFFE4), wchar_t(0xD800), wchar_t(0x110000)}),
              "\xe4??");
}

// Every character there is, held against the C library.
TEST(WideBytes, AgreeWithTheLocalesUtf8) {
    ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
    for (wchar_t c = 1; c <= 0x10FFFF; c += c == 0xD7FF ? 0x801 : c < 0x11000 ? 1 : 251) {
        char bytes[8] = {};
        ASSERT_GT(std::wctomb(bytes, c), 0);
        ASSERT_EQ(platform::bytesFromWide({c}), bytes);
        ASSERT_EQ(platform::wideFromBytes(bytes), std::wstring(1, c));
        const platform::Owned<CFStringRef> string(
            CFStringCreateWithCString(nullptr, bytes, kCFStringEncodingUTF8));
        char back[8];
        ASSERT_TRUE(CFStringGetCString(string.get(), back, sizeof back, kCFStringEncodingUTF8));
        ASSERT_STREQ(back, bytes);
    }
}
