// SPDX-License-Identifier: Apache-2.0
#include <clocale>
#include <cstdlib>
#include <cwchar>
#include <string>

#include <gtest/gtest.h>

#include "base/WideBytes.h"
#include "platform/CoreFoundationStrings.h"
#include "platform/SystemRoot.h"

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

// Compares every character with the C library.
TEST(WideBytes, AgreeWithTheLocalesUtf8) {
    ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
    for (wchar_t c = 1; c <= 0x10FFFF; c += c == 0xD7FF ? 0x801 : c < 0x11000 ? 1 : 251) {
        char bytes[8] = {};
        ASSERT_GT(std::wctomb(bytes, c), 0);
        ASSERT_EQ(base::bytesFromWide({&c, 1}), bytes);
        ASSERT_EQ(base::wideFromBytes(bytes), std::wstring(1, c));
        const platform::Owned<CFStringRef> string(
            CFStringCreateWithCString(nullptr, bytes, kCFStringEncodingUTF8));
        char back[8];
        ASSERT_TRUE(CFStringGetCString(string.get(), back, sizeof back, kCFStringEncodingUTF8));
        ASSERT_STREQ(back, bytes);
    }
}
