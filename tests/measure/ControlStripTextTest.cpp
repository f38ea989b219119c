#include "measure/ControlStripText.h"

#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

std::string many(int count, const std::string& text) {
    std::string all;
    for (int i = 0; i < count; ++i) {
        all += text;
    }
    return all;
}

TEST(StringConditioning, EndsALineAnew) {
    const std::pair<std::string, std::string> cases[] = {
        {"", ""},
        {"DEVICE 21", "DEVICE 21"},
        {"a \t\r\n", "a "},
        {"\ta\tb\t", "\ta\tb"},
        {"\t\x01", "\t\x01"}, // No text to end behind.
        {std::string("ab\0cd", 5), "ab"},
        // As many bytes go as there are more than characters, then what is no ASCII.
        {"äbc", "äb"},
        {"abcä", "abc"},
        {"€ 1 €!", "€ 1 "},
        {"ääb", "ääb"},
        {many(512, "a"), many(511, "a")},
        {many(510, "a") + "äzz", many(510, "a")},
        {many(300, "ä"), many(255, "ä")},
        {many(500, "a") + many(100, "\t") + "b", many(500, "a")},
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
    const std::u16string utf16 = u"\ufeffDEVICE 43";
    const std::pair<std::string, int> cases[] = {
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
        {"caf\xe9\nDEVICE 33\n", 33}, // Latin-1.
        {std::string(reinterpret_cast<const char*>(utf16.data()), 2 * utf16.size()), 43},
    };
    for (const auto& [text, expected] : cases) {
        // Names that are not valid UTF-8 are names all the same.
        const std::wstring path = stringToWstring(folder.write("J\xf6rg", text));
        deviceID = 7;
        EXPECT_EQ(processor.GetDeviceIDFromIt8ControlStripFileEx(path, &deviceID), 0);
        EXPECT_EQ(deviceID, expected) << text;
    }
}

} // namespace
