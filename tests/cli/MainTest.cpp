// SPDX-License-Identifier: Apache-2.0
// The program's external behaviour: arguments in; exit code, standard output and files out.

#include <filesystem>
#include <regex>
#include <string>
#include <vector>

#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using support::contentsOf;
using support::Outcome;
using support::RunOptions;
using testing::EndsWith;

/// A folder for the program's files, which is also its temporary folder.
class MainTest : public testing::Test {
  protected:
    using Settings = std::map<std::string, std::optional<std::string>>;

    /// Runs the program with the library of the build.
    Outcome run(std::vector<std::string> arguments, Settings settings = {}) const {
        RunOptions options;
        options.environment = std::move(settings);
        options.environment.insert({"TMPDIR", m_folder.path()});
        arguments.insert(arguments.begin(), m_program);
        return support::run(arguments, options);
    }

    /// Runs the program with the scripted library, which answers according to the settings.
    Outcome runScripted(const std::vector<std::string>& arguments, Settings settings) const {
        m_folder.write("calls", "");
        settings.insert({"CALLS", m_folder.path("calls")});
        settings.insert({"LD_LIBRARY_PATH", TINTGATE_SCRIPTED_LIBRARY_FOLDER});
        return run(arguments, settings);
    }

    /// The calls of the scripted library, one per line.
    std::string calls() const { return contentsOf(m_folder.path("calls")); }

    support::ScratchFolder m_folder;
    std::string m_program = TINTGATE_PROGRAM;
};

TEST_F(MainTest, TheArgumentCountDecides) {
    const std::string hint = "To see usage please use argument -help\n";
    const std::string compared = "parse [x] false\nanalyze [t] [m] [";
    const struct {
        std::vector<std::string> arguments;
        int exitCode;
        std::string output, calls;
    } forms[] = {
        {{}, 5, hint, ""},
        {{"-version"}, 0, "1.6.20\n", ""},
        {{"-versiond"}, 0, "7.8.9\n", ""},
        {{"-Help"}, 22, "", "validate [-Help]\n"},
        {{"caf\xe9.ti3"}, 22, "", "validate [caf\xe9.ti3]\n"},
        {{"-help", "-help"}, 0, "", ""},
        {{"r", "p", "o"}, 34, "", "lab [r] [p] [o]\n"},
        {{"t", "m", "x", "/dev/stdout"}, 0, "{1}", compared + "] under parsed\n"},
        {{"t", "m", "x", "/dev/stdout", "s"}, 0, "{1}", compared + "s] under parsed\n"},
        {{"1", "2", "3", "4", "5", "6"}, 5, hint, ""},
        {{"1", "2", "3", "4", "5", "6", "7"}, 255, "", ""},
        {{"1", "2", "3", "4", "5", "6", "7", "8", "9"}, 5, hint, ""},
    };
    for (const auto& form : forms) {
        SCOPED_TRACE(testing::PrintToString(form.arguments));
        const Outcome outcome =
            runScripted(form.arguments, {{"VALIDATE", "22"}, {"LAB", "34"}, {"JSON", "{1}"}});
        EXPECT_EQ(outcome.exitCode, form.exitCode);
        EXPECT_EQ(outcome.output, form.output);
        EXPECT_EQ(outcome.error, "");
        EXPECT_EQ(calls(), form.calls);

        std::string log = "\targument 0: " TINTGATE_PROGRAM "\n";
        for (std::size_t i = 0; i < form.arguments.size(); ++i) {
            log += "\targument " + std::to_string(i + 1) + ": " + form.arguments[i] + "\n";
        }
        const std::regex stamp("\\w{3}, [0-9. :]{19}:\t");
        EXPECT_EQ(std::regex_replace(contentsOf(m_folder.path("Tintgate.log")), stamp, "\t"), log);
    }
}

TEST_F(MainTest, HelpHasItsLines) {
    const std::string text = run({"-help"}).output;
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 35);
    EXPECT_THAT(text, testing::HasSubstr("icc profile: \n")); // The blank at its end is required.
    EXPECT_THAT(text, EndsWith("\n" + std::string(86, '*') + "\n\n"));
}

// The job form is a separate module; the file forms work without it and without wx.
TEST_F(MainTest, RefusesJobsWithoutTheModule) {
    m_program = m_folder.path("Tintgate");
    std::filesystem::copy_file(TINTGATE_PROGRAM, m_program);
    EXPECT_EQ(runScripted({"file"}, {{"VALIDATE", "22"}}).exitCode, 22);
    const std::vector<std::string> job = {"KEY_KZ_HOST:=:h", "1", "7", "en_US", "0", "p", "u"};
    const Outcome refused = runScripted(job, {});
    EXPECT_EQ(refused.exitCode, 255);
    EXPECT_EQ(refused.output + refused.error, "");
}

// A caller that runs the program again must not lose the previous result.
TEST_F(MainTest, AFailedComparisonTouchesNoOutput) {
    const std::string old = m_folder.write("out.json", "last result");
    for (const char* failing : {"ANALYZE", "PARSE"}) {
        for (const std::string& path : {old, m_folder.path("new.json")}) {
            EXPECT_EQ(runScripted({"t", "m", "x", path}, {{failing, "47"}}).exitCode, 47);
        }
        EXPECT_EQ(contentsOf(old), "last result");
        EXPECT_FALSE(support::exists(m_folder.path("new.json")));
    }
    EXPECT_EQ(calls(), "parse [x] false\n");
}

// Another vendor's text may be non-ASCII, and long text is written in pieces.
TEST_F(MainTest, WritesEveryCharacterThroughALink) {
    std::string json;
    for (int i = 0; i < 10'000; ++i) {
        json += "\xe2\x82\xac\xf0\x9f\x8e\xa8x";
    }
    const std::string file = m_folder.write("out.json", std::string(200'000, 'x'));
    const std::string link = m_folder.path("r\xe9sultat");
    symlink("out.json", link.c_str());
    runScripted({"t", "m", "x", link}, {{"JSON", json}, {"LC_ALL", "C"}});
    EXPECT_TRUE(contentsOf(file) == json);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
}

TEST_F(MainTest, AnOutputThatCannotBeWrittenGives71) {
    const std::string little = "{}"; // Stays in the stream's buffer until it is closed.
    const std::pair<std::string, std::string> outputs[] = {
        {m_folder.path("missing/out.json"), little},
        {m_folder.makeFolder("folder"), little},
        {"/dev/full", little},
        {"/dev/full", std::string(100'000, 'x')},
    };
    for (const auto& [path, json] : outputs) {
        const Outcome outcome = runScripted({"t", "m", "x", path}, {{"JSON", json}});
        EXPECT_EQ(outcome.exitCode, 71) << path;
        EXPECT_EQ(outcome.output + outcome.error, "") << path;
    }
}

TEST_F(MainTest, TheLogFollowsTheTemporaryFolder) {
    const std::string first = m_folder.makeFolder("first");
    const std::string second = m_folder.makeFolder("second");
    const std::string missing = m_folder.path("missing");
    const struct {
        std::optional<std::string> tmpdir, tmp, temp;
        std::string expected;
    } cases[] = {
        {first, second, second, first},
        {missing, first, second, first},
        {"", std::nullopt, second, second},
    };
    for (const auto& [tmpdir, tmp, temp, expected] : cases) {
        EXPECT_EQ(run({"-version"}, {{"TMPDIR", tmpdir}, {"TMP", tmp}, {"TEMP", temp}}).exitCode,
                  0);
        EXPECT_TRUE(unlink((expected + "/Tintgate.log").c_str()) == 0) << expected;
        EXPECT_TRUE(std::filesystem::is_empty(first) && std::filesystem::is_empty(second));
    }
}

// Without a folder from the environment, the program creates one in /tmp, where other users may
// have been first. Only root can test that, as another user.
TEST_F(MainTest, AFolderOfTheUsersOwnIsMadeAndTrustedOnlyIfItIs) {
    if (geteuid() != 0) {
        return;
    }
    chmod(m_folder.path().c_str(), 0755);
    std::filesystem::copy(TINTGATE_PROGRAM, m_folder.path("Tintgate"));
    std::filesystem::copy(TINTGATE_SCRIPTED_LIBRARY, m_folder.path());
    RunOptions options;
    options.user = 2'000'000'000u + static_cast<unsigned>(getpid());
    options.environment = {{"TMPDIR", std::nullopt},
                           {"TMP", std::nullopt},
                           {"TEMP", std::nullopt},
                           {"LD_LIBRARY_PATH", m_folder.path()}};
    const auto runThere = [&] {
        EXPECT_EQ(support::run({m_folder.path("Tintgate"), "-version"}, options).exitCode, 0);
    };
    const std::string own = "/tmp/tintgate-" + std::to_string(options.user);
    const std::string log = own + "/Tintgate.log";
    runThere();
    EXPECT_EQ(support::modeOf(own), 0700u);
    EXPECT_THAT(contentsOf(log), EndsWith("\targument 1: -version\n"));
    unlink(log.c_str());
    support::giveTo(support::ordinaryUser, own);
    chmod(own.c_str(), 0777);
    runThere();
    EXPECT_FALSE(support::exists(log));
    rmdir(own.c_str());
}

} // namespace
