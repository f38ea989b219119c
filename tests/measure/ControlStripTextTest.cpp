#include "measure/ControlStripText.h"

#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

std::string times(int count, const std::string& text) {
    std::string all;
    for (int i = 0; i < count; ++i) {
        all += text;
    }
    return all;
}

TEST(StringConditioning, EndsALineAnew) {
    const struct {
        std::string line;
        std::string expected;
    } cases[] = {
        {"", ""},
        {"DEVICE 21", "DEVICE 21"},
        {"a \t\r\n", "a "},
        {"\ta\tb\t", "\ta\tb"},
        {"\t\x01", "\t\x01"}, // No text to end behind.
        {std::string("ab\0cd", 5), "ab"},
        // As many bytes go as there are more than characters, then what is no ASCII.
        {"\xc3\xa4"
         "bc",
         "\xc3\xa4"
         "b"},
        {"abc\xc3\xa4", "abc"},
        {"\xe2\x82\xac 1 \xe2\x82\xac!", "\xe2\x82\xac 1 "},
        {"\xc3\xa4\xc3\xa4"
         "b",
         "\xc3\xa4\xc3\xa4"
         "b"},
        {times(511, "a"), times(511, "a")},
        {times(512, "a"), times(511, "a")},
        {times(510, "a") + "\xc3\xa4zz", times(510, "a")},
        {times(300, "\xc3\xa4"), times(255, "\xc3\xa4")},
        {times(500, "a") + times(100, "\t") + "b", times(500, "a")},
    };
    for (const auto& [line, expected] : cases) {
        EXPECT_EQ(StringConditioning(wxString::FromUTF8(line)).utf8_string(), expected + "\r\n");
    }
}

TEST(ControlStripText, IsSearchedFromItsStart) {
    const support::ScratchFolder folder;
    wxTextFile file;
    ASSERT_TRUE(measure::readLines(folder.write("strip", "one\r\nKEYWORD two\rtwo\nthree"), &file));
    wxString line = "before";
    EXPECT_FALSE(findStringInFile(&file, "Two", &line));
    EXPECT_EQ(line, "before");
    EXPECT_TRUE(file.Eof());
    for (int i = 0; i < 2; ++i) {
        EXPECT_TRUE(findStringInFile(&file, "two", &line));
        EXPECT_EQ(line, "KEYWORD two");
        EXPECT_EQ(file.GetCurrentLine(), 1U);
    }
    EXPECT_TRUE(findStringInFile(&file, "hree", &line));
    EXPECT_FALSE(measure::readLines(folder.path(), &file)) << "a folder";
    wxTextFile empty;
    EXPECT_TRUE(measure::readLines(folder.write("empty", ""), &empty));
    EXPECT_FALSE(findStringInFile(&empty, "", &line));
}

TEST(ControlStripText, NamesItsInstrument) {
    const support::ScratchFolder folder;
    setenv("TMPDIR", folder.path().c_str(), 1);
    KZVerifyJobProcessor processor;
    int deviceID = 7;
    EXPECT_EQ(processor.GetDeviceIDFromIt8ControlStripFileEx(folder.path("none"), &deviceID), 10);
    EXPECT_EQ(deviceID, 0);
    const struct {
        std::string text;
        int expected;
    } cases[] = {
        {"", 0},
        {"CGATS.17\nNUMBER_OF_SETS 5\n", 0},
        {"CGATS.17\r\nDEVICE 21\r\n", 21},
        {"DEVICE\t\t-3", -3},
        {"DEVICE21", 21},
        {"DEVICE", 0},
        {"DEVICE 21 ", 0}, // No whole number.
        {"DEVICE 2.5\nDEVICE 21", 0},
        {"KEYWORD \"DEVICE\"\nDEVICE 21\n", 0}, // Its first line counts.
        {" DEVICE 21", 0},
        {"DEVICE 2147483647", 2147483647},
        {"DEVICE 2147483648", 0},
        {"DEVICE 99999999999999999999", 0},
        {"caf\xe9\nDEVICE 33\n", 33}, // Latin-1.
        {std::string("\xff\xfe"
                     "D\0E\0V\0I\0C\0E\0 \0"
                     "4\0"
                     "3\0",
                     20),
         43}, // UTF-16.
    };
    // Names that are not valid UTF-8 are names all the same.
    const std::string path = folder.path("J\xf6"
                                         "b");
    for (const auto& [text, expected] : cases) {
        folder.write("J\xf6"
                     "b",
                     text);
        deviceID = 7;
        EXPECT_EQ(processor.GetDeviceIDFromIt8ControlStripFileEx(stringToWstring(path), &deviceID),
                  0);
        EXPECT_EQ(deviceID, expected) << text;
    }
}

} // namespace
