// The program as its callers see it: arguments in; exit code, standard output and files out.

#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include <fcntl.h>
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

constexpr char hint[] = "To see usage please use argument -help\n";

/// A folder that is the program's temporary folder and holds its files.
class MainTest : public testing::Test {
  protected:
    /// Runs the program with the library of the build.
    Outcome run(std::vector<std::string> arguments, RunOptions options = {}) const {
        options.environment.insert({"TMPDIR", m_folder.path()});
        arguments.insert(arguments.begin(), TINTGATE_PROGRAM);
        return support::run(arguments, options);
    }

    /// Runs the program with the scripted library, which answers as `script` says.
    Outcome runScripted(const std::vector<std::string>& arguments,
                        std::map<std::string, std::optional<std::string>> script = {},
                        RunOptions options = {}) const {
        unlink(callsPath().c_str());
        script.insert({"CALLS", callsPath()});
        script.insert({"LD_LIBRARY_PATH", TINTGATE_SCRIPTED_LIBRARY_FOLDER});
        options.environment.insert(script.begin(), script.end());
        return run(arguments, options);
    }

    /// What the scripted library was asked, a line for each call.
    std::string calls() const {
        return support::exists(callsPath()) ? contentsOf(callsPath()) : std::string();
    }
    std::string callsPath() const { return m_folder.path("calls"); }

    support::ScratchFolder m_folder;
};

TEST_F(MainTest, TheArgumentCountDecides) {
    const struct {
        std::vector<std::string> arguments;
        int exitCode;
        std::string output;
        std::string calls;
    } forms[] = {
        {{}, 5, hint, ""},
        {{"-version"}, 0, "1.6.20\n", ""},
        {{"-versiond"}, 0, "7.8.9\n", ""},
        {{"-Help"}, 22, "", "validate [-Help]\n"},
        {{"-help "}, 22, "", "validate [-help ]\n"},
        {{""}, 22, "", "validate []\n"},
        {{"caf\xc3\xa9 \xe2\x82\xac.ti3"}, 22, "", "validate [caf\xc3\xa9 \xe2\x82\xac.ti3]\n"},
        {{"caf\xe9.ti3"}, 22, "", "validate [caf\xe9.ti3]\n"},
        {{"-help", "-help"}, 0, "", ""},
        {{"r", "p", "o"}, 34, "", "lab [r] [p] [o]\n"},
        {{"t", "m", "x", "/dev/stdout"},
         0,
         "{1}",
         "parse [x] false\nanalyze [t] [m] [] under parsed\n"},
        {{"t", "m", "x", "/dev/stdout", ""},
         0,
         "{1}",
         "parse [x] false\nanalyze [t] [m] [] under parsed\n"},
        {{"t", "m", "x", "/dev/stdout", "s"},
         0,
         "{1}",
         "parse [x] false\nanalyze [t] [m] [s] under parsed\n"},
        {{"1", "2", "3", "4", "5", "6"}, 5, hint, ""},
        {{"1", "2", "3", "4", "5", "6", "7"}, 255, "", ""},
        {{"1", "2", "3", "4", "5", "6", "7", "8"}, 255, "", ""},
        {{"1", "2", "3", "4", "5", "6", "7", "8", "9"}, 5, hint, ""},
    };
    for (const auto& form : forms) {
        const Outcome outcome =
            runScripted(form.arguments, {{"VALIDATE", "22"}, {"LAB", "34"}, {"JSON", "{1}"}});
        const std::string what = testing::PrintToString(form.arguments);
        EXPECT_EQ(outcome.exitCode, form.exitCode) << what;
        EXPECT_EQ(outcome.output, form.output) << what;
        EXPECT_EQ(outcome.error, "") << what;
        EXPECT_EQ(calls(), form.calls) << what;

        std::string log;
        int index = 0;
        for (const std::string& argument : form.arguments) {
            log += "\targument " + std::to_string(++index) + ": " + argument + "\n";
        }
        const std::regex stamp("\\w{3}, [0-9. :]{19}:\t");
        EXPECT_EQ(std::regex_replace(contentsOf(m_folder.path("Tintgate.log")), stamp, "\t"),
                  "\targument 0: " TINTGATE_PROGRAM "\n" + log);
    }
}

TEST_F(MainTest, HelpHasItsLines) {
    const Outcome outcome = run({"-help"});
    EXPECT_EQ(outcome.exitCode, 0);
    std::istringstream text(outcome.output);
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);) {
        lines.push_back(line);
    }
    ASSERT_EQ(lines.size(), 35u);
    for (const int bar : {7, 18, 20, 25, 27, 34}) {
        EXPECT_EQ(lines[bar - 1], std::string(86, '*')) << bar;
    }
    for (const int empty : {2, 6, 19, 26, 35}) {
        EXPECT_EQ(lines[empty - 1], "") << empty;
    }
    EXPECT_THAT(lines[27], EndsWith("icc profile: "));
    EXPECT_THAT(outcome.output, EndsWith("*\n\n"));
}

// A caller that starts the program anew must not lose the result that it has.
TEST_F(MainTest, AFailedComparisonTouchesNoOutput) {
    const std::string output = m_folder.write("out.json", "last result");
    for (const char* failing : {"PARSE", "ANALYZE"}) {
        EXPECT_EQ(runScripted({"t", "m", "x", output}, {{failing, "47"}}).exitCode, 47);
        EXPECT_EQ(contentsOf(output), "last result");
        EXPECT_EQ(
            runScripted({"t", "m", "x", m_folder.path("new.json")}, {{failing, "47"}}).exitCode,
            47);
        EXPECT_FALSE(support::exists(m_folder.path("new.json")));
    }
    EXPECT_EQ(runScripted({"t", "m", "x", output}, {{"PARSE", "47"}, {"ANALYZE", "30"}}).exitCode,
              47);
    EXPECT_EQ(calls(), "parse [x] false\n");
}

TEST_F(MainTest, WritesTheResultWhereItIsTold) {
    const std::string file = m_folder.write("out.json", std::string(1000, 'x'));
    const std::string link = m_folder.path("link.json");
    ASSERT_EQ(symlink("out.json", link.c_str()), 0);
    const std::string strange = m_folder.path("r\xe9sultat.json");
    for (const std::string& path : {file, link, strange}) {
        EXPECT_EQ(runScripted({"t", "m", "x", path}, {{"JSON", "{\"a\": 1}"}}).exitCode, 0);
        EXPECT_EQ(contentsOf(path), "{\"a\": 1}") << path;
    }
    struct stat status;
    EXPECT_EQ(lstat(link.c_str(), &status), 0);
    EXPECT_TRUE(S_ISLNK(status.st_mode));
}

// Another vendor's text need not be ASCII, and a long one is written in pieces.
TEST_F(MainTest, ResultsKeepEveryCharacterInEveryLocale) {
    std::string json;
    for (int i = 0; i < 20'000; ++i) {
        json += i % 3 == 0 ? "\xe2\x82\xac" : i % 3 == 1 ? "\xf0\x9f\x8e\xa8" : "x";
    }
    for (const char* locale : {"C", "POSIX", "C.UTF-8", "de_DE.ISO-8859-1", "no_such"}) {
        const Outcome outcome =
            runScripted({"t", "m", "x", "/dev/stdout"}, {{"JSON", json}, {"LC_ALL", locale}});
        EXPECT_EQ(outcome.exitCode, 0) << locale;
        EXPECT_TRUE(outcome.output == json) << locale;
    }
}

TEST_F(MainTest, AnOutputThatCannotBeWrittenGives71) {
    const std::string longText(100'000, 'x');
    const struct {
        std::string path;
        std::string json;
    } outputs[] = {
        {m_folder.path("missing/out.json"), "{}"},
        {m_folder.makeFolder("folder"), "{}"},
        {"", "{}"},
        {"/dev/full", "{}"}, // Held in the stream's buffer until it is closed.
        {"/dev/full", longText},
    };
    for (const auto& output : outputs) {
        const Outcome outcome = runScripted({"t", "m", "x", output.path}, {{"JSON", output.json}});
        EXPECT_EQ(outcome.exitCode, 71) << output.path;
        EXPECT_EQ(outcome.output + outcome.error, "") << output.path;
    }
}

// With the library of the build, on a name that is no valid UTF-8.
TEST_F(MainTest, WorksOnRealFiles) {
    const std::string icc = "/usr/share/color/icc/";
    const std::string profile = icc + "ghostscript/default_cmyk.icc";
    const std::string preset = TINTGATE_SOURCE_DIR "/presets/CVP_0001.xml";
    const std::string target = m_folder.path("papier \xe9.ti3");
    ASSERT_EQ(symlink((icc + "FOGRA39L.ti3").c_str(), target.c_str()), 0);
    const std::string lab = m_folder.path("lab \xe9.it8");
    const struct {
        std::vector<std::string> arguments;
        int exitCode;
        std::string inOutput;
    } runs[] = {
        {{target}, 0, ""},
        {{profile}, 0, ""},
        {{preset}, 22, ""},
        {{m_folder.path("missing")}, 20, ""},
        {{target, profile, lab}, 0, ""},
        {{lab}, 0, ""},
        {{target, icc + "FOGRA40L.ti3", preset, "/dev/stdout"}, 0, "\"mean\": 3.932947"},
        {{profile, profile, preset, "/dev/stdout", target}, 0, "\"maximum\": 0"},
        {{profile, profile, preset, "/dev/stdout"}, 27, ""},
        {{target, lab, m_folder.path("missing"), "/dev/stdout"}, 40, ""},
    };
    for (const auto& [arguments, exitCode, inOutput] : runs) {
        const Outcome outcome = run(arguments);
        const std::string what = testing::PrintToString(arguments);
        EXPECT_EQ(outcome.exitCode, exitCode) << what;
        EXPECT_THAT(outcome.output, testing::HasSubstr(inOutput)) << what;
        EXPECT_EQ(outcome.output.empty(), inOutput.empty()) << what;
    }
}

// As an ordinary user, from a copy that one can reach.
TEST_F(MainTest, PermissionsGive71AndNoLogIsNoFailure) {
    const std::string bin = m_folder.makeFolder("bin");
    std::filesystem::copy(TINTGATE_PROGRAM, bin + "/Tintgate");
    std::filesystem::copy(TINTGATE_SCRIPTED_LIBRARY, bin);
    const std::string result = m_folder.write("result.json", "last result");
    chmod(result.c_str(), 0444);
    const std::string own = m_folder.makeFolder("own");
    chmod(m_folder.path().c_str(), 0555);
    support::giveTo(support::ordinaryUser, own);

    RunOptions options;
    options.user = support::ordinaryUser;
    options.environment = {{"TMPDIR", m_folder.path()},
                           {"LD_LIBRARY_PATH", bin},
                           {"CALLS", own + "/calls"},
                           {"JSON", "{}"}};
    for (const std::string& path : {result, m_folder.path("new.json")}) {
        EXPECT_EQ(support::run({bin + "/Tintgate", "t", "m", "x", path}, options).exitCode, 71);
    }
    EXPECT_EQ(support::run({bin + "/Tintgate", "t", "m", "x", own + "/new.json"}, options).exitCode,
              0);
    EXPECT_EQ(contentsOf(result), "last result");
    EXPECT_FALSE(support::exists(m_folder.path("Tintgate.log")));
    chmod(m_folder.path().c_str(), 0755); // To be removed by whoever runs the test.
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
        {std::nullopt, first, second, first},
        {missing, first, second, first},
        {"", std::nullopt, second, second},
    };
    for (const auto& [tmpdir, tmp, temp, expected] : cases) {
        RunOptions options;
        options.environment = {{"TMPDIR", tmpdir}, {"TMP", tmp}, {"TEMP", temp}};
        EXPECT_EQ(run({"-version"}, options).exitCode, 0);
        EXPECT_TRUE(support::exists(expected + "/Tintgate.log")) << expected;
        EXPECT_EQ(support::modeOf(expected + "/Tintgate.log"), 0600u);
        for (const std::string& folder : {first, second}) {
            unlink((folder + "/Tintgate.log").c_str());
        }
    }
}

// Without a folder of the environment's, one is made in /tmp, where others may have been before.
// Root alone can do so as a user of this test's own.
TEST_F(MainTest, AFolderOfTheUsersOwnIsMadeAndTrustedOnlyIfItIs) {
    if (geteuid() != 0) {
        return;
    }
    const std::string bin = m_folder.makeFolder("bin");
    std::filesystem::copy(TINTGATE_PROGRAM, bin + "/Tintgate");
    std::filesystem::copy(TINTGATE_SCRIPTED_LIBRARY, bin);
    chmod(m_folder.path().c_str(), 0755);
    RunOptions options;
    options.user = 2'000'000'000u + static_cast<unsigned>(getpid());
    options.environment = {{"TMPDIR", std::nullopt},
                           {"TMP", std::nullopt},
                           {"TEMP", std::nullopt},
                           {"LD_LIBRARY_PATH", bin}};
    const std::string own = "/tmp/tintgate-" + std::to_string(options.user);

    EXPECT_EQ(support::run({bin + "/Tintgate", "-version"}, options).exitCode, 0);
    EXPECT_EQ(support::modeOf(own), 0700u);
    EXPECT_THAT(contentsOf(own + "/Tintgate.log"), EndsWith("\targument 1: -version\n"));

    unlink((own + "/Tintgate.log").c_str());
    support::giveTo(support::ordinaryUser, own);
    chmod(own.c_str(), 0777);
    EXPECT_EQ(support::run({bin + "/Tintgate", "-version"}, options).exitCode, 0);
    EXPECT_FALSE(support::exists(own + "/Tintgate.log"));
    rmdir(own.c_str());

    const std::string victim = m_folder.makeFolder("victim");
    support::giveTo(options.user, victim);
    ASSERT_EQ(symlink(victim.c_str(), own.c_str()), 0);
    EXPECT_EQ(support::run({bin + "/Tintgate", "-version"}, options).exitCode, 0);
    EXPECT_FALSE(support::exists(victim + "/Tintgate.log"));
    unlink(own.c_str());
}

} // namespace
