// SPDX-License-Identifier: Apache-2.0
// Runs the real program on jobs as a client does: arguments and a store in; the exit code, the log,
// the job's folder and the tickets out.
#include <atomic>
#include <chrono>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <regex>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <csignal>
#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "RunProgram.h"
#include "RunningProgram.h"
#include "SuiteRoot.h"
#include "TicketText.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/Users.h"
#include "store/sqlite/Sqlite.h"
#include "tests/job/JobPlace.h"

namespace {

namespace fs = std::filesystem;
using support::Call;
using support::Place;
using support::profile;
using support::sideBySide;
using support::viewer;
using testing::HasSubstr;

struct Case {
    std::string what;
    int code;
    std::string log; ///< Must appear in the log.
    std::function<void(Place&)> prepare = {};
    Call call = {};
};

/// If a run reaches its job, its log ends with its code. A job whose measurement fails stays to be
/// measured. The viewer gets JSON from every run that does not fail.
void expectRuns(const std::vector<Case>& cases) {
    std::vector<Place> places(cases.size());
    std::vector<support::Outcome> outcomes(cases.size());
    for (std::size_t i = 0; i < cases.size(); ++i) {
        if (cases[i].prepare) {
            cases[i].prepare(places[i]);
        }
    }
    sideBySide(cases.size(), [&](std::size_t i) { outcomes[i] = places[i].run(cases[i].call); });
    for (std::size_t i = 0; i < cases.size(); ++i) {
        const auto& [what, code, inLog, prepare, call] = cases[i];
        const std::string log = places[i].log();
        SCOPED_TRACE(what + "\n" + log);
        EXPECT_EQ(outcomes[i].exitCode, code);
        EXPECT_EQ(outcomes[i].output + outcomes[i].error, "");
        EXPECT_THAT(log, HasSubstr(inLog));
        const int result = code == 255 ? -1 : code;
        EXPECT_EQ(log.ends_with("Overall result = " + std::to_string(result) + "\n"),
                  log.find("Veryfing Job ID = ") != std::string::npos);
        if (code == 0) {
            for (const char* file : {"output.json", "meta.json"}) {
                const std::string path = places[i].jobFile(file, call.job);
                EXPECT_TRUE(nlohmann::json::accept(support::contentsOf(path)));
            }
        }
        EXPECT_TRUE(call.job != "8" || (places[i].status("8") == 208) == (code != 0));
    }
}

/// Changes before a run.
auto setting(const std::string& records) {
    return [=](const Place& place) { place.set(records); };
}
auto file(const std::string& serverPath, const std::string& contents) {
    return [=](const Place& place) {
        std::istringstream stream(contents);
        place.engine()->putFile(serverPath, stream);
    };
}
auto blocked(const char* jobFile) {
    return [=](const Place& place) { fs::create_directories(place.jobFile(jobFile)); };
}
auto storeFormat(const std::string& format) {
    return [=](const Place& place) {
        store::sqlite::Database(place.address + "/tickets.db", store::sqlite::Opening::Existing)
            .run(("PRAGMA user_version = " + format).c_str());
    };
}

constexpr char loginLines[] = "Tintgate.exe verion = 1.6.20\nTintgateLib.dll verion = 1.0.0\n";
constexpr char loggedIn[] = "Logged in to = STORE\n";
constexpr char analysisLines[] = "Reference file = JOB/Measured reference.txt\n"
                                 "Measurement file = JOB/Measured sample.txt\n"
                                 "analyzeMeasurements returns = 0\n";

TEST(Verification, ComparesStoredValuesAndShowsThem) {
    const Place place;
    const std::string before = place.administer({"export"});
    const support::Outcome outcome = place.run();
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.output + outcome.error, "");
    EXPECT_EQ(place.log(), std::string(loginLines) + loggedIn +
                               "Veryfing Job ID = 7\nLoadKZJobReferences returns = 0\n"
                               "LoadKZJobData returns = 0\n"
                               "parsePresetParameterXMLFile returns = 0\nm_jobType is = 2\n"
                               "Comparing existing data\nLoadKZJobMeasurements returns = 0\n" +
                               analysisLines + "LaunchNerovaVerify\nOverall result = 0\n");
    EXPECT_EQ(place.shown(), "[-detail][-meta][" + place.jobFile("meta.json") + "]");
    EXPECT_THAT(support::contentsOf(place.jobFile("output.json")),
                HasSubstr("\"verdict\": \"failed\""));
    EXPECT_THAT(support::contentsOf(place.jobFile("meta.json")), HasSubstr("\"user\": \"press\""));
    EXPECT_EQ(place.administer({"export"}), before);
    EXPECT_EQ(support::modeOf(place.temporary + "/Tintgate/TintgateKZ.log"), 0600u);

    // The file forms must give the same result for the two files.
    const std::string result = place.path("files.json");
    const support::Outcome files = place.run(std::vector<std::string>{
        TINTGATE_PROGRAM, place.jobFile("Measured reference.txt"),
        place.jobFile("Measured sample.txt"), place.jobFile("CVP_0001.xml"), result});
    EXPECT_EQ(files.exitCode, 0);
    const std::regex time("\"created\": \"[^\"]*\"");
    EXPECT_EQ(std::regex_replace(support::contentsOf(result), time, ""),
              std::regex_replace(support::contentsOf(place.jobFile("output.json")), time, ""));
}

TEST(Verification, EndsWithTheCodeOfWhatWentWrong) {
    const std::string refused = "Not able to connect to = STORE last ComGui error = ";
    const auto disableUser = [](const Place& place) {
        place.engine()->putUser({"press", store::passwordHash("room"), true});
    };
    expectRuns({
        {"no job", 5, loginLines, {}, {.job = ""}},
        {"a strip beyond all numbers", 5, loginLines, {}, {.strip = "4294967296"}},
        {"no store", 150, "to = /no/store last ComGui error = 150", {}, {.host = "/no/store"}},
        {"another user", 151, refused + "151", {}, {.user = "proof"}},
        {"a disabled user", 152, refused + "152", disableUser},
        {"a newer store", 153, refused + "153", storeFormat("99")},
        {"an older store", 154, refused + "154", storeFormat("0")},
        {"another job", 108, loggedIn, {}, {.job = "99"}},
        {"a closed job", 108, loggedIn, setting("Job/Display/Status=211 Remote/ShowInVerifier=0")},
        {"no name of a JDF", 255, "LoadKZJobData returns = -1", setting("Output/Jdf/FileName=-")},
        {"no folder of the JDF", 255, "LoadKZJobData returns = -1",
         setting("System/Folders/Temp=-")},
        {"a sub type whose JDF has a name of its own", 255, "LoadKZJobData returns = -1",
         setting("Input/SubType=80")},
        {"a strip that is not a number", 5, loginLines, {}, {.strip = "one"}},
        {"a damaged store", 150, refused + "150",
         [](auto& place) { place.write("store/tickets.db", std::string(8192, 'x')); }},
        {"no name of a control strip", 103, "parsePresetParameterXMLFile returns = 103",
         setting("Footer/ControlstripFile=-")},
        {"a damaged preset", 103, "parsePresetParameterXMLFile returns = 103",
         file("/server/tickets/CVP_0001.xml", "<preset")},
        {"no number of patches", 107, "LoadKZJobMeasurements returns = -1",
         setting("Remote/Measurement/Numpatches=-")},
        {"no sample", 105, "Measurement file not found = JOB/Measured sample.txt",
         blocked("Measured sample.txt")},
        // For a comparison, the analysis reports a missing reference.
        {"no references", 20,
         "Reference file not found = \nReference file = \n"
         "Measurement file = JOB/Measured sample.txt\nanalyzeMeasurements returns = 20\n",
         setting("Workflow/Verify/MeasurementWorkflow=2 "
                 "Workflow/Verify/CharacterizationData='none")},
        {"no result", 71, "json file not found = JOB/output.json", blocked("output.json")},
        {"no meta file", 72, "json meta file not found = JOB/meta.json", blocked("meta.json")},
        {"no viewer", 109, "LaunchNerovaVerify\nNerova Verify.exe allready running",
         [](auto& place) { fs::remove(place.path(viewer)); }},
    });
}

TEST(Verification, MeasuresAndEndsWithTheCodeOfWhatWentWrong) {
    const Call call = {.job = "8"};
    const Call again = {.remeasure = "KEY_KZ_REMEASURE:=:true"};
    const auto tool = [](const std::string& settings, bool withReferences = true) {
        return [=](const Place& place) {
            place.installTool(settings);
            // An old measurement, which must not be mistaken for a new one.
            place.write("tmp/Tintgate/JobID_8/Measured sample.txt", "old");
            if (!withReferences) {
                fs::remove(place.address + "/files/server/default_cmyk.icc");
            }
        };
    };
    const auto closedJob = [](const Place& place) {
        place.installTool();
        place.set("Job/Display/Status=211");
    };
    const auto runningTool = [](Place& place) {
        const std::string path = place.installTool("", "/bin/sleep");
        place.beside = std::make_unique<support::RunningProgram>(path);
    };
    // An inline instrument measures the second strip during printing: nothing is to be measured.
    const Call second = {.strip = "1"};
    const auto inlineStrip = [](const std::string& device) {
        return [=](const Place& place) {
            place.set("Workflow/Verify/MeasurementWorkflow2=2 Workflow/Verify/DeltaEMode2=4 "
                      "Workflow/Verify/CharacterizationData2='none "
                      "Workflow/Verify/ComparisonMethod2=1 Footer/ControlstripFile2='inline");
            file("/server/ControlCharts/inline.it8", "DEVICE " + device + "\n")(place);
        };
    };
    const std::string launched = "ConfigureAndLaunchNerovaMeasure returns = ";
    const std::string compared = "\nComparing existing data\n";
    expectRuns({
        {"measured", 0, "Copying resulting data to job ticket\n", tool(""), call},
        {"measured again", 0, "Copying resulting data to job ticket\n", closedJob, again},
        {"not again", 0, compared, {}, {.remeasure = "KEY_KZ_REMEASURE:=:false"}},
        {"no tool", 106, launched + "-2", {}, call},
        {"a tool that runs already", 106, launched + "-1", runningTool, call},
        {"a tool that can't be executed", 105, launched + "0",
         [](auto& place) { fs::permissions(place.installTool(), fs::perms(0600)); }, call},
        {"a tool that crashes", 105, launched + "0", tool("mishap = crash\n"), call},
        {"no references", 10, "Reference file not found = \nOverall", tool("", false), call},
        {"inline 40", 107, compared, inlineStrip("40"), second},
        {"inline 44", 106, "existing measurement job", inlineStrip("44"), second},
    });
}

// Any ticket content must give an exit code without using much memory.
TEST(Verification, BearsHostileTickets) {
    const std::string root = "Remote/Measurement/";
    const std::pair<std::string, int> tickets[] = {
        {root + "Numpatches=2147483647", 105},
        {root + "Numpatches=100000", 0},
        {root + "LabValues/LValues=nan", 28},
        {root + "Reference/Numpatches=2000000000", 103},
        {root + "Status=-2147483648 Workflow/Verify/ComparisonMethod=-5", 103},
        {"General/ParentID=2147483647 Footer/Nesting/PSDAssessment=' "
         "Footer/Nesting/ControlstripMode=1 Footer/Nesting/ControlstripFile='.",
         0},
        {"Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/DeviceID=-2147483648 "
         "Footer/Dynstrip/IT8='/ Footer/Dynstrip/File='..",
         20},
        {"Output/Jdf/FileName='../../../../../etc/passwd", 111},
        {"Input/Title='a\"</script>%s\\\x01-\xc3\xa9" + std::string(100'000, 'x'), 0},
        {"Footer/ControlstripFile='" + std::string(5'000, 'x'), 0},
    };
    std::vector<Case> cases;
    for (const auto& [records, code] : tickets) {
        cases.push_back({records.substr(0, 60), code, "", setting(records)});
    }
    expectRuns(cases);
}

// Non-ASCII names in a locale without these characters.
TEST(Verification, KeepsEveryCharacterInEveryLocale) {
    Place place;
    place.temporary = place.path("d\xc3\xa9p\xc3\xb4t \xe5\x88\xb7");
    fs::create_directories(place.temporary);
    place.set("Input/Title='\xc3\x89preuve-\xf0\x9f\x8e\xa8");
    place.engine()->putUser({"J\xf6rg", store::passwordHash("\xe9t\xe9"), false});
    std::vector<std::string> words =
        place.words({.password = "\xc3\xa9t\xc3\xa9", .user = "J\xc3\xb6rg"});
    words.insert(words.begin(), {"env", "LC_ALL=C"});
    EXPECT_EQ(place.run(words).exitCode, 0);
    EXPECT_THAT(place.log(), HasSubstr(analysisLines));
    const std::string meta = support::contentsOf(place.jobFile("meta.json"));
    EXPECT_THAT(meta, HasSubstr("\\u00c9preuve-\\ud83c\\udfa8"));
    EXPECT_THAT(meta, HasSubstr("J\\u00f6rg"));
    EXPECT_THAT(support::contentsOf(place.jobFile("output.json")),
                HasSubstr("\"verdict\": \"failed\""));
}

TEST(Verification, ReadsItsArgumentsByPlace) {
    const Place place;
    const struct {
        std::string host, job;
        int code;
    } cases[] = {
        {"x KEY_KZ_HOST y:" + place.address, "7", 0},
        {"KEY_KZ_HOST", "7", 150}, // Used as the host's name.
        {"KEY_KZ_HOST:a:" + place.address, "K::7 and more", 0},
        {place.address, "7", 255},
        {"KEY_KZ_HOST:" + place.address, "seven", -1},
    };
    for (const auto& [host, job, code] : cases) {
        const support::Outcome outcome =
            place.run({TINTGATE_PROGRAM, host, "0", job, "en_US", "", "room", "a:b:press"});
        EXPECT_EQ(outcome.exitCode, code) << host;
        EXPECT_EQ(outcome.signal, code == -1 ? SIGABRT : 0);
    }
}

TEST(Verification, StartsTheViewerWithoutAJob) {
    const Place place;
    EXPECT_EQ(place.run({.job = "-1", .strip = "x", .user = "nobody"}).exitCode, 0);
    EXPECT_EQ(place.shown(), "[]");
    EXPECT_EQ(place.log(), loginLines);
    fs::remove(place.path(viewer));
    EXPECT_EQ(place.run({.job = "-1"}).exitCode, 255);
}

// A job writes passwords, and anybody can create names in a shared folder.
TEST(Verification, UsesNoFolderOfOthers) {
    const Place place;
    fs::create_directories(place.path("theirs"));
    fs::create_directory_symlink(place.path("theirs"), place.temporary + "/Tintgate");
    EXPECT_EQ(place.run().exitCode, 111);
    EXPECT_TRUE(fs::is_empty(place.path("theirs")));
}

// Kills a run some milliseconds after its JDF has changed, i.e. while it writes the job's keys.
constexpr char killWhileItWrites[] = R"sh(
    jdf=$1; delay=$2; shift 2
    "$@" & run=$!
    until [ "$(wc -c < "$jdf")" -gt 8192 ] || [ ! -e /proc/$run/exe ]; do :; done 2>/dev/null
    sleep "$delay"
    kill -9 $run)sh";

TEST(Verification, KilledWhileItWritesLeavesAllWholeAndCanBeRunAgain) {
    const char* const delays[] = {"0", "0.002", "0.005", "0.01", "0.02", "0.04"};
    std::vector<Place> places(std::size(delays));
    std::vector<std::map<std::string, int>> left;
    for (const Place& place : places) {
        place.installTool();
    }
    sideBySide(places.size(), [&](std::size_t i) {
        std::vector<std::string> words = places[i].words({.job = "8"});
        words.insert(words.begin(), {"sh", "-c", killWhileItWrites, "sh",
                                     places[i].jobFile("job-8.jdf", "8"), delays[i]});
        places[i].run(words);
    });
    for (const Place& place : places) {
        std::ostringstream delivered;
        place.engine()->getFile("server/temp/job-8.jdf", delivered);
        EXPECT_TRUE(delivered.str().size() == 8192 ||
                    delivered.str() == support::contentsOf(place.jobFile("job-8.jdf", "8")));
        left.push_back(place.counts(8));
        place.administer({"reset", "8"});
    }
    sideBySide(places.size(),
               [&](std::size_t i) { EXPECT_EQ(places[i].run({.job = "8"}).exitCode, 0); });
    int cutOff = 0;
    for (std::size_t i = 0; i < places.size(); ++i) {
        EXPECT_NE(places[i].status("8"), 208);
        const auto whole = places[i].counts(8);
        EXPECT_EQ(whole.at("Remote/Measurement/SpectralValues/DValues"), 48 * 36);
        for (const auto& [key, count] : left[i]) {
            EXPECT_EQ(count, whole.at(key)) << key;
        }
        cutOff += left[i].size() < whole.size() ? 1 : 0;
    }
    EXPECT_GT(cutOff, 0) << "all were killed after they had written everything";
}

} // namespace
