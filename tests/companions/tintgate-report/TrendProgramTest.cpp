// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Browse.h"

namespace {

using testing::HasSubstr;
using testing::Not;

namespace fs = std::filesystem;

const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";

std::string replaced(std::string text, const std::string& part, const std::string& other) {
    const std::size_t at = text.find(part);
    EXPECT_NE(at, text.npos) << part;
    return text.replace(at, part.size(), other);
}

std::string twoDigits(int number) {
    return (number < 10 ? "0" : "") + std::to_string(number);
}

support::Outcome report(std::vector<std::string> words) {
    words.insert(words.begin(), TINTGATE_REPORT);
    return support::run(words);
}

/// Jobs on successive days. Their cyan grows lighter by 0.5 a day. All have the hostile texts of
/// the test data, except for the paper of the first five.
class Trend : public testing::Test {
  protected:
    static constexpr int jobs = 24;

    Trend() {
        std::string result = support::contentsOf(data + "output.json");
        for (int job = 1; job <= jobs; ++job) {
            const std::string folder = "rooms #1/JobID_" + std::to_string(job);
            std::string meta = support::contentsOf(data + "meta.json");
            meta = replaced(meta, "2024-05-01", "2024-05-" + twoDigits(job));
            meta = replaced(meta, "4711", std::to_string(job));
            if (job <= 5) {
                meta = replaced(meta, "\"'\\\"><img src=x onerror=hostile()>\"", "\"Gloss\"");
            }
            m_scratch.write(folder + "/meta.json", meta);
            if (job == 11) {
                result = replaced(result, "\"tolerance\":3,", "\"tolerance\":2.25,");
            }
            m_scratch.write(folder + "/output.json",
                            replaced(result, "[52,", "[" + std::to_string(52 + 0.5 * job) + ","));
        }
    }

    const support::ScratchFolder m_scratch;
    const std::string m_rooms = m_scratch.path("rooms #1");
    const std::string m_page = m_scratch.path("trend.html");
};

TEST_F(Trend, ShowsADriftAndLeadsToEachJob) {
    ASSERT_EQ(support::run({VIEWER, "-meta", m_rooms + "/JobID_7/meta.json"}).exitCode, 0);
    for (int times = 0; times < 2; ++times) { // The second run adds nothing.
        ASSERT_EQ(report({m_rooms, "-o", m_page}).exitCode, 0);
    }
    const fs::path pages = m_scratch.path("trend-jobs");
    EXPECT_EQ(std::distance(fs::directory_iterator(pages), {}), jobs - 1);
    for (int job = 8; job <= jobs; ++job) {
        EXPECT_TRUE(fs::exists(pages / ("job-" + std::to_string(job) + "-strip2-2024-05-" +
                                        twoDigits(job) + "-123456.html")));
    }

    const support::Outcome seen = support::browseHandled(m_scratch, m_page, R"(
        const choose = (i) => document.querySelectorAll("#series button")[i].click();
        choose(1);
        seen("second", `${text("word")} ${text("range")} ${text("title").slice(0, 5)}`);
        seen("charts", document.querySelectorAll("#drift canvas").length);
        find("failed");
        seen("failed", text("range"));
        find("no such job");
        seen("none", text("range"));
        find("");
        choose(0);)");
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part :
         {"<h2 id=\"word\">Drifting: cyan</h2>", "lighter (L*&nbsp;+",
          // Each job keeps the tolerance that it was judged by.
          "\"tolerances\":[[0,3.0],[5,2.25]]", "19 of the last 19 failed, most often by Solid cyan",
          "<b>Solid cyan</b><span>latest job 4.75 of 2.25 ΔE00 · 19 of 19 above</span>",
          "<b>All patches, average</b><span>latest job 2.50 of 2.50 ΔE00 · 0 of 19 above</span>",
          "aria-label=\"Solid cyan: latest job 4.75 of 2.25 ΔE00 · 19 of 19 above\"",
          "<b>Cyan</b><span>Drifting · L*a*b* first jobs ", ", aim 55.0 -37.0 -50.0</span>",
          // The latest job, and the average that a correction is based on, each with its name.
          "<span class=\"label\">Latest job</span>4.75<span class=\"unit\"> of 2.25</span>",
          "<span class=\"label\">Moving average to aim</span><b>6.45 ΔE00</b>",
          "<span class=\"correction\">L*&nbsp;+7.05, a*&nbsp;+2.00, b*&nbsp;+4.00</span>",
          "1–19 of 19</output>", "19 jobs, 6 May 2024 to 24 May 2024: 0 passed, 19 failed",
          "<a href=\"./trend-jobs/job-24-strip2-2024-05-24-123456.html\">Größe \"7\" "
          "&lt;/script&gt;",
          "<a href=\"./rooms%20%231/JobID_7/report-strip2-2024-05-07-123456.html\">",
          "<td>24 May 2024, 12:34</td>", "<td>Solid cyan 4.75 of 2.25</td>",
          "[second: Too few jobs 1–5 of 5 Gloss]", "[charts: 3]", "[failed: 1–5 of 5]",
          "[none: None found]"}) {
        EXPECT_THAT(seen.output, HasSubstr(part));
    }
    for (const char* part : {"<img", "<svg", "hostile()</script"}) {
        EXPECT_THAT(seen.output, Not(HasSubstr(part)));
    }
}

TEST_F(Trend, TakesWhatTheFiltersLetThrough) {
    m_scratch.write("rooms #1/other.json", "{\"format\": \"another\"}");
    const struct {
        std::vector<std::string> words;
        int exitCode;
        const char* jobs = "";
    } cases[] = {{{"--since", "2024-05-20"}, 0, "5 results, 20 May 2024 to 24 May 2024"},
                 {{"--until", "2024-05-02"}, 0, "2 results, 1 May 2024 to 2 May 2024"},
                 {{"--paper", "IMG SRC"}, 0, "19 results"},
                 {{"--preset", "1"}, 0, "19 results"},
                 {{"--instrument", "instrument 45"}, 0, "19 results"},
                 {{"--workflow", "<!--"}, 0, "19 results"},
                 {{"--preset", "2"}, 7},
                 {{"--since", "yesterday"}, 64}};
    for (const auto& [words, exitCode, jobs] : cases) {
        std::vector<std::string> all = {m_rooms, "--text"};
        all.insert(all.end(), words.begin(), words.end());
        const support::Outcome outcome = report(all);
        EXPECT_EQ(outcome.exitCode, exitCode) << words.back() << outcome.error;
        EXPECT_THAT(outcome.output, HasSubstr(jobs));
    }
}

// Formats of dates from measuring programs. A date that can mean two days counts as missing.
TEST(TrendTimes, AreThoseOfTheMeasurementsIfTheyCannotBeMistaken) {
    const support::ScratchFolder scratch;
    const std::string result = support::contentsOf(data + "output.json");
    const std::string undated = "\"path\":\"/m/measured.txt\",\"kind\":\"text\",\"patches\":4,"
                                "\"description\":null,\"originator\":null,\"created\":";
    const struct {
        const char* created;
        const char* shown; ///< Empty if the time of the file is used instead.
    } cases[] = {{"2026-11-25T09:15:00+01:00", "25 November 2026, 09:15"},
                 {"Wed Nov 25 09:15:07 2026", "25 November 2026, 09:15"},
                 {"11/21/2026  # Time: 09:15", "21 November 2026, 09:15"},
                 {"11/05/2026 # Time: 9:15", "5 November 2026, 09:15"},
                 {"11/21/2026", "21 November 2026, 00:00"},
                 {"21/11/2026 09:15", "21 November 2026, 09:15"},
                 {"11/11/2026", "11 November 2026, 00:00"},
                 {"11/05/2026", ""},
                 {"2013/10/29", "29 October 2013, 00:00"},
                 {"August 21, 2018  15:47", "21 August 2018, 15:47"},
                 {"20.11.2026", "20 November 2026, 00:00"},
                 {"05.11.2026", ""},
                 {"31/31/2026", ""},
                 {"December 2006", ""},
                 {"11/21/26", ""}};
    for (const auto& [created, shown] : cases) {
        const std::string file =
            scratch.write("dated.json", replaced(result, undated + "null",
                                                 undated + "\"" + std::string(created) + "\""));
        const std::string text = report({"--trend", "--text", file}).output;
        EXPECT_THAT(text, HasSubstr(shown)) << created;
        EXPECT_EQ(text.find("does not tell its time") != text.npos, *shown == '\0') << created;
    }
}

// Two versions of a target, two printers, three folders: any difference starts a series.
TEST(TrendSeries, JoinNothingThatWasAimedAtOtherColours) {
    const support::ScratchFolder scratch;
    const std::string result = support::contentsOf(data + "output.json");
    const std::string first(32, 'a');
    const std::string second(32, 'b');
    const struct {
        const char* file;
        std::string identity;
        std::string printer;
        const char* path = "/t/aim.txt";
    } results[] = {{"a/1", first, "P1"},
                   {"a/2", second, "P1"},
                   {"b/3", second, "P1"},
                   {"b/4", second, "P2"},
                   {"c/5", "", "P1"},
                   {"c/6", "", "P1"},
                   {"c/7", first, "P1"},
                   {"c/8", "", "P1", "/t/other.txt"},
                   {"c/9", first, "P1", "/elsewhere/aim.txt"}};
    for (const auto& [file, identity, printer, path] : results) {
        std::string text = replaced(result, "/t/<img src=x onerror=hostile()>.txt", path);
        if (!identity.empty()) {
            text = replaced(text, "\"kind\"", "\"identity\":\"" + identity + "\",\"kind\"");
        }
        const std::string measured = "\"path\":\"/m/measured.txt\",";
        text = replaced(text, measured, measured + "\"printing\":\"" + printer + "\",");
        scratch.write(std::string(file) + ".json", text);
    }
    const auto namesOf = [&](std::vector<std::string> words) {
        words.insert(words.begin(), {TINTGATE_REPORT, scratch.path("a"), scratch.path("b"),
                                     scratch.path("c"), "--text"});
        support::RunOptions options;
        options.folder = scratch.path();
        std::vector<std::string> names;
        std::istringstream lines(support::run(words, options).output);
        for (std::string line, above; std::getline(lines, line); above = line) {
            if (line.find(" results, ") != line.npos || line.find(" result, ") != line.npos) {
                names.push_back(line.substr(0, 1) + above.substr(above.find("  ") + 1));
            }
        }
        std::sort(names.begin(), names.end());
        return names;
    };
    const std::string preset = " · aim.txt · Proof \"A\" <b>";
    const auto p1 = [&](const char* count, const std::string& rest) {
        return std::string(count) + " P1" + preset + rest;
    };
    EXPECT_THAT(namesOf({}), testing::ElementsAre("1 P1 · other.txt · Proof \"A\" <b>",
                                                  "1 P2" + preset, p1("2", " · target bbbbbbbb"),
                                                  p1("2", " · target known by its name only"),
                                                  p1("3", " · target aaaaaaaa")));
    const std::vector<std::string> byFolder = namesOf({"--series", "folder"});
    EXPECT_EQ(byFolder.size(), 7U);
    EXPECT_THAT(byFolder, testing::Contains("1 a · P1" + preset + " · target bbbbbbbb"));
    EXPECT_THAT(byFolder, testing::Contains("1 b · P1" + preset));
    EXPECT_EQ(report({"--store", "/nowhere", "--series", "folder"}).exitCode, 64);
}

TEST_F(Trend, GoesOnWithoutWhatItCantRead) {
    const std::string whole = support::contentsOf(m_rooms + "/JobID_1/output.json");
    const std::string alone = m_scratch.write("alone.json", whole);
    const std::string cut = m_scratch.write("cut.json", whole.substr(0, 900));
    const support::Outcome outcome =
        report({alone, cut, m_scratch.path("none.json"), "-o", "-", "--no-pages"});
    EXPECT_EQ(outcome.exitCode, 6);
    EXPECT_THAT(outcome.error, HasSubstr("cut.json is broken"));
    EXPECT_THAT(outcome.output, HasSubstr("2 files could not be read and are left out."));
    EXPECT_THAT(outcome.output, HasSubstr("1 result does not tell its time"));
}

} // namespace
