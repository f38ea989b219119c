// SPDX-License-Identifier: Apache-2.0
#include "colour/Identity.h"

#include <set>
#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"

using namespace colour;

namespace {

std::string identityIn(const std::string& bytes) {
    ColourFile file;
    EXPECT_EQ(readColourFile(bytes, {}, file), Failure::None) << bytes;
    return identityOf(file);
}

std::string text(const std::string& header, const std::string& rows) {
    return "CGATS.17\n" + header +
           "BEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L "
           "LAB_A LAB_B\nEND_DATA_FORMAT\nBEGIN_DATA\n" +
           rows + "END_DATA\n";
}

const std::string rows = "1 0 0 0 0 95 0 -2\n2 100 0 0 0 55 -37 -50\n"
                         "3 33.333 0 12.5 0 70.25 -12.125 3.5\n";

} // namespace

// Expected digests: xxh128sum of Python's struct.pack("<i") of the documented integers.
TEST(Identity, IsThatOfTheColoursAlone) {
    const std::string expected = "d17e455f60da1d6cdc7da694595a425b";
    EXPECT_EQ(identityIn(text("", rows)), expected);
    EXPECT_EQ(identityIn("CGATS.17\nBEGIN_DATA_FORMAT\nLAB_L LAB_A LAB_B\nEND_DATA_FORMAT\n"
                         "BEGIN_DATA\n50 1 -2.5\nEND_DATA\n"),
              "599c6e66e34f7a07b2d49dad608128a2");

    std::string renamed = rows;
    renamed[0] = 'X';
    EXPECT_EQ(identityIn(text("ORIGINATOR \"Other\"\nCREATED \"2026-11-25\"\n", renamed)),
              expected);
    for (const auto& [from, to] :
         {std::pair{"95", "95.001"}, std::pair{"12.5 ", "12.5001 "}, std::pair{"-37", "37"}}) {
        std::string changed = rows;
        changed.replace(changed.find(from), std::string(from).size(), to);
        EXPECT_NE(identityIn(text("", changed)), expected) << to;
    }
}

TEST(Identity, OfAProfileIsThatOfItsColours) {
    std::string profile = support::contentsOf("/usr/share/color/icc/ghostscript/default_cmyk.icc");
    const std::string expected = identityIn(profile);
    EXPECT_EQ(expected.size(), 32U);
    profile[31] ^= 1; // Its date.
    EXPECT_EQ(identityIn(profile), expected);
}
