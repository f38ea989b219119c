#include <filesystem>
#include <functional>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using nlohmann::json;
using testing::AllOf;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

namespace fs = std::filesystem;

std::string dateOf(int job) {
    return "2026-11-" + std::string(job < 10 ? "0" : "") + std::to_string(job);
}

/// Values by the server's position for results.
json measuredOf(double cyan) {
    json values = std::vector<double>(27, 0.5);
    values[0] = cyan;
    values[4] = 0.25;
    values[5] = 1.125;
    values[12] = -1.0;
    return values;
}

json approvalsOf(bool cyan) {
    json approvals = std::vector<int>(27, 1);
    approvals[0] = cyan ? 1 : 0;
    return approvals;
}

/// The keys that a run leaves for a job of that number and day, whose cyan grows lighter.
json jobOf(int job, const std::string& root = "Remote/Measurement", const std::string& two = "") {
    const double cyan = 0.3 * job;
    const bool passes = cyan <= 3;
    json keys = {{"Input/Title", {{"string", "Order " + std::to_string(job)}}},
                 {"CMM/PaperName", {{"string", "Matt <b>"}}},
                 {"Workflow/Name", {{"string", "Press 2"}}},
                 {"System/InstallFolder", {{"string", "/server"}}},
                 {"Workflow/Verify/ComparisonMethod" + two, {{"int", 1}}},
                 {"Workflow/Verify/DeltaEMode" + two, {{"int", 4}}},
                 {"Footer/ControlstripFile" + two, {{"string", "/x/y/example.tif"}}},
                 {root + "/Status", {{"int", 1}}},
                 {root + "/Approval", {{"int", passes ? 1 : 0}}},
                 {root + "/Date", {{"string", dateOf(job)}}},
                 {root + "/Time", {{"string", "21:53:07"}}},
                 {root + "/Values/Measured", {{"double", measuredOf(cyan)}}},
                 {root + "/Values/Approval", {{"int", approvalsOf(passes)}}},
                 {root + "/CMYKValues/CValues", {{"double", {0, 100, 0, 99.6, 50}}}},
                 {root + "/CMYKValues/MValues", {{"double", {0, 0, 100, 0, 50}}}},
                 {root + "/CMYKValues/YValues", {{"double", {0, 0, 0, 0, 50}}}},
                 {root + "/CMYKValues/KValues", {{"double", {0, 0, 0, 0, 50}}}},
                 {root + "/LabValues/LValues", {{"double", {95, 54 + cyan, 48, 56 + cyan, 30}}}},
                 {root + "/LabValues/AValues", {{"double", {0, -37, 74, -37, 0}}}},
                 {root + "/LabValues/BValues", {{"double", {-2, -50, -3, -50, 0}}}}};
    return {{"type", 3}, {"id", job}, {"keys", keys}};
}

class StoreTrend : public testing::Test {
  protected:
    static constexpr int jobs = 12;

    StoreTrend() {
        administer({"make"});
        putFile("/server/tickets/CVP_0001.xml",
                support::contentsOf(TINTGATE_SOURCE_DIR "/presets/CVP_0001.xml"));
        putFile("/server/ControlCharts/example.it8", "IT8.7/2\nDEVICE 33\n");
        std::vector<json> tickets = {presetTicket(1)};
        for (int job = 1; job <= jobs; ++job)
            tickets.push_back(jobOf(job));
        import(tickets);
        m_scratch.makeFolder("Tintgate");
    }

    static json presetTicket(int id) {
        return {{"type", 27}, {"id", id}, {"keys", {{"Name", {{"string", "Contract proof"}}}}}};
    }

    void administer(std::vector<std::string> words) const {
        words.insert(words.begin(), {TINTGATE_STORE_PROGRAM, "--store", m_store});
        const support::Outcome outcome = support::run(words);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
    }
    void putFile(const std::string& path, const std::string& text) const {
        administer({"file", "put", m_scratch.write("file", text), path});
    }
    void import(const std::vector<json>& tickets) const {
        const json file = {{"format", "tintgate tickets"}, {"version", 1}, {"tickets", tickets}};
        administer({"import", m_scratch.write("tickets.json", file.dump())});
    }
    void change(json ticket, const std::function<void(json& keys)>& work) const {
        work(ticket["keys"]);
        import({ticket});
    }

    support::Outcome report(std::vector<std::string> words) const {
        support::RunOptions options;
        options.environment["TMPDIR"] = m_scratch.path();
        options.environment["TINTGATE_INSTRUMENTS"] = m_scratch.write("names", "33 = Bench 3\n");
        words.insert(words.begin(), {TINTGATE_REPORT, "--store", m_store});
        return support::run(words, options);
    }
    std::string text() const { return report({"--text"}).output; }

    const support::ScratchFolder m_scratch;
    const std::string m_store = m_scratch.path("store");
};

TEST_F(StoreTrend, ReadsTheResultsOfJobs) {
    EXPECT_THAT(text(),
                AllOf(HasSubstr("Drifting: cyan  Matt <b> · Contract proof · Bench 3 · Press 2"),
                      HasSubstr("12 results, 1 November 2026 to 12 November 2026: 10 passed, 2 "
                                "failed, 0 incomplete"),
                      ContainsRegex("Cyan +3.60 +of 3.00 +above"),
                      ContainsRegex("Paper white +0.25 +of 3.00 "),
                      ContainsRegex("All patches, average +1.13 +of 2.50 +ΔE00 +0 of 12 above"),
                      ContainsRegex("Solid cyan +3.60 +of 3.00 +ΔE00 +2 of 12 above"),
                      HasSubstr("12 November 2026, 21:53  Order 12  Solid cyan 3.60 of 3.00"),
                      Not(HasSubstr("!"))));
    EXPECT_THAT(report({"--text", "--since", "2026-11-11"}).output, HasSubstr("2 results"));
    EXPECT_THAT(report({"--text", "--instrument", "bench"}).output, HasSubstr("12 results"));
    EXPECT_EQ(report({"--text", "--paper", "gloss"}).exitCode, 7);

    // Both patches of full cyan count, and the page holds the same numbers.
    const std::string page = m_scratch.path("trend.html");
    ASSERT_EQ(report({"-o", page}).exitCode, 0);
    EXPECT_THAT(support::contentsOf(page),
                AllOf(HasSubstr("\"began\":\"55.9 -37.0 -50.0\""),
                      HasSubstr("[0.3,0.6,0.9,1.2,1.5"), Not(HasSubstr("Matt <b>"))));
}

TEST_F(StoreTrend, LeavesOutWhatIsNoResultAndSaysWhatItCantKnow) {
    change(jobOf(1), [](json& keys) { keys["Remote/Measurement/Approval"] = {{"int", -1}}; });
    change(jobOf(2), [](json& keys) { keys.erase("Remote/Measurement/Date"); });
    change(jobOf(3), [](json& keys) { keys["Remote/Measurement/Approval"] = {{"double", 1.0}}; });
    change(jobOf(4),
           [](json& keys) { keys["Remote/Measurement/LabValues/LValues"]["double"] = {95}; });
    // Judged when the tolerance was lower.
    change(jobOf(5), [](json& keys) {
        keys["Remote/Measurement/Values/Approval"]["int"] = approvalsOf(false);
        keys["Remote/Measurement/Approval"]["int"] = 0;
    });
    change(jobOf(6), [](json& keys) {
        keys["Remote/Measurement/Values/Measured"]["double"][5] = -1.0;
        keys["Remote/Measurement/Approval"]["int"] = 0;
    });
    import({jobOf(20, "Remote/Measurement2", "2")});
    EXPECT_THAT(text(), AllOf(HasSubstr("9 results, 4 November 2026 to 12 November 2026: 5 passed, "
                                        "3 failed, 1 incomplete"),
                              HasSubstr("! 1 job was judged by other tolerances"),
                              ContainsRegex("Solid cyan +3.60 +of 3.00 +ΔE00 +3 of 9 above"),
                              ContainsRegex("All patches, average +1.13 +of 2.50 +ΔE00 +0 of 8"),
                              HasSubstr("Press 2 · second strip")));

    change(jobOf(7), [](json& keys) { keys["Workflow/Verify/ComparisonMethod"]["int"] = 2; });
    EXPECT_THAT(text(), HasSubstr("The file of preset 2 can't be read"));
}

// The PSD kind keeps ten approvals by the criterion's own entry, and its tolerances apart.
TEST_F(StoreTrend, KnowsPresetsOfThePsdKind) {
    putFile("/server/tickets/CVP_0007.xml",
            support::contentsOf(TINTGATE_SOURCE_DIR "/presets/CVP_0007.xml"));
    std::vector<json> tickets = {presetTicket(7)};
    for (int job = 1; job <= jobs; ++job) {
        json ticket = jobOf(job);
        json& keys = ticket["keys"];
        keys["Workflow/Verify/ComparisonMethod"]["int"] = 7;
        json approvals = std::vector<int>(10, 1);
        approvals[4] = job == 12 ? 0 : 1; // Paper white.
        keys["Remote/Measurement/Values/PSDApproval"] = {{"int", approvals}};
        tickets.push_back(ticket);
    }
    import(tickets);
    EXPECT_THAT(text(), ContainsRegex("Paper white +0.25 +of 5.00 +ΔE00 +1 of 12 above"));
}

// A measurement without spectra leaves no colours in a ticket.
TEST_F(StoreTrend, TellsADriftByDifferencesWhereThereAreNoColours) {
    for (int job = 1; job <= jobs; ++job)
        change(jobOf(job), [](json& keys) { keys.erase("Remote/Measurement/LabValues/LValues"); });
    EXPECT_THAT(text(), AllOf(HasSubstr("Drifting: cyan"),
                              HasSubstr("Cyan: Its difference is 1.64 larger than at first"),
                              ContainsRegex("Steady +Black +0.50 +of 3.00")));
}

TEST_F(StoreTrend, CountsTheResultOfASheetOnce) {
    std::vector<json> tickets;
    for (int id : {30, 31, 32}) { // Two jobs on a sheet and their parent.
        tickets.push_back(jobOf(3));
        tickets.back()["id"] = id;
        tickets.back()["keys"]["Input/Title"] = {{"string", "Sheet " + std::to_string(id)}};
        if (id != 30)
            tickets.back()["keys"]["General/ParentID"] = {{"int", 30}};
    }
    import(tickets);
    EXPECT_THAT(text(), HasSubstr("13 results"));
    const std::string page = report({"-o", "-"}).output;
    EXPECT_THAT(page, AllOf(HasSubstr("\"Sheet 31\""), Not(HasSubstr("\"Sheet 30\"")),
                            Not(HasSubstr("\"Sheet 32\""))));
}

TEST_F(StoreTrend, LeadsToThePagesOnThisMachine) {
    m_scratch.makeFolder("Tintgate/JobID_5");
    json meta =
        json::parse(support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/report/meta.json"));
    meta["job"]["id"] = 5;
    meta["job"]["strip"] = 1;
    meta["job"]["title"] = "Order 5";
    fs::copy_file(TINTGATE_SOURCE_DIR "/tests/data/report/output.json",
                  m_scratch.path("Tintgate/JobID_5/output.json"));
    const auto view = [&](const std::string& created) {
        meta["created"] = created;
        m_scratch.write("Tintgate/JobID_5/meta.json", meta.dump());
        EXPECT_EQ(
            support::run({VIEWER, "-meta", m_scratch.path("Tintgate/JobID_5/meta.json")}).exitCode,
            0);
    };
    view("2026-11-05T21:53:00+01:00"); // Of the run before.
    view("2026-11-05T21:53:09+01:00");
    view("2026-11-06T10:00:00+01:00"); // Compared again.
    m_scratch.makeFolder("pages");
    ASSERT_EQ(report({"-o", m_scratch.path("pages/trend.html")}).exitCode, 0);
    const std::string page = support::contentsOf(m_scratch.path("pages/trend.html"));
    EXPECT_THAT(page, HasSubstr("./../Tintgate/JobID_5/report-strip1-2026-11-05-215309.html"));
    EXPECT_EQ(page.find("report-strip1-"), page.rfind("report-strip1-"));
}

TEST_F(StoreTrend, EndsInAStatusOfItsOwnWithoutAStore) {
    const support::Outcome outcome =
        support::run({TINTGATE_REPORT, "--store", m_scratch.path("nowhere")});
    EXPECT_EQ(outcome.exitCode, 8);
    EXPECT_NE(outcome.error, "");
    EXPECT_EQ(outcome.output, "");

    support::RunOptions options;
    options.environment["TINTGATE_STORE"] = m_store;
    EXPECT_THAT(support::run({TINTGATE_REPORT, "--text"}, options).output, HasSubstr("12 results"));
}

} // namespace
