#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "platform/SystemRoot.h"
#include "platform/WideBytes.h"

namespace {

TEST(SystemRoot, CountsOnlyWhereItCanStandInACommand) {
    unsetenv("TINTGATE_ROOT");
    const std::string none = platform::underRoot("/x"); // Below the root given at build time.
    const struct {
        const char* variable;
        std::string path; // Of "/x" below the root.
    } cases[] = {
        {"/opt/suite", "/opt/suite/x"},
        {"/opt/suite//", "/opt/suite/x"},
        {"/a b; c&(d)*\n", "/a b; c&(d)*\n/x"},
        {"/opt/\xff", "/opt/\xff/x"},
        {"", none},
        {"/", none},
        {"/a\"b", none},
        {"/a'b", none},
        {"/a$b", none},
        {"/a`b", none},
        {"/a\\b", none},
    };
    for (const auto& [variable, path] : cases) {
        setenv("TINTGATE_ROOT", variable, 1);
        EXPECT_EQ(platform::underRoot("/x"), path) << variable;
    }
    unsetenv("TINTGATE_ROOT");
}

TEST(WideBytes, GiveEveryByteBack) {
    const struct {
        const char* bytes;
        std::wstring wide;
    } cases[] = {
        {"a\xc3\xbc\xe2\x82\xac\xf0\x9d\x84\x9e", L"a\u00fc\u20ac\U0001d11e"},
        {"\xff/\xc3", L"\xdcff/\xdcc3"},
        {"\xed\xa0\x80", L"\xdced\xdca0\xdc80"},           // A surrogate,
        {"\xc0\xaf", L"\xdcc0\xdcaf"},                     // longer than needed,
        {"\xf4\x90\x80\x80", L"\xdcf4\xdc90\xdc80\xdc80"}, // and above U+10FFFF.
    };
    for (const auto& [bytes, wide] : cases) {
        EXPECT_EQ(platform::wideFromBytes(bytes), wide);
        EXPECT_EQ(platform::bytesFromWide(wide), bytes);
    }
    std::string all;
    for (int lead = 0x80; lead < 0x100; ++lead) {
        for (int next = 0x70; next < 0x100; ++next) {
            (all += static_cast<char>(lead)) += static_cast<char>(next);
        }
    }
    EXPECT_EQ(platform::bytesFromWide(platform::wideFromBytes(all)), all);
    EXPECT_EQ(platform::bytesFromWide({wchar_t(0xFFFFFFE4), wchar_t(0xD800), wchar_t(0x110000)}),
              "\xe4??");
}

} // namespace
