// SPDX-License-Identifier: Apache-2.0
#include "measure/StripText.h"

#include <fstream>
#include <random>
#include <string>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>
#include <wx/convauto.h>
#include <wx/textfile.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"
#include "measure/StripLines.h"

namespace {

wxString asText(std::wstring_view line) {
    return {line.data(), line.size()};
}

TEST(StripText, WalksLikeATextFile) {
    const support::ScratchFolder folder;
    std::mt19937 random(1);
    const std::string pieces[] = {"a", "DEVICE", "\r", "\n", "\r\n", "\xc3\xa4", " "};
    const std::string rare[] = {"\xff", std::string(1, '\0'), "\xef\xbb\xbf", "DEV"};
    for (int round = 0; round < 3000; ++round) {
        std::string bytes = round % 50 == 0 ? "\xff\xfe" : round % 7 == 0 ? "\xef\xbb\xbf" : "";
        for (unsigned count = random() % 12; count > 0; --count) {
            bytes += random() % 20 == 0 ? rare[random() % 4] : pieces[random() % 7];
        }
        const std::string path = folder.write("strip", bytes);
        wxTextFile file;
        file.Open(path, wxConvAuto());
        measure::StripText strip;
        ASSERT_TRUE(strip.read(path));
        wxString expected = file.GetFirstLine();
        for (wxString line = asText(strip.firstLine());; line = asText(strip.nextLine())) {
            ASSERT_EQ(strip.atEnd(), file.Eof()) << testing::PrintToString(bytes);
            ASSERT_TRUE(file.Eof() || line == expected) << testing::PrintToString(bytes);
            if (file.Eof()) {
                break;
            }
            expected = file.GetNextLine();
        }
        wxString found = "before";
        wxString foundInFile = "before";
        EXPECT_EQ(strip.find("DEVICE", &found), findStringInFile(&file, "DEVICE", &foundInFile));
        EXPECT_EQ(found, foundInFile) << testing::PrintToString(bytes);
        EXPECT_EQ(strip.atEnd(), file.Eof());
        if (!file.Eof()) {
            EXPECT_EQ(asText(strip.nextLine()), file.GetNextLine());
            EXPECT_EQ(strip.atEnd(), file.Eof());
        }
    }
    measure::StripText none;
    EXPECT_FALSE(none.read(folder.path("none")));
    EXPECT_FALSE(none.read(folder.path())); // A folder.
}

#if !defined(__SANITIZE_ADDRESS__)

/// Runs `work` in a process that may use `bytes` more memory. False if that is not enough.
template<class Work>
bool worksWithin(std::size_t bytes, Work work) {
    const pid_t child = fork();
    if (child == 0) {
        std::size_t pages = 0;
        std::ifstream("/proc/self/statm") >> pages;
        const rlim_t most = pages * static_cast<std::size_t>(sysconf(_SC_PAGESIZE)) + bytes;
        const rlimit limit{most, most};
        setrlimit(RLIMIT_AS, &limit);
        try {
            work();
            _exit(0);
        } catch (...) {
            _exit(1);
        }
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

TEST(StripText, TakesTwelveTimesItsFileAtMost) {
    constexpr std::size_t size = 4 << 20;
    const support::ScratchFolder folder;
    setenv("TMPDIR", folder.path().c_str(), 1);
    const std::string head = "DEVICE 5\nNUMBER_OF_STRIPS 1\nNUMBER_OF_COLS 1\niSis_INFO\n"
                             "END_DATA_FORMAT\nBEGIN_DATA\n";
    for (const char* line : {"\n", "1\n", "\xc3\xa4\n"}) {
        std::string strip = head;
        while (strip.size() < size) {
            strip += line;
        }
        const std::string path = folder.write("strip.it8", strip);
        EXPECT_TRUE(worksWithin(12 * size, [&] {
            KZJobDataStruct job;
            KZVerifyJobProcessor processor;
            int deviceID = 0;
            processor.GetDeviceIDFromIt8ControlStripFileEx(path, &deviceID);
            if (processor.WriteTemporaryMeasurementDefinitionFile(path, &job).empty()) {
                throw deviceID;
            }
        })) << testing::PrintToString(line);
        EXPECT_GT(support::contentsOf(folder.path("NMPatchSetDefinition.dcf")).size(), size);
    }
}

#endif

} // namespace
