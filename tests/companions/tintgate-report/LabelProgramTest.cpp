// SPDX-License-Identifier: Apache-2.0
#include <filesystem>
#include <string>
#include <utime.h>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ReportProgram.h"

namespace {

using testing::HasSubstr;

namespace fs = std::filesystem;

class LabelProgram : public ReportProgram {
  protected:
    static std::string read(const std::vector<std::string>& command) {
        return support::run(command).output;
    }
};

TEST_F(LabelProgram, MakesLabelAndCertificateWithWhatTheCommandLineStates) {
    const std::string label = m_scratch.path("label.pdf");
    const std::string certificate = m_scratch.path("certificate.PDF");
    const support::Outcome made =
        report({m_result, "--label", label, "--label-size", "4x3in", "--pdf", certificate,
                "--sheet", "letter", "--operator", "Anna Müller", "--label-field", "paper=用紙=235",
                "--label-field=software=[RIP] 7"});
    EXPECT_EQ(made.exitCode, 0) << made.error;
    EXPECT_EQ(made.output, "");
    EXPECT_THAT(read({"pdfinfo", label}), HasSubstr("288 x 216 pts"));
    EXPECT_THAT(read({"pdfinfo", certificate}), HasSubstr("(letter)"));
    for (const std::string& file : {label, certificate}) {
        const std::string text = read({"pdftotext", file, "-"});
        for (const char* part : {"FAILED", "Größe \"7\" </", "Anna Müller", "用紙=235", "[RIP] 7",
                                 "1 May 2024, 12:34", "Solid cyan", "4.75"}) {
            EXPECT_THAT(text, HasSubstr(part)) << file;
        }
    }

    // The paper that is usual in the user's country, without --sheet.
    const auto sheetWith = [&](const char* locale) {
        support::RunOptions options;
        options.environment = {{"LC_ALL", std::nullopt}, {"LC_PAPER", locale}};
        EXPECT_EQ(report({m_result, "--pdf", certificate}, options).exitCode, 0);
        return read({"pdfinfo", certificate});
    };
    EXPECT_THAT(sheetWith("C"), HasSubstr("(A4)"));

    // What has no room is said; a missing file makes nothing and leaves an old label alone.
    const support::Outcome small = report({m_result, "--label", label, "--label-size", "50x25mm"});
    EXPECT_EQ(small.exitCode, 0);
    EXPECT_THAT(small.error, HasSubstr("has no room for: "));
    const std::string before = support::contentsOf(label);
    EXPECT_EQ(report({m_scratch.path("none.json"), "--label", label}).exitCode, 3);
    EXPECT_TRUE(support::contentsOf(label) == before);
    EXPECT_EQ(report({m_result, "--label", m_scratch.path("none/label.pdf")}).exitCode, 5);
    support::RunOptions withoutFonts;
    withoutFonts.environment = {
        {"FONTCONFIG_FILE", m_scratch.write("fonts.conf", "<fontconfig></fontconfig>")}};
    const support::Outcome undrawn = report({m_result, "--label", label}, withoutFonts);
    EXPECT_EQ(undrawn.exitCode, 13) << undrawn.error;
    EXPECT_TRUE(support::contentsOf(label) == before);
}

TEST_F(LabelProgram, TakesTheDateFromJobMeasurementOrFile) {
    std::string result = support::contentsOf(m_result);
    const auto codeOf = [&](const std::string& file) {
        const std::string label = m_scratch.path("label.png");
        EXPECT_EQ(report({file, "--label", label}).exitCode, 0);
        return read({"zbarimg", "--quiet", "--raw", "--nodbus", label});
    };
    EXPECT_THAT(codeOf(m_result), HasSubstr(" 2024-05-01T12:34:56+02:00 "));
    EXPECT_THAT(codeOf(m_result), HasSubstr(" JOB:4711/2"));
    const std::string alone = m_scratch.write("alone.json", result);
    const utimbuf noon = {0, 1'749'297'600}; // 2025-06-07 12:00 UTC
    utime(alone.c_str(), &noon);
    EXPECT_THAT(codeOf(alone), HasSubstr(" 2025-06-0"));
    EXPECT_THAT(codeOf(alone), HasSubstr(" FILE:measured.txt"));
    const std::size_t created = result.rfind("\"created\":null");
    result.replace(created, 14, "\"created\":\"Tue Nov 24 21:53:07 2026\"");
    EXPECT_THAT(codeOf(m_scratch.write("measured.json", result)), HasSubstr(" 2026-11-24T21:53 "));
}

TEST_F(LabelProgram, SaysWhetherALabelAndAResultBelongTogether) {
    const std::string label = m_scratch.path("label.png");
    ASSERT_EQ(report({m_result, "--label", label, "--label-dpi", "203"}).exitCode, 0);
    const std::string text = read({"zbarimg", "--quiet", "--raw", "--nodbus", label});
    std::string claimed = text;
    claimed.replace(claimed.find("FAILED"), 6, "PASSED");
    std::string bytes = support::contentsOf(m_result);
    bytes.replace(bytes.find("4.75"), 4, "2.75");
    const std::string changed = m_scratch.write("changed.json", bytes);
    struct {
        std::string result, text;
        int status;
        const char* words;
    } const cases[] = {
        {m_result, text, 0, "belongs to this result"},
        {m_result, "QR-Code:" + text, 0, "belongs to this result"},
        {m_result, claimed, 11, "states another verdict"},
        {changed, text, 11, "belongs to another result, or the result was changed"},
        {m_result, "https://example.org", 12, "not that of a label"},
        {m_scratch.path("none.json"), text, 3, ""},
    };
    for (const auto& [result, given, status, words] : cases) {
        const support::Outcome outcome = report({result, "--match", given});
        EXPECT_EQ(outcome.exitCode, status) << outcome.error;
        EXPECT_THAT(outcome.output, HasSubstr(words));
    }
    const support::Outcome piped =
        support::run({"sh", "-c",
                      "zbarimg --quiet --raw --nodbus '" + label + "' | '" TINTGATE_REPORT "' '" +
                          m_result + "' --match -"});
    EXPECT_EQ(piped.exitCode, 0) << piped.output << piped.error;
}

TEST_F(LabelProgram, RefusesCommandLinesThatMakeNoSense) {
    const std::string label = m_scratch.path("label.pdf");
    const std::vector<std::vector<std::string>> lines = {
        {m_result, "--label", m_scratch.path("label.jpg")},
        {m_result, "--label", "pdf"},
        {m_result, "--pdf", m_scratch.path("sheet.png")},
        {m_result, "--label", label, "--label-size", "10x10mm"},
        {m_result, "--label", label, "--label-dpi", "20"},
        {m_result, "--label", label, "--label-field", "colour=red"},
        {m_result, "--label", label, "--label-field", "paper"},
        {m_result, "--label", label, "--sheet", "A3"},
        {m_result, "--label", label, "--pdf", label},
        {m_result, "--label", label, "--text"},
        {m_result, "--label", label, "-o", label},
        {m_result, "--label", label, "--match", "x"},
        {m_result, m_result, "--label", label},
        {m_scratch.path(), "--label", label},
        {"--explain", "5", "--label", label},
    };
    for (const auto& line : lines) {
        EXPECT_EQ(report(line).exitCode, 64) << testing::PrintToString(line);
    }
    EXPECT_FALSE(support::exists(label));
}

} // namespace
