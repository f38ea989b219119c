// SPDX-License-Identifier: Apache-2.0
#include <chrono>
#include <clocale>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include <signal.h>

#include <wx/init.h>

#include "RunningProgram.h"
#include "SuiteRoot.h"
#include "measure/Helper.h"

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr const char* suitePlist = "Qen/com.qen.packageversion.plist";
constexpr const char* measurePlist = "ApplicationsUsingNerovaMeasure.plist";
constexpr const char* measurePlist64 = "ApplicationsUsingNerovaMeasure_x64.plist";

std::string bytes(const wxString& text) {
    return text.utf8_string();
}

class HelperTest : public testing::Test {
  protected:
    // An unquoted command would split this name.
    HelperTest() : m_root("a root; (with) blanks & \xc3\xbc*") {
        setlocale(LC_CTYPE, "C.UTF-8");
        m_root.installPlistReader(PLIST_READER);
    }
    ~HelperTest() override { fs::current_path("/"); }

    // Writes a shell script at a path below the root.
    void writeScript(const std::string& name, const std::string& lines) const {
        const std::string path = m_root.copyProgram("/bin/sleep", name);
        std::ofstream(path) << "#!/bin/sh\n" << lines;
    }

    std::string makeFolder(const std::string& name) const {
        fs::create_directories(m_root.path(name));
        return m_root.path(name);
    }

    void makeFile(const std::string& name) const { m_root.copyProgram("/bin/true", name); }

    std::string value(const std::string& key) const {
        return bytes(Helper::GetAttributeValueFromPlist(
            wxString::FromUTF8(m_root.path("Library/Preferences/test.plist")),
            wxString::FromUTF8(key)));
    }

    const support::SuiteRoot m_root;
};

TEST_F(HelperTest, ReadsValuesThatAreOnlyValues) {
    const std::string hostile =
        "/a \"b\" 'c' $(touch " + m_root.path("ran") + ") `id` \\ & ; \xc3\xa4";
    m_root.writePreferences("test.plist", {{"hostile", hostile},
                                           {"blanks", "  /x \t "},
                                           {"lines", "first\nsecond"},
                                           {"long", std::string(300, 'x')}});
    EXPECT_EQ(value("hostile"), hostile);
    EXPECT_EQ(value("blanks") + "," + value("lines") + "," + value("missing"), "  /x,first,");
    EXPECT_EQ(value("long"), std::string(255, 'x'));
    EXPECT_FALSE(support::exists(m_root.path("ran")));
}

TEST_F(HelperTest, FindsTheSuite) {
    const auto expect = [](const std::string& folder) {
        EXPECT_EQ(bytes(Helper::GetHWBInstallationPath()), folder);
    };
    expect("");
    makeFile("Applications/Nerova/Hue Workbench 4/NerovaMeasure.app");
    expect(m_root.path("Applications/Nerova/Hue Workbench 4"));
    makeFile("Applications/Nerova/Nerova Hue Workbench.app");
    expect(m_root.path("Applications/Nerova"));
    for (const std::string name : {"installed", "library"}) {
        const std::string key = "Nerova Hue Workbench/" + name + "_path";
        const std::string folder = makeFolder(name);
        m_root.writePreferences(suitePlist, {{key, folder}});
        expect(folder);
        // Values are used as they are: this one is not looked up below the root.
        m_root.writePreferences(suitePlist, {{key, "/" + name}});
        expect(m_root.path("Applications/Nerova"));
    }
}

TEST_F(HelperTest, FindsTheMeasuringTool) {
    const auto expect = [](const std::string& folder) {
        EXPECT_EQ(bytes(Helper::GetNerovaMeasurePath(false)), folder);
        EXPECT_EQ(bytes(Helper::GetNerovaMeasurePath(true)),
                  folder.empty() ? "" : folder + "/NerovaMeasure.app/Contents/MacOS/NerovaMeasure");
    };
    // A bundle is a folder, but the fixed paths must be files.
    makeFolder("Applications/Nerova/NerovaMeasure.app");
    expect("");
    makeFile("Applications/Nerova/NerovaMeasure/NerovaMeasure.app");
    expect(m_root.path("Applications/Nerova/NerovaMeasure"));
    fs::remove(m_root.path("Applications/Nerova/NerovaMeasure.app"));
    makeFile("Applications/Nerova/NerovaMeasure.app");
    expect(m_root.path("Applications/Nerova"));
    for (const char* plist : {measurePlist, measurePlist64}) {
        const std::string folder = makeFolder(plist);
        m_root.writePreferences(plist, {{"installed_path", folder}});
        expect(folder);
    }
    fs::remove(m_root.path(measurePlist64));
    expect(m_root.path(measurePlist));
}

TEST_F(HelperTest, LooksThreeTimesForARunningApplication) {
    const auto secondsOf = [](const wxString& name, bool found) {
        const auto start = Clock::now();
        EXPECT_EQ(Helper::IsHWBAppsRunning(name, true), found);
        return std::chrono::duration<double>(Clock::now() - start).count();
    };
    const support::RunningProgram tool(
        m_root.copyProgram("/bin/sleep", "NerovaMeasure.app/MacOS/x"));
    EXPECT_LT(secondsOf("nerovameasure", false), 1.0);
    // An empty name means the whole suite; it is searched for and not ended.
    EXPECT_GE(secondsOf("", true), 2.0);
    EXPECT_EQ(tool.endingSignal(), 0);
}

class Viewer : public HelperTest {
  protected:
    // The script records its working folder and its arguments.
    void writeViewer(const std::string& name, const std::string& last = "") const {
        writeScript(name, "{ pwd; printf '%s\\n' \"${0##*/}\" \"$@\"; } > \"" + m_draft +
                              "\"\nmv \"" + m_draft + "\" \"" + m_report + "\"\n" + last);
    }

    std::string report() const {
        for (int i = 0; i < 500 && !support::exists(m_report); ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        const std::string text = support::contentsOf(m_report);
        fs::remove(m_report);
        return text;
    }

    const std::string m_macOS = "Applications/Nerova/Nerova Verify.app/Contents/MacOS/";
    const std::string m_viewer = m_macOS + "Nerova Verify";
    const std::string m_nwjs = m_macOS + "nwjs";
    const std::string m_folder = m_root.path("Applications/Nerova");
    const std::string m_draft = m_root.path("draft");
    const std::string m_report = m_root.path("report");
    const wxInitializer m_wx;
};

TEST_F(Viewer, IsStartedInItsFolder) {
    writeViewer(m_viewer);
    fs::current_path("/tmp");
    int exitCode = 7;
    const wxString arguments = L" -detail -meta /x/J\u00f6b \xdcff/\"a  b\"/meta.json";
    EXPECT_TRUE(Helper::LaunchNerovaVerify(exitCode, false, arguments, true));
    EXPECT_EQ(exitCode, 0);
    EXPECT_EQ(fs::current_path(), "/tmp");
    EXPECT_EQ(report(), m_folder + "\nNerova Verify\n-detail\n-meta\n/x/J\xc3\xb6"
                                   "b\n\xff/a  b/meta.json\n");

    writeViewer(m_nwjs, "exit 3");
    EXPECT_EQ(bytes(Helper::GetNerovaVerifyPath().GetFullPath()), m_root.path(m_nwjs));
    EXPECT_TRUE(Helper::LaunchNerovaVerify(exitCode, true, "", true));
    EXPECT_EQ(report(), m_folder + "\nnwjs\n");
    writeViewer(m_nwjs, "exit 255");
    EXPECT_FALSE(Helper::LaunchNerovaVerify(exitCode, true, "", true));
    EXPECT_EQ(exitCode, 0);

    fs::remove_all(m_root.path(m_macOS));
    EXPECT_FALSE(Helper::LaunchNerovaVerify(exitCode, false, "", true));
    EXPECT_EQ(exitCode, -1);
    EXPECT_EQ(fs::current_path(), m_folder) << "it is left where there is no viewer";
}

// The terminal may close before the viewer has started to ignore SIGHUP itself.
TEST_F(Viewer, SurvivesTheEndOfItsTerminal) {
    writeViewer(m_viewer);
    const std::string lines = support::contentsOf(m_root.path(m_viewer));
    writeScript(m_viewer, "kill -HUP $$\n" + lines);
    int exitCode = 7;
    EXPECT_TRUE(Helper::LaunchNerovaVerify(exitCode, false, " -x", true));
    EXPECT_EQ(report(), m_folder + "\nNerova Verify\n-x\n");
    struct sigaction own;
    sigaction(SIGHUP, nullptr, &own);
    EXPECT_EQ(own.sa_handler, SIG_DFL) << "of the tool";
}

TEST_F(Viewer, TakesThePlaceOfOneThatRuns) {
    const support::RunningProgram old(m_root.copyProgram("/bin/sleep", m_nwjs));
    const support::RunningProgram other(m_root.copyProgram("/bin/sleep", "Other.app/x"));
    fs::remove(m_root.path(m_nwjs)); // The process keeps running.
    writeViewer(m_viewer);
    int exitCode = 7;
    EXPECT_TRUE(Helper::LaunchNerovaVerify(exitCode, false, " -x", true));
    EXPECT_EQ(report(), m_folder + "\nNerova Verify\n-x\n");
    EXPECT_EQ(old.endingSignal(), SIGTERM);
    EXPECT_EQ(other.endingSignal(), 0);
}

} // namespace
