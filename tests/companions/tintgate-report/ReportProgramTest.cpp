#include <filesystem>
#include <string>
#include <vector>

#include <pty.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Browse.h"
#include "ExitCodes.h"
#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

namespace fs = std::filesystem;

const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";
const std::string jobPage = "report-strip2-2024-05-01-123456.html";

/// A folder with both files of a job's run.
class ReportProgram : public testing::Test {
  protected:
    ReportProgram() {
        for (const char* name : {"meta.json", "output.json"})
            fs::copy_file(data + name, m_scratch.path(name));
    }

    static support::Outcome report(std::vector<std::string> words,
                                   const support::RunOptions& options = {}) {
        words.insert(words.begin(), TINTGATE_REPORT);
        return support::run(words, options);
    }

    const support::ScratchFolder m_scratch;
    const std::string m_result = m_scratch.path("output.json");
};

TEST_F(ReportProgram, MakesTheVeryPageOfTheViewer) {
    const std::string page = m_scratch.path(jobPage);
    const support::Outcome first = report({m_result});
    EXPECT_EQ(first.exitCode, 0) << first.error;
    EXPECT_EQ(first.output, page + "\n");
    const std::string text = support::contentsOf(page);
    fs::remove(page);
    ASSERT_EQ(support::run({VIEWER, "-meta", m_scratch.path("meta.json")}).exitCode, 0);
    EXPECT_EQ(support::contentsOf(page), text);

    // Without a job: beside the result, under its name, and nothing is overwritten.
    const std::string alone = m_scratch.path("Auftrag ü.json");
    fs::copy_file(m_result, alone);
    m_scratch.write("Auftrag ü.html", "mine");
    EXPECT_EQ(report({alone}).output, m_scratch.path("Auftrag ü-2.html") + "\n");
    EXPECT_EQ(report({alone, "--meta", m_scratch.path("meta.json"), "-o", "-"}).output, text);
    EXPECT_EQ(report({alone, "-o", m_scratch.path("Auftrag ü.html")}).output, "");
    EXPECT_NE(support::contentsOf(m_scratch.path("Auftrag ü.html")), "mine");
}

TEST_F(ReportProgram, GivesThePatchesThatThePageExports) {
    EXPECT_EQ(report({"--csv", m_result}).output,
              "id,name,CMYK_C,CMYK_M,CMYK_Y,CMYK_K,target_L,target_a,target_b,measured_L,"
              "measured_a,measured_b,difference\n"
              "A1,paper,0,0,0,0,95,0,-2,95,0.5,-3,1.25\n"
              "'=2+5,\"\"\"><img src=x onerror=hostile()>\",100,0,0,0,55,-37,-50,52,-35,-46,4.75\n"
              ",,0,0,100,0,89,-5,93,88,-4,90,1.5\n"
              "A4,,0,0,0,100,16,0,0,,0,0,\n");
}

/// What a program writes to a terminal of its own.
std::string onTerminal(const std::vector<std::string>& words, const char* noColor) {
    int terminal = -1;
    const pid_t child = forkpty(&terminal, nullptr, nullptr, nullptr);
    if (child == 0) {
        setenv("TERM", "xterm", 1);
        if (noColor != nullptr)
            setenv("NO_COLOR", noColor, 1);
        else
            unsetenv("NO_COLOR");
        std::vector<char*> arguments;
        for (const std::string& word : words)
            arguments.push_back(const_cast<char*>(word.c_str()));
        arguments.push_back(nullptr);
        execv(arguments[0], arguments.data());
        _exit(127);
    }
    std::string text;
    char bytes[4096];
    for (ssize_t count; (count = read(terminal, bytes, sizeof bytes)) > 0;)
        text.append(bytes, static_cast<std::size_t>(count));
    close(terminal);
    waitpid(child, nullptr, 0);
    return text;
}

TEST_F(ReportProgram, SummarisesForATerminal) {
    const support::Outcome plain = report({"--text", m_result});
    for (const char* part :
         {"Failed  Größe \"7\"", "1 of 2 criteria are above tolerance.",
          "Solid cyan            4.75  of 3.00  ΔE00  1.75 above", "95th percentile 4.75",
          "  4.75  =2+5 ", "ΔL* -3.00  Δa* +2.00  Δb* +4.00", "! 2 patches <svg"})
        EXPECT_THAT(plain.output, HasSubstr(part));
    EXPECT_THAT(plain.output, Not(HasSubstr("\x1b")));

    const std::vector<std::string> words = {TINTGATE_REPORT, "--text", m_result};
    EXPECT_THAT(onTerminal(words, nullptr), HasSubstr("\x1b[1;31m"));
    EXPECT_THAT(onTerminal(words, ""), HasSubstr("\x1b[1;31m"));
    EXPECT_THAT(onTerminal(words, "1"), Not(HasSubstr("\x1b")));

    // A title must not reach the terminal as a command to it.
    std::string meta = support::contentsOf(m_scratch.path("meta.json"));
    meta.replace(meta.find("Gr\\u00f6"), 2, "\\u001b]0;owned\\u0007");
    m_scratch.write("meta.json", meta);
    EXPECT_THAT(onTerminal(words, nullptr), HasSubstr("\\x1B]0;owned\\x07"));
}

TEST_F(ReportProgram, SaysTheVerdictByItsExitStatusAlone) {
    const std::string whole = support::contentsOf(m_result);
    const auto with = [&](const std::string& verdict) {
        std::string text = whole;
        return text.replace(text.find("\"failed\""), 8, verdict);
    };
    const struct {
        std::string text;
        int exitCode;
    } cases[] = {{with("\"passed\""), 0},   {whole, 1},           {with("\"incomplete\""), 2},
                 {with("\"splendid\""), 2}, {whole.substr(9), 2}, {"", 2}};
    for (const auto& [text, exitCode] : cases) {
        m_scratch.write("output.json", text);
        const support::Outcome outcome = report({"--verdict", m_result});
        EXPECT_EQ(outcome.exitCode, exitCode) << text.substr(0, 200);
        EXPECT_EQ(outcome.output + outcome.error, "");
    }
    const support::Outcome missing = report({"--verdict", m_scratch.path("nothing.json")});
    EXPECT_EQ(missing.exitCode, 2);
    EXPECT_EQ(missing.error, "");
}

TEST_F(ReportProgram, ExplainsEveryExitCode) {
    for (const ExitCodeText& code : exitCodeTexts) {
        const support::Outcome outcome = report({"--explain", std::to_string(code.code)});
        std::string words = outcome.output;
        for (std::size_t at; (at = words.find("\n        ")) != words.npos;)
            words.replace(at, 9, " ");
        for (const char* text : {code.meaning, code.cause, code.remedy})
            EXPECT_THAT(words, HasSubstr(text + std::string(".\n")));
    }
    EXPECT_EQ(report({"--explain", "104"}).exitCode, 9);
    EXPECT_THAT(report({"--explain", "139"}).error, HasSubstr("signal"));
}

TEST_F(ReportProgram, EndsEachFaultInItsOwnStatus) {
    m_scratch.write("broken.json", "{\"format\":");
    m_scratch.makeFolder("folder.html");
    const struct {
        std::vector<std::string> words;
        int exitCode;
    } cases[] = {
        {{m_scratch.path("nothing.json")}, 3},
        {{m_result, "--meta", m_scratch.path("nothing.json")}, 3},
        {{m_scratch.path("broken.json")}, 4},
        {{m_result, "--meta", m_scratch.path("broken.json")}, 4},
        {{m_result, "-o", m_scratch.path("no/such/folder.html")}, 5},
        {{m_result, "-o", m_scratch.path("folder.html")}, 5},
        {{m_result, "--csv", "-o", "/dev/full"}, 5},
        {{}, 64},
        {{"--text"}, 64},
        {{"--text", "--csv", m_result}, 64},
        {{"--verdict"}, 64},
        {{"--explain", "x"}, 64},
        {{"--nonsense"}, 64},
    };
    for (const auto& [words, exitCode] : cases) {
        const support::Outcome outcome = report(words);
        EXPECT_EQ(outcome.exitCode, exitCode) << (words.empty() ? "" : words.back());
        EXPECT_NE(outcome.error, "");
        EXPECT_EQ(outcome.output, "");
    }
    support::RunOptions full;
    full.outputPath = "/dev/full";
    EXPECT_EQ(report({"--text", m_result}, full).exitCode, 5);
    for (const auto& entry : fs::directory_iterator(m_scratch.path()))
        EXPECT_THAT(entry.path().filename().string(), Not(ContainsRegex("^\\.report")));

    // A job's own meta file that is broken costs the result nothing but the job's title.
    m_scratch.write("meta.json", "{");
    const support::Outcome outcome = report({m_result, "-o", m_scratch.path("page.html")});
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_THAT(outcome.error, HasSubstr("goes without it"));
    EXPECT_THAT(support::contentsOf(m_scratch.path("page.html")), HasSubstr("\"measured.txt\""));
}

} // namespace
