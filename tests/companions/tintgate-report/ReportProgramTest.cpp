// SPDX-License-Identifier: Apache-2.0
#include <filesystem>
#include <regex>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ExitCodes.h"
#include "ReportProgram.h"

namespace {

using testing::HasSubstr;
using testing::Not;

namespace fs = std::filesystem;

TEST_F(ReportProgram, MakesTheVeryPageOfTheViewer) {
    const std::string page = m_scratch.path("report-strip2-2024-05-01-123456.html");
    EXPECT_EQ(report({m_result}).output, page + "\n");
    EXPECT_EQ(support::modeOf(page) & 0444, 0444u);
    const std::string text = support::contentsOf(page);
    fs::remove(page);
    ASSERT_EQ(support::run({VIEWER, "-meta", m_meta}).exitCode, 0);
    EXPECT_EQ(support::contentsOf(page), text);

    // Outside a job's folder, the page goes next to the result and overwrites nothing.
    const std::string alone = m_scratch.path("Auftrag ü.json");
    fs::copy_file(m_result, alone);
    const std::string mine = m_scratch.write("Auftrag ü.html", "mine");
    EXPECT_EQ(report({alone}).output, m_scratch.path("Auftrag ü-2.html") + "\n");
    EXPECT_EQ(report({alone, "--meta", m_meta, "-o", "-"}).output, text);
    EXPECT_EQ(report({alone, "-o", mine}).output, "");
    EXPECT_NE(support::contentsOf(mine), "mine");

    // If the meta file is broken, only the title of the job is missing.
    m_scratch.write("meta.json", "{");
    const support::Outcome outcome = report({m_result, "-o", "-"});
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_THAT(outcome.error, HasSubstr("goes without it"));
    EXPECT_THAT(outcome.output, HasSubstr("\"measured.txt\""));
}

TEST_F(ReportProgram, GivesThePatchesThatThePageExports) {
    EXPECT_EQ(report({"--csv", m_result}).output,
              "id,name,CMYK_C,CMYK_M,CMYK_Y,CMYK_K,target_L,target_a,target_b,measured_L,"
              "measured_a,measured_b,difference,measured_id,measured_name\n"
              "A1,paper,0,0,0,0,95,0,-2,95,0.5,-3,1.25,A1,paper\n"
              "'=2+5,\"\"\"><img src=x onerror=hostile()>\",100,0,0,0,55,-37,-50,52,-35,-46,4.75,"
              "'=2+5,\"\"\"><img src=x onerror=hostile()>\"\n"
              ",,0,0,100,0,89,-5,93,88,-4,90,1.5,,\n"
              "A4,,0,0,0,100,16,0,0,,0,0,,A4,\n");
}

TEST_F(ReportProgram, SummarisesForATerminal) {
    const support::Outcome plain = report({"--text", m_result});
    for (const char* part :
         {"Failed  Größe \"7\"", "1 of 2 criteria are above tolerance.",
          "Solid cyan            4.75  of 3.00  ΔE00  1.75 above", "95th percentile 4.75",
          "  4.75  =2+5 ", "ΔL* -3.00  Δa* +2.00  Δb* +4.00", "! 2 patches <svg"}) {
        EXPECT_THAT(plain.output, HasSubstr(part));
    }
    EXPECT_THAT(plain.output, Not(HasSubstr("\x1b")));

    // A title must not send commands to the terminal.
    std::string meta = support::contentsOf(m_meta);
    meta.replace(meta.find("Gr\\u00f6"), 2, "\\u001b]0;owned\\u0007");
    m_scratch.write("meta.json", meta);
    for (const char* noColor : {"", "1"}) {
        support::RunOptions options;
        options.environment = {{"TERM", "xterm"}, {"NO_COLOR", noColor}};
        const std::string command = TINTGATE_REPORT " --text '" + m_result + "'";
        const std::string shown =
            support::run({"script", "-qec", command, "/dev/null"}, options).output;
        EXPECT_EQ(shown.find("\x1b[1;31m") != shown.npos, *noColor == '\0') << shown;
        EXPECT_THAT(shown, HasSubstr("\\x1B]0;owned\\x07"));
    }
}

TEST_F(ReportProgram, SaysTheVerdictByItsExitStatusAlone) {
    const std::string whole = support::contentsOf(m_result);
    const auto with = [&](const std::string& verdict) {
        std::string text = whole;
        return text.replace(text.find("\"failed\""), 8, verdict);
    };
    const std::pair<std::string, int> cases[] = {{with("\"passed\""), 0},
                                                 {whole, 1},
                                                 {with("\"incomplete\""), 2},
                                                 {with("\"splendid\""), 2}};
    for (const auto& [text, exitCode] : cases) {
        m_scratch.write("output.json", text);
        const support::Outcome outcome = report({"--verdict", m_result});
        EXPECT_EQ(outcome.exitCode, exitCode);
        EXPECT_EQ(outcome.output + outcome.error, "");
    }
}

TEST_F(ReportProgram, ExplainsExitCodes) {
    const auto explained = [&](int code) {
        const std::string words = report({"--explain", std::to_string(code)}).output;
        return std::regex_replace(words, std::regex("\\s+"), " ");
    };
    for (const ExitCodeText& code : exitCodeTexts) {
        const std::string words = explained(code.code);
        EXPECT_THAT(words,
                    AllOf(HasSubstr(code.meaning), HasSubstr(code.cause), HasSubstr(code.remedy)));
        EXPECT_EQ(words.find(" Job ") != std::string::npos, code.jobActor != nullptr) << words;
        if (code.jobActor != nullptr) {
            EXPECT_THAT(words,
                        AllOf(HasSubstr(code.jobCause), HasSubstr(code.jobActor),
                              HasSubstr(code.jobRetry), HasSubstr("tintgate-store diagnose")));
            // If the cause is the same in a job, it is not repeated.
            EXPECT_EQ(words.find(code.jobCause), words.rfind(code.jobCause)) << words;
        }
    }
    EXPECT_EQ(report({"--explain", "104"}).exitCode, 9);
    EXPECT_THAT(report({"--explain", "139"}).error, HasSubstr("signal"));
}

TEST_F(ReportProgram, ChecksPresets) {
    const std::string sound = TINTGATE_SOURCE_DIR "/presets/CVP_0001.xml";
    EXPECT_THAT(report({"--check-preset", sound}).output,
                AllOf(HasSubstr("sound"), HasSubstr("preset 1, ")));
    std::string text = support::contentsOf(sound);
    const std::size_t used = text.rfind("used=\"yes\""); // The first one is in a comment.
    const auto line = std::count(text.begin(), text.begin() + std::ptrdiff_t(used), '\n') + 1;
    const std::string broken = m_scratch.write("preset.xml", text.replace(used, 10, "used=\"y\""));
    const support::Outcome outcome = report({"--check-preset", broken});
    EXPECT_EQ(outcome.exitCode, 4);
    EXPECT_THAT(outcome.error, AllOf(HasSubstr(broken + ":" + std::to_string(line) + ": used of <"),
                                     HasSubstr(": y (exit code 47)")));
}

TEST_F(ReportProgram, EndsEachFaultInItsOwnStatus) {
    const std::string broken = m_scratch.write("broken.json", "{\"format\":");
    const std::string missing = m_scratch.path("nothing.json");
    const std::string folder = m_scratch.makeFolder("pages/folder.html");
    const std::pair<std::vector<std::string>, int> cases[] = {
        {{missing}, 3},
        {{broken}, 4},
        {{m_result, "-o", folder}, 5},
        {{m_result, "--csv", "-o", "/dev/full"}, 5},
        {{"--check-preset", missing}, 3},
        {{"--check-preset", broken}, 4},
        {{"--check-preset", broken, missing}, 64},
        {{"--text"}, 64},
    };
    for (const auto& [words, exitCode] : cases) {
        const support::Outcome outcome = report(words);
        EXPECT_EQ(outcome.exitCode, exitCode) << words.back();
        EXPECT_NE(outcome.error, "");
        EXPECT_EQ(outcome.output, "");
    }
    support::RunOptions full;
    full.outputPath = "/dev/full";
    EXPECT_EQ(report({"--text", m_result}, full).exitCode, 5);
    EXPECT_EQ(std::distance(fs::directory_iterator(m_scratch.path("pages")), {}), 1);
}

TEST_F(ReportProgram, WritesInTheLanguageOfTheJobTheLocaleOrTheOption) {
    std::string meta = support::contentsOf(m_meta);
    const std::string english = "\"language\": \"en\"";
    ASSERT_NE(meta.find(english), meta.npos);
    meta.replace(meta.find(english), english.size(), "\"language\": \"de_DE\"");
    m_scratch.write("meta.json", meta);
    const std::string alone = m_scratch.path("alone.json");
    fs::copy_file(m_result, alone);
    support::RunOptions french;
    french.environment = {{"LANGUAGE", std::nullopt}, {"LC_ALL", "fr_FR.UTF-8"}};
    const struct {
        std::vector<std::string> words;
        const char* language;
        const char* word;
    } cases[] = {
        {{m_result, "-o", "-"}, "<html lang=\"de\"", ">Nicht bestanden<"},
        {{m_result, "-o", "-", "--language", "ja"}, "<html lang=\"ja\"", ">不合格<"},
        {{alone, "-o", "-"}, "<html lang=\"fr\"", ">Non conforme<"},
        {{m_result, "--text"}, "", "✕ Non conforme"},
        {{m_result, "--text", "--language", "es"}, "", "✕ No conforme"},
        {{m_result, "--trend", "-o", "-"}, "<html lang=\"fr\"", "1 résultat de fichiers"},
    };
    for (const auto& [words, language, word] : cases) {
        const std::string text = report(words, french).output;
        EXPECT_THAT(text, HasSubstr(language)) << testing::PrintToString(words);
        EXPECT_THAT(text, HasSubstr(word)) << testing::PrintToString(words);
    }
    french.environment["LC_ALL"] = "C";
    EXPECT_THAT(report({alone, "--text"}, french).output, HasSubstr("Failed"));
    EXPECT_EQ(report({alone, "--language", "tlh"}).exitCode, 64);
    // Data stay as they are.
    EXPECT_EQ(report({m_result, "--csv", "--language", "de"}).output,
              report({m_result, "--csv"}).output);
}

} // namespace
