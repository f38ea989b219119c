#include "jdf/JdfBuffer.h"

#include <string>

#include <gtest/gtest.h>

namespace {

TEST(JdfBuffer, FindsTokensThatEndBeforeTheEnd) {
    const struct {
        const char* token;
        const char* text;
        long position; ///< 0 with length 0 where it is not found.
        long length;
    } cases[] = {
        {"<a", "xx<a>", 2, 2},  {"<a", "<a>", 0, 2},     {"<a>", "x<a>", 0, 0}, // at the end
        {"<a", "<b<<a>", 3, 2}, {"aab", "aaaab.", 2, 3}, {"<a", "", 0, 0},
        {"<abc", "<ab", 0, 0},  {"<A", "<a>", 0, 0},
    };
    for (const auto& c : cases) {
        std::string text = c.text;
        char* found = nullptr;
        long length = -1;
        EXPECT_EQ(FindToken(c.token, text.data(), text.data() + text.size(), &found, &length), 0);
        EXPECT_EQ(found - text.data(), c.position) << c.text;
        EXPECT_EQ(length, c.length) << c.text;
    }
}

TEST(JdfBuffer, WalksToLineStarts) {
    std::string text = "ab\r\n\n\rcd \t e";
    char* const start = text.data();
    char* const end = start + text.size();
    const std::pair<long, long> next[] = {{0, 6}, {2, 6}, {4, 6}, {6, 12}, {12, 12}};
    for (const auto& [from, to] : next) {
        char* out = nullptr;
        EXPECT_EQ(SkipToNextLine(start + from, end, &out), 0);
        EXPECT_EQ(out - start, to) << from;
    }
    char* out = nullptr;
    SkipToNextLine(start, start + 4, &out); // stops among the line ends
    EXPECT_EQ(out - start, 4);
    const std::pair<long, long> back[] = {{11, 8}, {8, 8}, {10, 8}, {6, 6}};
    for (const auto& [from, to] : back) {
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
        {"abc", 1, 0, 0, "abc"},        {"abc", 3, 0, 0, "abc"},
        {"abc", 0, 3, 0, ""},           {"abc", -1, 1, -31, "abc"},
        {"abc", 0, 4, -31, "abc"},      {"abc", 2, 2, -31, "abc"},
        {"abc", 4, 0, -31, "abc"},      {"abc", 1, -1, -31, "abc"},
    };
    for (const auto& c : cases) {
        std::string buffer = c.text;
        long length = static_cast<long>(buffer.size());
        EXPECT_EQ(DeleteCharactersFromBuffer(c.count, buffer.data() + c.position, buffer.data(),
                                             buffer.data() + buffer.size(), &length),
                  c.code);
        EXPECT_EQ(buffer.substr(0, static_cast<std::size_t>(length)), c.result) << c.position;
    }
}

TEST(JdfBuffer, InsertsBelowTheLimit) {
    const struct {
        const char* text;
        long position, capacity;
        int code;
        std::string result;
    } cases[] = {
        {"XY", 1, 10, 0, "aXYbc"}, {"XY", 3, 10, 0, "abcXY"}, {"XY", 0, 6, 0, "XYabc"},
        {"XY", 0, 5, -30, "abc"},  {"", 0, 3, -30, "abc"},    {"", 1, 4, 0, "abc"},
        {"XY", 7, 10, 0, "abcXY"}, // behind the contents
    };
    for (const auto& c : cases) {
        std::string buffer = "abc.......";
        long length = 3;
        EXPECT_EQ(InsertCStringIntoBuffer(c.text, buffer.data() + c.position, buffer.data(),
                                          buffer.data() + c.capacity, &length),
                  c.code);
        EXPECT_EQ(buffer.substr(0, static_cast<std::size_t>(length)), c.result) << c.capacity;
    }
}

} // namespace
