// SPDX-License-Identifier: Apache-2.0
#include "measure/MeasuringTool.h"

#include <algorithm>
#include <clocale>
#include <filesystem>
#include <fstream>
#include <string>

#include <gtest/gtest.h>

#include <wx/init.h>

#include "SuiteRoot.h"
#include "job/KZVerifyJobProcessor.h"
#include "measure/Helper.h"
#include "measure/NerovaMeasureParams.h"

namespace {

namespace fs = std::filesystem;

wxString wide(const std::string& path) {
    return stringToWstring(path);
}

class MeasuringTool : public testing::Test {
  protected:
    // A command line would split these names if they were not quoted.
    MeasuringTool() {
        setlocale(LC_CTYPE, "C.UTF-8");
        fs::create_directories(m_temporary);
        setenv("TMPDIR", m_temporary.c_str(), 1);
        m_root.installPlistReader(PLIST_READER);
        fs::create_directories(m_installed + "/NerovaMeasure.app/Contents/MacOS");
        m_root.writePreferences("ApplicationsUsingNerovaMeasure.plist",
                                {{"installed_path", m_installed}});
        fs::create_directories(m_root.path("job"));
        m_job.controlStripFile = wide(m_strip);
        m_job.sampleFile = wide(m_samples);
        m_job.language = "de_DE";
        m_job.deviceID = 21;
        writeFile(m_strip, "NUMBER_OF_COLS 1\niSis_INFO\n");
        writeFile(m_samples, "old");
    }

    static void writeFile(const std::string& path, const std::string& text) {
        std::ofstream(path) << text;
    }

    int launch() { return KZVerifyJobProcessor().ConfigureAndLaunchNerovaMeasure(&m_job); }

    bool hasSamples() const { return support::exists(m_samples); }
    bool hasDefinition() const { return support::exists(m_definition); }

    const support::SuiteRoot m_root;
    const wxInitializer m_wx;
    const std::string m_temporary = m_root.path("t \"m\" \\p");
    const std::string m_installed = m_root.path("in \"st\" \\alled \xc3\xbc");
    const std::string m_tool = m_installed + "/NerovaMeasure.app/Contents/MacOS/NerovaMeasure";
    const std::string m_strip = m_root.path("job/Str\xf6p 1.it8");
    const std::string m_definition = m_root.path("job/NMPatchSetDefinition.it8");
    const std::string m_samples = m_root.path("job/samples");
    KZJobDataStruct m_job;
};

TEST_F(MeasuringTool, IsAwaited) {
    const std::string kept = m_root.path("options");
    // A script runs as a process of its shell, so the path of the shell is what identifies it.
    writeFile(m_tool, "#!" + m_root.copyProgram("/bin/sh", "NerovaMeasure.app/sh") +
                          "\ncp \"$1\" '" + kept + "'; sleep 2.5; echo samples > '" + m_samples +
                          "'\n");
    fs::permissions(m_tool, fs::perms(0755));
    EXPECT_EQ(launch(), 0);
    EXPECT_EQ(support::contentsOf(m_samples), "samples\n");
    EXPECT_EQ(support::contentsOf(kept), "-apnm\nNerova Verify\n-l\n88\n-pwd\n\"\"\n-i\n" +
                                             GetInstrumentNameFromID(21).utf8_string() +
                                             "\n-m\nmeasure\n-o\n" + m_samples + "\n-patch\n" +
                                             m_definition +
                                             "\n-patchname\nStr\xf6p 1.it8\n-createchart4meas\n"
                                             "False\n-forcemeasure\nTrue\n");
    EXPECT_FALSE(hasDefinition());
    EXPECT_TRUE(support::exists(m_root.path("job/NMPatchSetDefinition.dcf")));
    // The options file is not deleted.
    EXPECT_TRUE(std::ranges::any_of(fs::directory_iterator(m_temporary), [](const auto& entry) {
        return entry.path().filename().string().starts_with("NerovaMeasure");
    }));
}

TEST_F(MeasuringTool, NeedsAStripAndAProgram) {
    // First the folder exists without the program, then there is no folder.
    for (const int code : {1000, 7}) {
        int exitCode = 7;
        EXPECT_FALSE(Helper::LaunchNerovaMeasure({}, exitCode, true));
        EXPECT_EQ(exitCode, code);
        fs::remove_all(m_installed);
    }
    EXPECT_EQ(launch(), -2);
    EXPECT_FALSE(hasSamples() || hasDefinition());
    writeFile(m_samples, "old");
    writeFile(m_strip, "no size");
    EXPECT_EQ(launch(), -4);
    EXPECT_TRUE(hasDefinition());
    m_job.controlStripFile.clear();
    EXPECT_EQ(launch(), -3);
    EXPECT_TRUE(hasSamples()) << "nothing was to take their place";
}

TEST_F(MeasuringTool, GivesAStripOfTheDefinitionsNameBack) {
    for (const bool isLink : {false, true}) {
        fs::remove(m_strip);
        fs::create_symlink(m_definition, m_strip);
        m_job.controlStripFile = wide(isLink ? m_strip : m_definition);
        for (const std::string strip : {"NUMBER_OF_COLS 1\nx", "no size"}) {
            writeFile(m_definition, strip);
            EXPECT_EQ(launch(), strip == "no size" ? -4 : -2);
            EXPECT_EQ(support::contentsOf(m_definition), strip);
        }
    }
}

} // namespace
