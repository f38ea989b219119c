#include "jdf/JdfBuffer.h"

#include <string>

#include <gtest/gtest.h>

namespace {

TEST(JdfBuffer, FindsTokensThatEndBeforeTheEnd) {
    const struct {
        const char* token;
        std::string text;
        long position, length; ///< 0 and 0 where it is not found.
    } cases[] = {
        {"<a", "xx<a>", 2, 2},  {"<a>", "x<a>", 0, 0}, {"<a", "<b<<a>", 3, 2},
        {"aab", "aaab.", 1, 3}, {"<a", "", 0, 0},      {"<abc", "<ab", 0, 0},
    };
    for (auto c : cases) {
        char* found = nullptr;
        long length = -1;
        FindToken(c.token, c.text.data(), c.text.data() + c.text.size(), &found, &length);
        EXPECT_EQ(found - c.text.data(), c.position) << c.text;
        EXPECT_EQ(length, c.length) << c.text;
    }
}

TEST(JdfBuffer, WalksToLineStarts) {
    std::string text = "ab\r\n\n\rcd \t e";
    char* const start = text.data();
    char* out = nullptr;
    for (const auto& [from, end, to] :
         {std::tuple{0, 12, 6}, {4, 12, 6}, {6, 12, 12}, {12, 12, 12}, {0, 4, 4}}) {
        SkipToNextLine(start + from, start + end, &out);
        EXPECT_EQ(out - start, to) << from;
    }
    for (const auto& [from, to] : {std::pair{11, 8}, {10, 8}, {8, 8}, {6, 6}}) {
        SkipWhiteSpacesToStartOfLine(start + from, &out);
        EXPECT_EQ(out - start, to) << from;
    }
}

TEST(JdfBuffer, DeletesAsRequiredAndNotAsNamed) {
    const struct {
        std::string text;
        long position, count;
        int code;
        std::string result;
    } cases[] = {
        {"abcdefgh", 2, 3, 0, "abcde"}, {"abcdefghijkl", 1, 2, 0, "abcbcdefgh"},
        {"abc", 3, 0, 0, "abc"},        {"abc", 0, 3, 0, ""},
        {"abc", -1, 1, -31, "abc"},     {"abc", 0, 4, -31, "abc"},
        {"abc", 2, 2, -31, "abc"},      {"abc", 1, -1, -31, "abc"},
    };
    for (auto c : cases) {
        char* const buffer = c.text.data();
        long length = static_cast<long>(c.text.size());
        EXPECT_EQ(DeleteCharactersFromBuffer(c.count, buffer + c.position, buffer, buffer + length,
                                             &length),
                  c.code);
        EXPECT_EQ(c.text.substr(0, static_cast<std::size_t>(length)), c.result) << c.position;
    }
}

TEST(JdfBuffer, InsertsBelowTheLimit) {
    const struct {
        const char* text;
        long position, capacity;
        int code;
        std::string result;
    } cases[] = {
        {"XY", 1, 10, 0, "aXYbc"},
        {"XY", 0, 6, 0, "XYabc"},
        {"XY", 0, 5, -30, "abc"},
        {"XY", 7, 10, 0, "abcXY"}, // behind the contents
    };
    for (const auto& c : cases) {
        char buffer[] = "abc.......";
        long length = 3;
        EXPECT_EQ(InsertCStringIntoBuffer(c.text, buffer + c.position, buffer, buffer + c.capacity,
                                          &length),
                  c.code);
        EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), c.result) << c.capacity;
    }
}

} // namespace
