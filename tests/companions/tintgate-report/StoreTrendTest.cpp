// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <chrono>
#include <ctime>
#include <map>
#include <regex>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "StoreProgram.h"

namespace {

using nlohmann::json;
using testing::AllOf;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

const std::string source = TINTGATE_SOURCE_DIR;

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
    const std::string day = (job < 10 ? "0" : "") + std::to_string(job);
    json keys = {{"Input/Title", {{"string", "Order " + std::to_string(job)}}},
                 {"CMM/PaperName", {{"string", "Matt <b>"}}},
                 {"Workflow/Name", {{"string", "Press 2"}}},
                 {"System/InstallFolder", {{"string", "/server"}}},
                 {"Workflow/Verify/ComparisonMethod" + two, {{"int", 1}}},
                 {"Workflow/Verify/DeltaEMode" + two, {{"int", 4}}},
                 {"Footer/ControlstripFile" + two, {{"string", "/x/y/example.tif"}}},
                 {root + "/Status", {{"int", 1}}},
                 {root + "/Approval", {{"int", passes ? 1 : 0}}},
                 {root + "/Date", {{"string", "2026-11-" + day}}},
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

class StoreTrend : public StoreProgram {
  protected:
    static constexpr int jobs = 12;

    StoreTrend() {
        answer({"file", "put", source + "/presets/CVP_0001.xml", "/server/tickets/CVP_0001.xml"});
        const std::string psd =
            std::regex_replace(support::contentsOf(source + "/presets/CVP_0007.xml"),
                               std::regex("psdTolerance=\"5.0\""), "psdTolerance=\"4.5\"");
        answer({"file", "put", m_folder.write("psd", psd), "/server/tickets/CVP_0007.xml"});
        answer({"file", "put", m_folder.write("strip", "IT8.7/2\nDEVICE 33\n"),
                "/server/ControlCharts/example.it8"});
        importJobs();
    }

    void import(const std::vector<json>& tickets) const {
        const json file = {{"format", "tintgate tickets"}, {"version", 1}, {"tickets", tickets}};
        answer({"import", m_folder.write("tickets.json", file.dump())});
    }
    /// All jobs; the changes of a job are merged into its keys.
    void importJobs(const std::map<int, json>& changes = {}) const {
        const json name = {{"Name", {{"string", "Contract proof"}}}};
        std::vector<json> tickets = {{{"type", 27}, {"id", 1}, {"keys", name}},
                                     {{"type", 27}, {"id", 7}, {"keys", name}}};
        for (int job = 1; job <= jobs; ++job) {
            tickets.push_back(jobOf(job));
            if (changes.count(job) > 0) {
                tickets.back()["keys"].merge_patch(changes.at(job));
            }
        }
        import(tickets);
    }

    support::Outcome report(std::vector<std::string> words) const {
        support::RunOptions options;
        options.environment = {{"TMPDIR", m_folder.path()},
                               {"TINTGATE_STORE", m_address},
                               {"TINTGATE_INSTRUMENTS", m_folder.write("names", "33 = Bench 3\n")}};
        words.insert(words.begin(), TINTGATE_REPORT);
        return support::run(words, options);
    }
    std::string text() const { return report({"--text"}).output; }
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
    EXPECT_EQ(report({"--store", m_folder.path("nowhere")}).exitCode, 8);

    // Both patches of full cyan count, and the page holds the same numbers.
    EXPECT_THAT(report({"-o", "-"}).output,
                AllOf(HasSubstr("\"began\":\"55.9 -37.0 -50.0\""),
                      HasSubstr("[0.3,0.6,0.9,1.2,1.5"), Not(HasSubstr("Matt <b>"))));
}

TEST_F(StoreTrend, OfARoomAndItsArchiveIsThatOfAllJobs) {
    const std::string whole = text();
    const std::string archive = m_folder.path("archive");
    answer({"copy", m_address, archive});
    for (int job = 1; job <= jobs; ++job) { // A move that was cut off left job 6 in both.
        if (job != 6) {
            answer({"-s", job < 6 ? m_address : archive, "job", "delete", std::to_string(job)});
        }
    }
    EXPECT_THAT(text(), HasSubstr("7 results"));
    const std::string both = report({"--store", m_address, "--store", archive, "--text"}).output;
    EXPECT_EQ(std::regex_replace(both, std::regex(", " + archive), ""), whole);
    EXPECT_THAT(report({"--store", m_address, "--store", archive + "x"}).error,
                HasSubstr("archivex"));
}

TEST_F(StoreTrend, LeavesOutWhatIsNoResultAndSaysWhatItCantKnow) {
    const std::string root = "Remote/Measurement/";
    const json failed = {{"int", 0}};
    json unanswered = measuredOf(1.8);
    unanswered[5] = -1.0;
    importJobs({
        {1, {{root + "Approval", {{"int", -1}}}}},
        {2, {{root + "Date", nullptr}}},
        {3, {{root + "Approval", {{"int", nullptr}, {"double", 1.0}}}}},
        {4, {{root + "LabValues/LValues", {{"double", {95}}}}}},
        // Judged when the tolerance was lower.
        {5,
         {{root + "Values/Approval", {{"int", approvalsOf(false)}}}, {root + "Approval", failed}}},
        {6, {{root + "Values/Measured", {{"double", unanswered}}}, {root + "Approval", failed}}},
    });
    import({jobOf(20, "Remote/Measurement2", "2")});
    EXPECT_THAT(text(), AllOf(HasSubstr("9 results, 4 November 2026 to 12 November 2026: 5 passed, "
                                        "3 failed, 1 incomplete"),
                              HasSubstr("! 1 job was judged by other tolerances"),
                              ContainsRegex("Solid cyan +3.60 +of 3.00 +ΔE00 +3 of 9 above"),
                              ContainsRegex("All patches, average +1.13 +of 2.50 +ΔE00 +0 of 8"),
                              HasSubstr("Press 2 · second strip")));
}

TEST_F(StoreTrend, KnowsPresetsOfThePsdKindAndJobsWithoutColours) {
    // The PSD kind keeps ten approvals by the criterion's own entry, and its tolerances apart. A
    // measurement without spectra leaves no colours in a ticket.
    std::map<int, json> changes;
    for (int job = 1; job <= jobs; ++job) {
        std::vector<int> approvals(10, 1);
        approvals[0] = job == 12 ? 0 : 1; // The average.
        changes[job] = {{"Workflow/Verify/ComparisonMethod", {{"int", job == 1 ? 2 : 7}}},
                        {"Remote/Measurement/Values/PSDApproval", {{"int", approvals}}},
                        {"Remote/Measurement/LabValues/LValues", nullptr}};
    }
    importJobs(changes);
    EXPECT_THAT(text(), AllOf(ContainsRegex("patches, average +1.13 +of 4.50 +ΔE00 +1 of 11 above"),
                              HasSubstr("Drifting: cyan"),
                              HasSubstr("Cyan: moving average of its difference "),
                              ContainsRegex("Cyan +3.60 +of 4.50 +2.58 ΔE00 "),
                              HasSubstr("The file of preset 2 can't be read")));
}

std::string charted(double cyan) {
    return "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
           "END_DATA_FORMAT\nBEGIN_DATA\n1 0 0 0 0 95 0 -2\n2 100 0 0 0 " +
           std::to_string(cyan) + " -37 -50\nEND_DATA\n";
}

TEST_F(StoreTrend, PartsJobsByWhatTheyWereAimedAt) {
    const std::string charts = "/server/IT8_CharacterizationData/";
    answer({"file", "put", m_folder.write("1", charted(55)), charts + "old.txt"});
    answer({"file", "put", m_folder.write("2", charted(55)), charts + "same.txt"});
    answer({"file", "put", m_folder.write("3", charted(56)), "/x(TEMP)/other.txt"});
    answer({"file", "put", m_folder.write("4", charted(57)),
            charts + "Fogra_MKCheck11/MKCheck11.txt"});
    answer({"file", "put", "/usr/share/color/icc/ghostscript/default_cmyk.icc", "/p/press.icc"});
    const std::string two = "Workflow/Verify/CharacterizationData";
    const auto aim = [](int workflow, const std::string& key, const std::string& path) {
        return json{{"Workflow/Verify/MeasurementWorkflow", {{"int", workflow}}},
                    {key, {{"string", path}}}};
    };
    const std::string own = "Remote/Measurement/Reference/";
    const json stored = {{"Workflow/Verify/MeasurementWorkflow", {{"int", 3}}},
                         {own + "Numpatches", {{"int", 2}}},
                         {own + "CMYKValues/CValues", {{"int", {0, 255}}}},
                         {own + "LabValues/LValues", {{"double", {95.0, 54.0}}}},
                         {own + "LabValues/AValues", {{"double", {0.0, -37.0}}}},
                         {own + "LabValues/BValues", {{"double", {-2.0, -50.0}}}}};
    json others = stored;
    others[own + "LabValues/LValues"] = {{"double", {95.0, 54.5}}};
    json dynamic = aim(2, "Footer/Dynstrip/IT8", charts + "same.txt");
    dynamic["Footer/Dynstrip/UseDynstrip"] = {{"int", 1}};
    dynamic["Footer/Dynstrip/DeviceID"] = {{"int", 33}};
    json esko = aim(4, two, charts + "old.txt");
    esko["Job/FromEsko"] = {{"int", 1}};
    importJobs({{1, aim(2, two, "old.txt")},
                {2, aim(2, two, "same.txt")}, // The same colours.
                {3, aim(2, two, "/x(TEMP)/other.txt")},
                {4, aim(2, two, "MKCheck11.txt")},
                {5, aim(1, "Footer/ControlstripInputProfile", "/p/press.icc")},
                {6, aim(3, "Remote/UsedICCProfile", "/p/press.icc")},
                {7, stored},
                {8, stored},
                {9, others},
                {10, dynamic},
                {11, esko},
                {12, aim(2, two, "gone.txt")}});
    const std::string shown = text();
    const std::regex head("  Matt <b> · (.*)\n([0-9]+) results?,");
    std::multiset<std::string> series;
    for (auto at = std::sregex_iterator(shown.begin(), shown.end(), head);
         at != std::sregex_iterator(); ++at) {
        series.insert((*at)[2].str() + " " + (*at)[1].str());
    }
    EXPECT_EQ(series.size(), 7U) << shown;
    const auto of = [&](const std::string& beginning) {
        return std::count_if(series.begin(), series.end(),
                             [&](const std::string& name) { return name.starts_with(beginning); });
    };
    for (const char* beginning :
         {"1 other.txt · ", "1 MKCheck11.txt · ", "2 press.icc · ",
          "2 stored references · Contract proof · Bench 3 · Press 2 · target ", "1 gone.txt · "}) {
        EXPECT_EQ(of(beginning), 1) << beginning << shown;
    }
    EXPECT_EQ(of("4 old.txt"), 1) << shown;
    EXPECT_THAT(shown, HasSubstr("L* +3.20, a* +0.00")); // Job 9: 57.7 for 54.5.
}

// A run judged by what the file was then, so a file that is replaced begins a series.
TEST_F(StoreTrend, TakesATargetAsItWasWhenTheJobWasMeasured) {
    const std::string path = "/server/IT8_CharacterizationData/aim.txt";
    const auto put = [&](double cyan) {
        answer({"file", "put", m_folder.write("aim", charted(cyan)), path});
    };
    const auto now = [](int secondsAgo) {
        const std::time_t time = std::time(nullptr) - secondsAgo;
        std::tm parts{};
        localtime_r(&time, &parts);
        char day[32];
        char clock[32];
        std::strftime(day, sizeof day, "%Y-%m-%d", &parts);
        std::strftime(clock, sizeof clock, "%H:%M:%S", &parts);
        return json{{"Workflow/Verify/MeasurementWorkflow", {{"int", 2}}},
                    {"Workflow/Verify/CharacterizationData", {{"string", "aim.txt"}}},
                    {"Remote/Measurement/Date", {{"string", day}}},
                    {"Remote/Measurement/Time", {{"string", clock}}}};
    };
    put(55);
    const json early = now(0);
    std::this_thread::sleep_for(std::chrono::milliseconds(2100));
    put(56);
    const json late = now(0);
    importJobs({{1, now(1000)}, {2, early}, {3, late}});
    const std::string page = report({"-o", "-"}).output;
    EXPECT_THAT(text(), ContainsRegex("aim.txt · Contract proof · Bench 3 · Press 2 · target "));
    EXPECT_THAT(page, HasSubstr("\"aim\":\"55.0 -37.0 -50.0\""));
    EXPECT_THAT(page, HasSubstr("\"aim\":\"56.0 -37.0 -50.0\""));
}

TEST_F(StoreTrend, CountsTheResultOfASheetOnce) {
    std::vector<json> tickets;
    for (int id : {30, 31, 32}) { // Two jobs on a sheet and their parent.
        tickets.push_back(jobOf(3));
        tickets.back()["id"] = id;
        tickets.back()["keys"]["Input/Title"] = {{"string", "Sheet " + std::to_string(id)}};
        if (id != 30) {
            tickets.back()["keys"]["General/ParentID"] = {{"int", 30}};
        }
    }
    import(tickets);
    EXPECT_THAT(text(), HasSubstr("13 results"));
    EXPECT_THAT(report({"-o", "-"}).output,
                AllOf(HasSubstr("\"Sheet 31\""), Not(HasSubstr("\"Sheet 30\"")),
                      Not(HasSubstr("\"Sheet 32\""))));
}

TEST_F(StoreTrend, LeadsToThePagesOnThisMachine) {
    const std::string data = source + "/tests/data/report/";
    m_folder.write("Tintgate/JobID_5/output.json", support::contentsOf(data + "output.json"));
    json meta = json::parse(support::contentsOf(data + "meta.json"));
    meta["job"].update({{"id", 5}, {"strip", 1}, {"title", "Order 5"}});
    for (const char* created : {"2026-11-05T21:53:00+01:00",    // Of the run before.
                                "2026-11-05T21:53:09+01:00",    // That of the ticket.
                                "2026-11-06T10:00:00+01:00"}) { // Compared again.
        meta["created"] = created;
        const auto path = m_folder.write("Tintgate/JobID_5/meta.json", meta.dump());
        EXPECT_EQ(support::run({VIEWER, "-meta", path}).exitCode, 0);
    }
    ASSERT_EQ(report({"-o", m_folder.makeFolder("pages") + "/trend.html"}).exitCode, 0);
    const std::string page = support::contentsOf(m_folder.path("pages/trend.html"));
    EXPECT_THAT(page, HasSubstr("./../Tintgate/JobID_5/report-strip1-2026-11-05-215309.html"));
    EXPECT_EQ(page.find("report-strip1-"), page.rfind("report-strip1-"));
}

} // namespace
