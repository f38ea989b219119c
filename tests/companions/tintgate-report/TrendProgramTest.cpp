#include <filesystem>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Browse.h"
#include "RunProgram.h"
#include "ScratchFolder.h"

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

support::Outcome report(std::vector<std::string> words, const support::RunOptions& options = {}) {
    words.insert(words.begin(), TINTGATE_REPORT);
    return support::run(words, options);
}

/// Jobs on successive days whose cyan grows lighter by 0.5 a day; all of them carry the hostile
/// texts of the data.
class Trend : public testing::Test {
  protected:
    static constexpr int jobs = 24;

    Trend() {
        const std::string result = support::contentsOf(data + "output.json");
        const std::string meta = support::contentsOf(data + "meta.json");
        for (int job = 1; job <= jobs; ++job) {
            const std::string folder = "rooms/JobID_" + std::to_string(job);
            m_scratch.makeFolder("rooms");
            m_scratch.makeFolder(folder);
            m_scratch.write(folder + "/meta.json",
                            replaced(replaced(meta, "2024-05-01", "2024-05-" + twoDigits(job)),
                                     "4711", std::to_string(job)));
            const std::string lightness = std::to_string(52 + 0.5 * job);
            m_scratch.write(folder + "/output.json",
                            replaced(result, "[52,", "[" + lightness + ","));
        }
    }

    const support::ScratchFolder m_scratch;
    const std::string m_rooms = m_scratch.path("rooms");
    const std::string m_page = m_scratch.path("trend.html");
};

TEST_F(Trend, ShowsADriftAndLeadsToEachJob) {
    const support::Outcome made = report({m_rooms, "-o", m_page});
    ASSERT_EQ(made.exitCode, 0) << made.error;
    const support::Outcome seen = support::browse(m_page, m_scratch.path("browser"));
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part :
         {"<h2 id=\"word\">Drifting: cyan</h2>", "lighter (L* +",
          "<b>Solid cyan</b><span>latest 4.75 of 3.00 ΔE00 · 24 of 24 above</span>",
          "<b>All patches, average</b><span>latest 2.50 of 2.50 ΔE00 · 0 of 24 above</span>",
          "aria-label=\"Solid cyan: latest 4.75 of 3.00 ΔE00 · 24 of 24 above\"",
          "<b>Cyan</b><span>Drifting · L*a*b* 53.8 -35.0 -46.0 →", "1–24 of 24</output>",
          "24 jobs, 1 May 2024 to 24 May 2024: 0 passed, 24 failed",
          "<a href=\"./trend-jobs/job-24-strip2-2024-05-24-123456.html\">Größe \"7\" "
          "&lt;/script&gt;",
          "<td>24 May 2024, 12:34</td>", "<td>Solid cyan 4.75 of 3.00</td>"})
        EXPECT_THAT(seen.output, HasSubstr(part));
    for (const char* part : {"<img", "<svg", "hostile()</script"})
        EXPECT_THAT(seen.output, Not(HasSubstr(part)));
    for (int job = 1; job <= jobs; ++job)
        EXPECT_TRUE(
            support::exists(m_scratch.path("trend-jobs/job-" + std::to_string(job) +
                                           "-strip2-2024-05-" + twoDigits(job) + "-123456.html")));

    // The viewer's own pages are taken where they are, and making it all again adds nothing.
    ASSERT_EQ(support::run({VIEWER, "-meta", m_rooms + "/JobID_3/meta.json"}).exitCode, 0);
    ASSERT_EQ(report({m_rooms, "-o", m_page}).exitCode, 0);
    EXPECT_THAT(support::contentsOf(m_page),
                HasSubstr("./rooms/JobID_3/report-strip2-2024-05-03-123456.html"));
    EXPECT_EQ(std::distance(fs::directory_iterator(m_scratch.path("trend-jobs")), {}), jobs);
}

// A person's hand: a script in the page, which its policy has to let in for once.
TEST_F(Trend, TurnsToAnotherSeriesAndFindsJobs) {
    for (int job = 1; job <= 5; ++job) {
        const std::string meta = m_rooms + "/JobID_" + std::to_string(job) + "/meta.json";
        fs::permissions(meta, fs::perms(0644));
        m_scratch.write("rooms/JobID_" + std::to_string(job) + "/meta.json",
                        replaced(support::contentsOf(meta),
                                 "\"'\\\"><img src=x onerror=hostile()>\"", "\"Gloss\""));
    }
    ASSERT_EQ(report({m_rooms, "-o", m_page, "--no-pages"}).exitCode, 0);
    std::string page = support::contentsOf(m_page);
    const std::size_t policy = page.find("<meta http-equiv=\"Content-Security-Policy\"");
    page.erase(policy, page.find('\n', policy) - policy);
    page.insert(page.rfind("</body>"), R"(<script>
        const seen = (name, text) => { document.body.append(`\n[${name}: ${text}]\n`); };
        const text = (id) => document.getElementById(id).textContent;
        const find = (words) => {
            document.getElementById("find").value = words;
            document.getElementById("find").dispatchEvent(new Event("input"));
        };
        seen("first", text("word"));
        document.querySelectorAll("#series button")[1].click();
        seen("second", `${text("word")} ${text("range")} ${text("title").slice(0, 5)}`);
        seen("charts", document.querySelectorAll("#drift canvas").length);
        find("failed");
        seen("failed", text("range"));
        find("no such job");
        seen("none", text("range"));
    </script>)");
    const support::Outcome shown =
        support::browse(m_scratch.write("handled.html", page), m_scratch.path("browser"));
    EXPECT_THAT(shown.error, Not(HasSubstr("CONSOLE")));
    for (const char* part : {"[first: Drifting: cyan]", "[second: Too few jobs 1–5 of 5 Gloss]",
                             "[charts: 3]", "[failed: 1–5 of 5]", "[none: None found]"})
        EXPECT_THAT(shown.output, HasSubstr(part));
}

TEST_F(Trend, TakesWhatTheFiltersLetThrough) {
    m_scratch.write("rooms/other.json", "{\"format\": \"another\"}");
    const struct {
        std::vector<std::string> words;
        const char* jobs; ///< Of the terminal's text; null: nothing fits.
    } cases[] = {{{}, "24 results, 1 May 2024 to 24 May 2024"},
                 {{"--since", "2024-05-20"}, "5 results, 20 May 2024 to 24 May 2024"},
                 {{"--until", "2024-05-02"}, "2 results, 1 May 2024 to 2 May 2024"},
                 {{"--paper", "IMG SRC"}, "24 results"},
                 {{"--preset", "1"}, "24 results"},
                 {{"--preset", "proof"}, "24 results"},
                 {{"--instrument", "instrument 45"}, "24 results"},
                 {{"--workflow", "<!--"}, "24 results"},
                 {{"--paper", "gloss"}, nullptr},
                 {{"--preset", "2"}, nullptr},
                 {{"--instrument", "46"}, nullptr},
                 {{"--since", "30d"}, nullptr}};
    for (const auto& [words, jobs] : cases) {
        std::vector<std::string> all = {m_rooms, "--text"};
        all.insert(all.end(), words.begin(), words.end());
        const support::Outcome outcome = report(all);
        EXPECT_EQ(outcome.exitCode, jobs != nullptr ? 0 : 7) << outcome.error;
        EXPECT_THAT(outcome.output, HasSubstr(jobs != nullptr ? jobs : ""));
    }
    for (const std::vector<std::string>& words :
         std::vector<std::vector<std::string>>{{m_rooms, "--since", "yesterday"},
                                               {m_rooms, "--csv"},
                                               {m_rooms, "--verdict"},
                                               {m_rooms, "--store", m_rooms}})
        EXPECT_EQ(report(words).exitCode, 64) << words[1];
}

TEST_F(Trend, GoesOnWithoutWhatItCantRead) {
    const std::string good = m_rooms + "/JobID_1/output.json";
    const std::string alone = m_scratch.path("alone.json");
    fs::copy_file(good, alone);
    m_scratch.write("cut.json", support::contentsOf(good).substr(0, 900));
    const support::Outcome outcome =
        report({alone, m_scratch.path("cut.json"), m_scratch.path("none.json"), "-o", m_page,
                "--no-pages"});
    EXPECT_EQ(outcome.exitCode, 6);
    EXPECT_THAT(outcome.error, HasSubstr("cut.json is broken"));
    EXPECT_THAT(outcome.error, HasSubstr("none.json is not there"));
    const std::string page = support::contentsOf(m_page);
    EXPECT_THAT(page, HasSubstr("2 files could not be read and are left out."));
    EXPECT_THAT(page, HasSubstr("1 result does not tell its time"));
    EXPECT_FALSE(support::exists(m_scratch.path("trend-jobs")));

    EXPECT_EQ(report({m_scratch.path("cut.json"), m_scratch.path("none.json")}).exitCode, 3);
    EXPECT_EQ(report({m_rooms, "-o", m_scratch.path("no/such/trend.html")}).exitCode, 5);
}

} // namespace
