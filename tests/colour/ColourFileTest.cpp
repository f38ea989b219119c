// SPDX-License-Identifier: Apache-2.0
#include "colour/ColourFile.h"

#include <chrono>
#include <cstdlib>
#include <string>

#include <sys/stat.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "Utf16.h"

using namespace colour;

namespace {

const std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID LAB_L LAB_A LAB_B\n"
                         "END_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1 50 0 0\nEND_DATA\n";

Failure load(const std::string& path) {
    ColourFile file;
    return loadColourFile(path, {}, file);
}

} // namespace

TEST(ColourFile, TellsFilesByTheirBytes) {
    const support::ScratchFolder folder;
    const std::string profile =
        support::contentsOf("/usr/share/color/icc/ghostscript/default_cmyk.icc");
    ColourFile file;
    ASSERT_EQ(loadColourFile(folder.write("a.icc", text), {}, file), Failure::None);
    EXPECT_TRUE(file.set && !file.profile);
    EXPECT_EQ(file.set->patchCount, 1U);
    ASSERT_EQ(loadColourFile(folder.write("b.txt", profile), {}, file), Failure::None);
    EXPECT_TRUE(file.profile && !file.set);

    EXPECT_EQ(load(folder.write("cut.icc", profile.substr(0, 200))), Failure::ProfileDamaged);
    EXPECT_EQ(load(folder.write("other", std::string(100, '\0'))), Failure::NotRecognised);
    EXPECT_EQ(load(folder.write("empty", "")), Failure::NotRecognised);
    EXPECT_EQ(load(folder.write("utf16", support::utf16(text, "LE"))), Failure::None);
    EXPECT_EQ(load(folder.write("utf16", std::string("\xFF\xFE\0\xDC"
                                                     "1",
                                                     5))),
              Failure::NotRecognised);
    EXPECT_EQ(load("/dev/zero"), Failure::NotRecognised);
    EXPECT_TRUE(file.profile); // unchanged
}

TEST(ColourFile, TellsWhyAFileCannotBeRead) {
    const support::ScratchFolder folder;
    EXPECT_EQ(load(folder.path("missing")), Failure::Missing);
    EXPECT_EQ(load(folder.write("file", text) + "/below"), Failure::Missing);
    EXPECT_EQ(load(folder.path()), Failure::Unreadable);
    ASSERT_EQ(symlink("loop", folder.path("loop").c_str()), 0);
    EXPECT_EQ(load(folder.path("loop")), Failure::Unreadable);

    std::string bytes = "as it was";
    EXPECT_EQ(readWholeFile(folder.path("file"), text.size() - 1, bytes), Failure::TooLarge);
    EXPECT_EQ(readWholeFile("/dev/zero", 1'000'000, bytes), Failure::TooLarge);
    EXPECT_EQ(bytes, "as it was");
    EXPECT_EQ(readWholeFile(folder.path("file"), text.size(), bytes), Failure::None);
    EXPECT_EQ(bytes, text);
    EXPECT_EQ(readWholeFile("/proc/self/status", 1'000'000, bytes), Failure::None);
    EXPECT_EQ(bytes.substr(0, 5), "Name:"); // a file that reports a size of 0
}

TEST(ColourFile, WaitsForPipes) {
    const support::ScratchFolder folder;
    const std::string path = folder.path("pipe");
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    const std::string file = folder.write("file", text);
    const std::string pieces =
        "(head -c 20 " + file + "; sleep 0.02; tail -c +21 " + file + ") > " + path + " &";
    ASSERT_EQ(std::system(pieces.c_str()), 0);
    EXPECT_EQ(load(path), Failure::None);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(load(path), Failure::Unreadable); // Nobody has the pipe open for writing.
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
    // A slow writer gets more time than a missing one.
    const std::string late = "(sleep 2.5; cat " + file + ") > " + path + " &";
    ASSERT_EQ(std::system(late.c_str()), 0);
    EXPECT_EQ(load(path), Failure::None);
}
