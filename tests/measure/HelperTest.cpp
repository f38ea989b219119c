#include <chrono>
#include <clocale>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include <signal.h>
#include <sys/stat.h>

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

double secondsOf(const auto& work) {
    const auto start = Clock::now();
    work();
    return std::chrono::duration<double>(Clock::now() - start).count();
}

class HelperTest : public testing::Test {
  protected:
    // A name that an unquoted command would fall apart on.
    HelperTest() : m_root("a root; (with) blanks & \xc3\xbc*") {
        setlocale(LC_CTYPE, "C.UTF-8");
        m_root.installPlistReader(PLIST_READER);
    }
    ~HelperTest() override { fs::current_path("/"); }

    // A shell script at a path of the root.
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
                                           {"long", std::string(300, 'x')},
                                           {"empty", ""},
                                           {"dict/in:side", "nested"}});
    EXPECT_EQ(value("hostile"), hostile);
    EXPECT_FALSE(support::exists(m_root.path("ran")));
    EXPECT_EQ(value("blanks"), "  /x");
    EXPECT_EQ(value("lines"), "first");
    EXPECT_EQ(value("long"), std::string(255, 'x'));
    EXPECT_EQ(value("empty"), "");
    EXPECT_EQ(value("missing"), "");
    EXPECT_EQ(value("'dict':'in:side'"), "nested");
}

TEST_F(HelperTest, RunsTheCommandForExistingFilesOnly) {
    fs::remove(m_root.path("usr/libexec/Plistbuddy"));
    const std::string log = m_root.path("log");
    writeScript("usr/libexec/Plistbuddy", "printf '%s|' \"$0\" \"$@\" > \"" + log + "\"\n");
    EXPECT_EQ(value("key"), "");
    EXPECT_FALSE(support::exists(log));
    m_root.writePreferences("test.plist", {});
    EXPECT_EQ(value("'a b':c"), ""); // It prints nothing.
    EXPECT_EQ(support::contentsOf(log), m_root.path("usr/libexec/Plistbuddy") +
                                            "|-c|Print :'a b':c|" +
                                            m_root.path("Library/Preferences/test.plist") + "|");
}

TEST_F(HelperTest, FindsTheSuite) {
    const auto expect = [](const std::string& folder) {
        EXPECT_EQ(bytes(Helper::GetHWBInstallationPath()), folder);
    };
    expect("");
    // Bundles are folders, and the fixed places ask for files.
    const std::string workbench = makeFolder("Applications/Nerova/Hue Workbench 4");
    makeFolder("Applications/Nerova/Hue Workbench 4/NerovaMeasure.app");
    expect("");
    fs::remove(workbench + "/NerovaMeasure.app");
    makeFile("Applications/Nerova/Hue Workbench 4/NerovaMeasure.app");
    expect(workbench);
    makeFile("Applications/Nerova/Nerova Hue Workbench.app");
    expect(m_root.path("Applications/Nerova"));

    const std::string installed = makeFolder("installed");
    m_root.writePreferences(suitePlist, {{"Nerova Hue Workbench/installed_path", installed}});
    expect(installed);
    const std::string library = makeFolder("library");
    m_root.writePreferences(suitePlist, {{"Nerova Hue Workbench/library_path", library}});
    expect(library);
    // Values are paths of their own: this one is not looked for below the root.
    m_root.writePreferences(suitePlist, {{"Nerova Hue Workbench/library_path", "/library"}});
    expect(m_root.path("Applications/Nerova"));
}

TEST_F(HelperTest, FindsTheMeasuringTool) {
    const auto expect = [](const std::string& folder) {
        EXPECT_EQ(bytes(Helper::GetNerovaMeasurePath(false)), folder);
        EXPECT_EQ(bytes(Helper::GetNerovaMeasurePath(true)),
                  folder.empty() ? "" : folder + "/NerovaMeasure.app/Contents/MacOS/NerovaMeasure");
    };
    expect("");
    makeFile("Applications/Nerova/NerovaMeasure/NerovaMeasure.app");
    expect(m_root.path("Applications/Nerova/NerovaMeasure"));
    makeFile("Applications/Nerova/NerovaMeasure.app");
    expect(m_root.path("Applications/Nerova"));
    const std::string second = makeFolder("second");
    m_root.writePreferences(measurePlist, {{"installed_path", second}});
    expect(second);
    const std::string first = makeFolder("first");
    m_root.writePreferences(measurePlist64, {{"installed_path", first}});
    expect(first);
    fs::remove(first);
    expect(second);
}

TEST_F(HelperTest, LooksThreeTimesForARunningApplication) {
    EXPECT_LT(secondsOf([] { EXPECT_FALSE(Helper::IsNMRunning()); }), 0.9);

    const support::RunningProgram tool(
        m_root.copyProgram("/bin/sleep", "NerovaMeasure.app/MacOS/x"));
    const double watching = secondsOf([] { EXPECT_TRUE(Helper::IsNMRunning()); });
    EXPECT_GE(watching, 2.0);
    EXPECT_LT(watching, 2.9);
    EXPECT_FALSE(Helper::IsHWBAppsRunning("nerovameasure", false));
    EXPECT_FALSE(Helper::IsHWBAppsRunning("NerovaMeasure.app", false));
    // The empty name stands for the suite, and ends nothing.
    EXPECT_TRUE(Helper::IsHWBAppsRunning("", true));

    // Seen and ended by the first look, gone at the second.
    const double ending =
        secondsOf([] { EXPECT_TRUE(Helper::IsHWBAppsRunning("NerovaMeasure", true)); });
    EXPECT_GE(ending, 1.0);
    EXPECT_LT(ending, 1.9);
    EXPECT_EQ(tool.endingSignal(), SIGTERM);
}

class Viewer : public HelperTest {
  protected:
    // Writes its working folder and its arguments down.
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
}

TEST_F(Viewer, IsNotStartedWhereItCannotBe) {
    makeFolder("Applications/Nerova");
    fs::current_path("/tmp");
    int exitCode = 7;
    EXPECT_FALSE(Helper::LaunchNerovaVerify(exitCode, false, "", true));
    EXPECT_EQ(exitCode, -1);
    EXPECT_EQ(fs::current_path(), m_folder);

    fs::current_path("/tmp");
    testing::internal::CaptureStderr();
    for (const bool isFolder : {false, true}) {
        writeViewer(m_viewer);
        chmod(m_root.path(m_viewer).c_str(), 0644);
        if (isFolder) {
            makeFolder(m_nwjs);
        }
        for (const bool wait : {false, true}) {
            EXPECT_FALSE(Helper::LaunchNerovaVerify(exitCode, wait, "", true)) << isFolder << wait;
            EXPECT_EQ(exitCode, 0);
            EXPECT_EQ(fs::current_path(), "/tmp");
        }
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST_F(Viewer, TakesThePlaceOfOneThatRuns) {
    const support::RunningProgram old(m_root.copyProgram("/bin/sleep", m_nwjs));
    const support::RunningProgram other(m_root.copyProgram("/bin/sleep", "Other.app/x"));
    fs::remove(m_root.path(m_nwjs)); // Its process goes on.
    writeViewer(m_viewer);
    int exitCode = 7;
    EXPECT_TRUE(Helper::LaunchNerovaVerify(exitCode, false, " -x", true));
    EXPECT_EQ(report(), m_folder + "\nNerova Verify\n-x\n");
    EXPECT_EQ(old.endingSignal(), SIGTERM);
    EXPECT_EQ(other.endingSignal(), 0);
}

} // namespace
