// SPDX-License-Identifier: Apache-2.0
#include "measure/StripLines.h"

#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

TEST(StringConditioning, EndsALineAnew) {
    const std::string a500(500, 'a');
    std::string umlauts;
    while (umlauts.size() < 600) {
        umlauts += "ä";
    }
    const std::pair<std::string, std::string> cases[] = {
        {"a \t\r\n", "a "},
        {"\ta\tb\t", "\ta\tb"},
        {"\t\x01", "\t\x01"}, // No text before the end.
        {std::string("ab\0cd", 5), "ab"},
        // The line is cut to as many bytes as it has characters, then after its last ASCII text.
        {"äbc", "äb"},
        {"€ 1 €!", "€ 1 "},
        // At most 511 bytes remain, and no partial character.
        {a500 + "aaaaaaaaaaaa", a500 + "aaaaaaaaaaa"},
        {umlauts, umlauts.substr(0, 510)},
        {a500 + std::string(100, '\t') + "b", a500},
    };
    for (const auto& [line, expected] : cases) {
        EXPECT_EQ(StringConditioning(wxString::FromUTF8(line)).utf8_string(), expected + "\r\n");
    }
}

TEST(StripLines, NamesItsInstrument) {
    const support::ScratchFolder folder;
    setenv("TMPDIR", folder.path().c_str(), 1);
    KZVerifyJobProcessor processor;
    int deviceID = 7;
    EXPECT_EQ(processor.GetDeviceIDFromIt8ControlStripFileEx(folder.path("none"), &deviceID), 10);
    EXPECT_EQ(deviceID, 0);
    const std::pair<std::string, int> cases[] = {
        {"caf\xe9\r\nDEVICE\t\t-3\r\n", -3},    // Latin-1.
        {"DEVICE 21 ", 0},                      // Not an integer.
        {"KEYWORD \"DEVICE\"\nDEVICE 21\n", 0}, // The first line with the word counts.
        {"DEVICE 2147483648", 0},
    };
    for (const auto& [text, expected] : cases) {
        // Names need not be valid UTF-8.
        const std::wstring path = stringToWstring(folder.write("J\xf6rg", text));
        deviceID = 7;
        EXPECT_EQ(processor.GetDeviceIDFromIt8ControlStripFileEx(path, &deviceID), 0);
        EXPECT_EQ(deviceID, expected) << text;
    }
}

} // namespace
