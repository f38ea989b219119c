// SPDX-License-Identifier: Apache-2.0
#include "base/WideBytes.h"

#include <string>
#include <utility>

#include <gtest/gtest.h>

TEST(WideBytes, KeepBytesThatAreNotUtf8) {
    const std::pair<const char*, std::wstring> cases[] = {
        {"\xff/\xc3", L"\xdcff/\xdcc3"},
        {"\xed\xa0\x80", L"\xdced\xdca0\xdc80"}, // A surrogate,
        {"\xc0\xaf", L"\xdcc0\xdcaf"},           // longer than needed,
        {"\xe0\x9f\xbf", L"\xdce0\xdc9f\xdcbf"},
        {"\xf4\x90\x80\x80", L"\xdcf4\xdc90\xdc80\xdc80"}, // and above U+10FFFF.
    };
    for (const auto& [bytes, wide] : cases) {
        EXPECT_EQ(base::wideFromBytes(bytes), wide);
        EXPECT_EQ(base::bytesFromWide(wide), bytes);
    }
    const std::wstring odd = {wchar_t(0xFFFFFFE4), wchar_t(0xDCE4), wchar_t(0xD800),
                              wchar_t(0x110000)};
    EXPECT_EQ(base::bytesFromWide(odd), "\xe4\xe4\uFFFD\uFFFD");
    EXPECT_EQ(base::utf8FromWide(odd), "\uFFFD\uFFFD\uFFFD\uFFFD");
}
