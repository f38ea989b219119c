// SPDX-License-Identifier: Apache-2.0
// Broken jobs: the change to a correct job, the tool's exit code, and the words with which
// tintgate-store names the cause.
#include <algorithm>
#include <filesystem>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "store/StoreEngine.h"
#include "tests/job/JobPlace.h"

namespace {

namespace fs = std::filesystem;
using support::Call;
using support::Place;
using testing::HasSubstr;

/// In addition to the jobs of a place: 9 is measured against characterization data, 10 has two
/// strips, 11 is nested.
constexpr char moreJobs[] = "--job 9 --unmeasured,--job 10 --two-strips,--job 11 --parent 12";

enum class Then { Fails, IsWrong, Succeeds };

struct Case {
    std::string what;
    int code;
    std::vector<std::string> words; ///< Must appear in the report, in this order.
    std::function<void(const Place&)> change = {};
    Call call = {};
    Then then = Then::Fails; ///< For code 0: whether the result is correct.
};

/// A change of a place. Changes can be chained.
using Change = std::function<void(const Place&)>;

Change set(const std::string& records, int id = 7, int type = 3) {
    return [=](const Place& place) { place.set(records, id, type); };
}
/// Sets a text that may contain blanks.
Change setText(const std::string& key, const std::string& text) {
    return [=](const Place& place) {
        place.administer({"key", "set", "job/7", key, "string", text});
    };
}
Change put(const std::string& serverPath, const std::string& contents) {
    return [=](const Place& place) {
        std::istringstream stream(contents);
        place.engine()->putFile(serverPath, stream);
    };
}
Change putFile(const std::string& serverPath, const std::string& local) {
    return [=](const Place& place) { put(serverPath, support::contentsOf(local))(place); };
}
Change removeFile(const std::string& serverPath) {
    return [=](const Place& place) { fs::remove(place.address + "/files" + serverPath); };
}
Change replaceIn(const std::string& serverPath, const std::string& old, const std::string& with) {
    return [=](const Place& place) {
        std::string text = support::contentsOf(place.address + "/files" + serverPath);
        const std::size_t at = text.find(old);
        ASSERT_NE(at, std::string::npos) << serverPath;
        put(serverPath, text.replace(at, old.size(), with))(place);
    };
}
Change user(bool disabled) {
    return [=](const Place& place) {
        if (disabled) {
            store::User changed = *place.engine()->user("press");
            changed.disabled = true;
            place.engine()->putUser(changed);
        } else {
            place.engine()->removeUser("press");
        }
    };
}
Change all(const std::vector<Change>& changes) {
    return [=](const Place& place) {
        for (const Change& change : changes) {
            change(place);
        }
    };
}

constexpr char strip[] = "/server/ControlCharts/example.it8";
constexpr char preset[] = "/server/tickets/CVP_0001.xml";
constexpr char chart[] = "/server/IT8_CharacterizationData/FOGRA39L.ti3";
constexpr char fogra39[] = "/usr/share/color/icc/FOGRA39L.ti3";

/// Tickets, files and users of a store.
std::string everything(const Place& place) {
    return place.administer({"export"}) + place.administer({"--json", "file", "list"}) +
           place.administer({"--json", "user", "list"});
}

support::Outcome diagnose(const Place& place, const Call& call, bool json = false) {
    std::vector<std::string> words = {TINTGATE_STORE_PROGRAM,
                                      "--store",
                                      call.host.empty() ? place.address : call.host,
                                      "diagnose",
                                      call.job,
                                      "--selector",
                                      call.strip,
                                      "--user",
                                      call.user};
    if (!call.remeasure.empty()) {
        words.emplace_back("--remeasure");
    }
    if (json) {
        words.emplace_back("--json");
    }
    support::RunOptions options;
    options.environment = {{"TMPDIR", place.temporary}, {"TINTGATE_ROOT", place.path("")}};
    return support::run(words, options);
}

/// The text under a heading of a report, up to the next heading.
std::string partOf(const std::string& report, const std::string& heading) {
    const std::size_t start = report.find(heading);
    if (heading.empty() || start == std::string::npos) {
        return heading.empty() ? report : "";
    }
    const std::string part = report.substr(start + heading.size());
    return part.substr(0, std::min(part.find("Also noticed:\n"), part.find("On this machine:\n")));
}

/// Runs the diagnosis and the tool on the same broken job: the prediction must match.
void expectCauses(const std::vector<Case>& cases) {
    std::vector<std::unique_ptr<Place>> places;
    for (const Case& row : cases) {
        places.push_back(std::make_unique<Place>(moreJobs));
        places.back()->installTool();
        if (row.change) {
            row.change(*places.back());
        }
    }
    std::vector<support::Outcome> runs(cases.size());
    std::vector<support::Outcome> reports(cases.size());
    support::sideBySide(cases.size(), [&](std::size_t i) {
        reports[i] = diagnose(*places[i], cases[i].call);
        EXPECT_TRUE(fs::is_empty(places[i]->temporary)) << cases[i].what;
        runs[i] = places[i]->run(cases[i].call);
    });
    for (std::size_t i = 0; i < cases.size(); ++i) {
        const Case& row = cases[i];
        SCOPED_TRACE(row.what + "\n" + reports[i].output + reports[i].error);
        EXPECT_EQ(runs[i].exitCode, row.code) << places[i]->log();
        const bool isSound = row.code == 0 && row.then == Then::Succeeds;
        EXPECT_EQ(reports[i].exitCode, isSound ? 0 : 18);
        if (row.code != 0) {
            EXPECT_THAT(reports[i].output,
                        HasSubstr("A run ends with " + std::to_string(row.code) + ","));
        }
        EXPECT_EQ(reports[i].output.find("the result is wrong") != std::string::npos,
                  row.code == 0 && row.then == Then::IsWrong);
        EXPECT_TRUE(!isSound || row.words.front() == "Also noticed" ||
                    reports[i].output.find("Also noticed") == std::string::npos);
        const std::string part = partOf(reports[i].output, row.code != 0 ? "Cause:\n"
                                                           : row.then == Then::IsWrong
                                                               ? "The result is wrong because of:\n"
                                                               : "");
        std::size_t from = 0;
        for (const std::string& word : row.words) {
            from = part.find(word, from);
            ASSERT_NE(from, std::string::npos) << word;
        }
    }
}

TEST(Diagnosis, NamesWhyAJobIsNotBegun) {
    const std::string status =
        "job/7 Job/Display/Status\n      is 211, and Remote/ShowInVerifier is 0";
    expectCauses({
        // clang-format off
        {"strip", 5, {"strip selector one", "is not a number"}, {}, {.strip = "one"}},
        {"missing store", 150, {"/no/store"}, {}, {.host = "/no/store"}},
        {"colon in the address", 150, {"\":\""}, {}, {.host = "/no:store"}},
        {"long address", 150, {"127 bytes"}, {}, {.host = "/" + std::string(200, 'x')}},
        {"unknown user", 151, {"user proof\n", "is not a user"}, {}, {.user = "proof"}},
        {"disabled user", 152, {"users of the store", "disabled"}, user(true)},
        {"no users", 151, {"users of the store", "none"}, user(false)},
        {"old server", 151, {"System/Product/MajorVersion", "is 4"},
         set("System/Product/MajorVersion=4", 0, 0)},
        {"server without version", 151, {"System/Product/MajorVersion", "is missing"},
         set("System/Product/MajorVersion=-", 0, 0)},
        {"no job", 108, {"job/99", "no such ticket"}, {}, {.job = "99"}},
        {"closed job", 108, {status}, set("Job/Display/Status=211 Remote/ShowInVerifier=0")},
        {"type of file", 108, {"Input/FileType", "is 4096"}, set("Input/FileType=4096")},
        {"remeasure", 108, {"job/7 Job/Display/Status", "is 208", "209 to 212"}, {},
         {.remeasure = "KEY_KZ_REMEASURE:=:true"}},
        // clang-format on
    });
}

TEST(Diagnosis, NamesWhyAJobDoesNotLoad) {
    const std::string workflow = "Workflow/Verify/MeasurementWorkflow";
    const std::string chartKey = "Workflow/Verify/CharacterizationData";
    const std::string esko = "Job/FromEsko=1 " + workflow + "=4 " + chartKey + "='" + chart;
    const std::string name = "Footer/ControlstripFile=";
    expectCauses({
        // clang-format off
        {"no name of the JDF", 255, {"Output/Jdf/FileName", "is missing"},
         set("Output/Jdf/FileName=-")},
        {"its type", 255, {"Output/Jdf/FileName", "is stored as an int, but a string is read"},
         set("Output/Jdf/FileName=5")},
        {"no JDF folder", 255, {"System/Folders/Temp and Workflow/RemoteOutFolder", "is missing"},
         set("System/Folders/Temp=-")},
        {"empty JDF folder", 111, {"Workflow/RemoteOutFolder", "is empty"},
         set("System/Folders/Temp=' Workflow/RemoteOutFolder='")},
        {"no JDF", 111, {"/server/temp/none.jdf", "No such file", "It is the JDF"},
         set("Output/Jdf/FileName='none.jdf")},
        {"no JDF of sub type 80", 255, {"Remote/JDFName", "80, 81 or 86"}, set("Input/SubType=80")},
        {"no install folder", 103, {"System/InstallFolder", "is missing", "/tickets/CVP_0001.xml"},
         set("System/InstallFolder=-")},
        {"no strip", 103,
         {"Footer/ControlstripFile and Footer/Nesting/ControlstripFile", "is missing"},
         set(name + "-")},
        {"short strip", 103, {"is too short", "at least 4 bytes"}, set(name + "'abc")},
        {"one strip only", 103, {"Footer/Nesting/ControlstripFile2"}, {}, {.strip = "1"}},
        {"no workflow", 103, {workflow + "\n", "is missing"}, set(workflow + "=-")},
        {"workflow as double", 103, {workflow, "is stored as a double, but an int is read"},
         set(workflow + "=3.0")},
        {"misspelt workflow", 103, {workflow, "the ticket has Workflow/Verify/MeasurmentWorkflow"},
         set(workflow + "=- Workflow/Verify/MeasurmentWorkflow=3")},
        {"unknown workflow", 103, {workflow, "is 5"}, set(workflow + "=5")},
        {"packaging workflow", 103, {workflow, "is 4", "Job/FromEsko"}, set(workflow + "=4")},
        {"no strip of a packaging job", 103, {"Footer/ControlstripIT8", "is missing"}, set(esko)},
        {"formula of the other strip", 103, {"Workflow/Verify/DeltaEMode",
         "the ticket has Workflow/Verify/DeltaEMode2"},
         set("Workflow/Verify/DeltaEMode=- Workflow/Verify/DeltaEMode2=4")},
        {"no number of the preset", 103, {"Workflow/Verify/ComparisonMethod", "is missing"},
         set("Workflow/Verify/ComparisonMethod=-")},
        {"no ticket of the preset", 103, {"ComparisonMethod", "is 9, but", "preset/9"},
         set("Workflow/Verify/ComparisonMethod=9")},
        {"no name of the preset", 103, {"preset/1 Name", "is missing"}, set("Name=-", 1, 27)},
        {"empty name of the preset", 103, {"preset/1 Name", "is empty"}, set("Name='", 1, 27)},
        {"no file of the preset", 103, {preset, "No such file", "It is the preset"},
         removeFile(preset)},
        {"cut preset", 103, {preset, "42, The tolerance preset is not well-formed XML"}, put(preset,
         "<preset")},
        {"misspelt criterion", 103, {preset, "48, "}, replaceIn(preset, "<average ", "<averag ")},
        {"no number of references", 103, {"Reference/Numpatches", "a profile is looked up"},
         set("Remote/Measurement/Reference/Numpatches=-")},
        {"too many references", 103, {"Reference/Numpatches", "is 2000000"},
         set("Remote/Measurement/Reference/Numpatches=2000000")},
        {"no profile", 103, {"Footer/ControlstripInputProfile and Remote/UsedICCProfile"},
         set(workflow + "=1")},
        {"no characterisation data", 103, {chartKey, "is missing"}, set(workflow + "=2")},
        {"empty characterisation data", 103, {chartKey, "is empty"}, set(workflow + "=2 " + chartKey
         + "='")},
        // clang-format on
    });
}

TEST(Diagnosis, NamesWhyAComparisonFails) {
    const std::string profile = "Workflow/Verify/MeasurementWorkflow=1 Remote/UsedICCProfile=";
    const std::string measured = "Remote/Measurement/";
    const std::string dataKey = "Workflow/Verify/CharacterizationData";
    const std::string data = "Workflow/Verify/MeasurementWorkflow=2 "
                             "Workflow/Verify/CharacterizationData='";
    expectCauses({
        // clang-format off
        {"missing profile", 20, {"/server/p.icc", "No such file", "It is the reference"},
         set(profile + "'/server/p.icc")},
        {"profile outside the store", 20, {"../p.icc", "names no file of the store"}, set(profile +
         "'/server/../../p.icc")},
        {"RGB profile", 34, {"/server/rgb.icc", "is the reference", "34, "},
         all({putFile("/server/rgb.icc", "/usr/share/color/icc/sRGB.icc"), set(profile +
         "'/server/rgb.icc")})},
        {"spreadsheet", 22, {"/x.csv", "is the reference", "22, "},
         all({put("/server/IT8_CharacterizationData/x.csv", "a;b\n"), set(data + "x.csv")})},
        {"no patches", 107, {measured + "Numpatches", "is missing"}, set(measured +
         "Numpatches=-")},
        {"0 patches", 105, {measured + "Numpatches", "is 0"}, set(measured + "Numpatches=0")},
        {"too many patches", 105, {measured + "Numpatches", "2000000"}, set(measured +
         "Numpatches=2000000")},
        {"no length", 107, {measured + "SpectralValues/Length", "is missing", "Length 0"},
         set(measured + "SpectralValues/Length=-")},
        {"inline job", 107, {"Numpatches", "example.it8", "reads as 0", "KEYWORD DEVICE"},
         all({replaceIn(strip, "DEVICE 33", "KEYWORD DEVICE\r\nDEVICE 33"), set("Input/SubType=96",
         9)}), {.job = "9"}},
        {"a name of the tool's own", 38, {"Measured sample.txt", "reserved", "with itself"},
         all({putFile("/server/a(TEMP)/Measured sample.txt", fogra39),
              setText(dataKey, "/server/a(TEMP)/Measured sample.txt"),
              set("Workflow/Verify/MeasurementWorkflow=2")})},
        // These succeed although they should not.
        {"ints", 0, {measured + "XYZValues/YValues", "contains an int as element 0"}, set(measured +
         "XYZValues/YValues=1,2,3"), {}, Then::IsWrong},
        {"short array", 0, {measured + "LabValues/AValues", "contains 2 of 48 elements"},
         set(measured + "LabValues/AValues=1.5,2.5"), {}, Then::IsWrong},
        {"references in percent", 0, {"Reference/CMYKValues/CValues",
         "contains a double as element 0, but an int is read"}, set(measured +
         "Reference/CMYKValues/CValues=10.0"), {}, Then::IsWrong},
        {"unknown formula", 0, {"Workflow/Verify/DeltaEMode", "is 7", "CIE76"},
         set("Workflow/Verify/DeltaEMode=7"), {}, Then::IsWrong},
        {"strip selector", 0, {"strip selector 2", "neither 0"}, {}, {.job = "10", .strip = "2"},
         Then::IsWrong},
        {"nested job alone", 0, {"Footer/Nesting/PSDAssessment", "is missing"},
         set("Footer/Nesting/PSDAssessment=-", 11), {.job = "11"}, Then::IsWrong},
        {"missing nested strip", 0, {"/server/ControlCharts/other.it8", "to this job alone"},
         set("Footer/Nesting/ControlstripFile='other.it8", 11), {.job = "11"}, Then::IsWrong},
        {"sound job", 0, {"the run succeeds"}, {}, {}, Then::Succeeds},
        {"sound nested job", 0, {"the run succeeds"}, {}, {.job = "11"}, Then::Succeeds},
        {"sound second strip", 0, {"the run succeeds"}, {}, {.job = "10", .strip = "1"},
         Then::Succeeds},
        {"second strip of one", 0, {"Also noticed", "Workflow/Verify/Active", "is not 3"},
         set("Workflow/Verify/Active=1", 10), {.job = "10", .strip = "1"}, Then::Succeeds},
        {"long spectra", 0, {"Also noticed", "SpectralValues/Length", "is 37"},
         set(measured + "SpectralValues/Length=37"), {}, Then::Succeeds},
        // clang-format on
    });
}

TEST(Diagnosis, NamesWhyAMeasurementFails) {
    const std::string dynamic = "Footer/Dynstrip/UseDynstrip=1 ";
    const std::string path = "Footer/Dynstrip/DeviceID=33 Footer/Dynstrip/File='/server/x.pdf "
                             "Footer/Dynstrip/IT8='";
    const Call job9 = {.job = "9"};
    expectCauses({
        // clang-format off
        {"missing strip", 106, {strip, "No such file", "control strip"}, removeFile(strip), job9},
        {"no columns", 106, {"example.it8", "NUMBER_OF_COLS"}, all({replaceIn(strip,
         "NUMBER_OF_COLS", "COLS"), replaceIn(strip, "NUMBER_OF_STRIPS", "STRIPS")}), job9},
        {"no device of a dynamic strip", 106, {"Footer/Dynstrip/DeviceID", "is missing"},
         set(dynamic, 9), job9},
        {"dynamic strip elsewhere", 106, {"/server/d.it8", "named by Footer/Dynstrip/IT8"},
         set(dynamic + path + "/server/d.it8", 9), job9},
        {"dynamic strip without columns", 106, {"d.it8", "NUMBER_OF_STRIPS and NUMBER_OF_COLS"},
         all({put("/server/d.it8", "DEVICE 33\n"), set(dynamic + path + "/server/d.it8", 9)}),
         job9},
        {"missing chart", 10, {chart, "No such file", "reference"}, removeFile(chart), job9},
        {"no references of a packaging job", 10,
         {"/server/ControlCharts/other.it8", "It is the reference"},
         set("Job/FromEsko=1 Workflow/Verify/MeasurementWorkflow=4 "
             "Workflow/Verify/CharacterizationData=- Footer/ControlstripFile='other.it8 "
             "Footer/ControlstripIT8='/server/ControlCharts/example.it8", 9), job9},
        {"damaged chart", 22, {chart, "22, "}, put(chart, "a;b\n"), job9},
        {"one name for two files", 106, {"NUMBER_OF_COLS", "example.it8", "same name as", strip},
         all({putFile("/server/IT8_CharacterizationData/example.it8", fogra39),
         set("Workflow/Verify/CharacterizationData='example.it8", 9)}), job9},
        {"another chart", 30, {"example.it8", "does not match", "30, "}, put(chart,
         "CGATS.17\nNUMBER_OF_FIELDS 8\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M "
         "CMYK_Y CMYK_K LAB_L LAB_A LAB_B\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\n"
         "BEGIN_DATA\nx 1 2 3 4 50 0 0\nEND_DATA\n"), job9},
        {"sound job", 0, {"being measured"}, {}, job9, Then::Succeeds},
        {"device 0", 0, {"Also noticed", "reads as 0", "DEVICE X"}, replaceIn(strip, "DEVICE 33",
         "DEVICE X"), {.job = "8"}, Then::Succeeds},
        // clang-format on
    });
}

// The reads are listed in order, and the store is unchanged.
TEST(Diagnosis, ReadsAndChangesNothing) {
    const Place place(moreJobs);
    const std::string before = everything(place);
    for (const char* job : {"7", "8", "9", "10", "11"}) {
        EXPECT_EQ(diagnose(place, {.job = job}).exitCode, 0) << job;
    }
    const support::Outcome outcome = diagnose(place, {}, true);
    const auto report = nlohmann::json::parse(outcome.output);
    EXPECT_EQ(report["code"], 0);
    EXPECT_EQ(report["measures"], false);
    EXPECT_EQ(report["causes"].size() + report["spoilers"].size() + report["notices"].size(), 0u);
    EXPECT_EQ(everything(place), before);

    const std::string all = place.administer({"diagnose", "7", "--all"});
    for (const std::string& line :
         {std::string("job/7 Input/Title: \"Summer catalogue, sheet 1\"\n"),
          "file " + std::string(preset) + ": came\n",
          std::string("job/7 Remote/Measurement/XYZValues/XValues: 48 elements\n")}) {
        EXPECT_THAT(all, HasSubstr(line));
    }
}

} // namespace
