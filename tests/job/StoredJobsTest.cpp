// Runs of the real program on jobs whose measurement is in their ticket: arguments and a store in,
// the exit code, the log and the job's folder out.
#include <chrono>
#include <filesystem>
#include <fstream>
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

#include "RunProgram.h"
#include "SuiteRoot.h"
#include "TicketText.h"
#include "comgui/StoreEngine.h"
#include "comgui/StoreKeep.h"
#include "comgui/Users.h"

namespace {

namespace fs = std::filesystem;
using testing::EndsWith;
using testing::HasSubstr;

constexpr const char* viewer = "Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify";

/// The arguments of a job form that are not the usual ones.
struct Call {
    std::string job = "7";
    std::string strip = "0";
    std::string password = "room";
    std::string user = "press";
    std::string host = {};      ///< Empty: the store's.
    std::string remeasure = {}; ///< Empty: none.
};

/// A store with the example job, and a system root and a temporary folder around it.
class Place {
  public:
    Place() {
        fs::copy(example().path("store"), address, fs::copy_options::recursive);
        m_root.installPlistReader(PLIST_READER);
        m_root.installCommBundle(COMGUI_BUNDLE);
        fs::create_directories(fs::path(path(viewer)).parent_path());
        std::ofstream(path(viewer)) << "#!/bin/sh\nprintf '[%s]' \"$@\" > \"$TINTGATE_ROOT/part\"\n"
                                       "mv \"$TINTGATE_ROOT/part\" \"$TINTGATE_ROOT/shown\"\n";
        chmod(path(viewer).c_str(), 0755);
        useTemporaryFolder("tmp");
    }

    std::string path(const std::string& name) const { return m_root.path(name); }

    void useTemporaryFolder(const std::string& name) {
        temporary = path(name);
        fs::create_directories(temporary);
    }

    std::string jobFile(const std::string& name) const {
        return temporary + "/Tintgate/JobID_7/" + name;
    }

    support::Outcome run(const Call& call = {},
                         std::map<std::string, std::optional<std::string>> environment = {}) const {
        std::vector<std::string> words = {TINTGATE_PROGRAM,
                                          "KEY_KZ_HOST:=:" +
                                              (call.host.empty() ? address : call.host),
                                          "KEY_KZ_STRIP:=:" + call.strip,
                                          "KEY_KZ_JOBID:=:" + call.job,
                                          "KEY_KZ_LANGUAGE:=:en_US",
                                          "KEY_KZ_UNUSED:=:",
                                          "KEY_KZ_PASSWORD:=:" + call.password,
                                          "KEY_KZ_USER:=:" + call.user};
        if (!call.remeasure.empty()) {
            words.push_back(call.remeasure);
        }
        return runWords(words, std::move(environment));
    }

    support::Outcome
    runWords(std::vector<std::string> words,
             std::map<std::string, std::optional<std::string>> environment = {}) const {
#ifndef __SANITIZE_ADDRESS__
        words.insert(words.begin(), {"prlimit", "--as=1500000000"});
#endif
        environment.insert({"TMPDIR", temporary});
        support::RunOptions options;
        options.environment = std::move(environment);
        return support::run(words, options);
    }

    /// The messages of the job's log, with marks for the folders; empty where there is none.
    std::string log() const {
        const std::string file = temporary + "/Tintgate/TintgateKZ.log";
        std::string text;
        if (support::exists(file)) {
            std::istringstream lines(support::contentsOf(file));
            for (std::string line; std::getline(lines, line);) {
                text += line.substr(line.find(":\t") + 2) + "\n";
            }
        }
        for (const auto& [folder, mark] :
             {std::pair{temporary + "/Tintgate/JobID_7", "JOB"}, std::pair{address, "STORE"}}) {
            for (std::size_t at; (at = text.find(folder)) != std::string::npos;) {
                text.replace(at, folder.size(), mark);
            }
        }
        return text;
    }

    std::shared_ptr<store::StoreEngine> engine() const {
        return store::openStore(address);
    }

    /// Changes a ticket, in the words of TicketText.h.
    void set(const std::string& records, int type = 3, int id = 7) const {
        store::StoreKeep keep(engine());
        ASSERT_TRUE(keep.apply(type, id, support::RecordTable(records).records())) << records;
    }

    /// A text of any bytes.
    void setText(const char* key, const std::string& text) const {
        SETMULTIPAR records[2];
        records[0].key = key;
        records[0].type = PARAM_STRING;
        records[0].value = text.c_str();
        records[0].position = POSITION_WHOLE;
        store::StoreKeep keep(engine());
        ASSERT_TRUE(keep.apply(3, 7, records)) << key;
    }

    void putFile(const std::string& serverPath, const std::string& contents) const {
        std::istringstream text(contents);
        engine()->putFile(serverPath, text);
    }

    /// All tickets.
    std::string tickets() const {
        return support::run({TINTGATE_STORE_PROGRAM, "-s", address, "export"}).output;
    }

    /// What the viewer was started with. It is not waited for, so it may be late.
    std::string shown() const {
        for (int i = 0; i < 200 && !support::exists(path("shown")); ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
        }
        return support::contentsOf(path("shown"));
    }

  private:
    /// Made once; a store is copied like any folder.
    static const support::ScratchFolder& example() {
        static const support::ScratchFolder folder;
        static const bool made = [] {
            const std::string address = folder.path("store");
            store::makeStore(address, "Press room");
            store::openStore(address)->putUser({"press", store::passwordHash("room"), false});
            const std::string store = TINTGATE_STORE_PROGRAM;
            for (const std::vector<std::string>& command :
                 {std::vector<std::string>{"python3",
                                           TINTGATE_SOURCE_DIR "/docs/example-job/make-job.py",
                                           folder.path("job")},
                  {store, "-s", address, "import", folder.path("job/tickets.json")},
                  {store, "-s", address, "file", "put", folder.path("job/server"), "/server"}}) {
                const support::Outcome outcome = support::run(command);
                EXPECT_EQ(outcome.exitCode, 0) << command[0] << outcome.error;
            }
            return true;
        }();
        EXPECT_TRUE(made);
        return folder;
    }

    const support::SuiteRoot m_root;

  public:
    const std::string address = m_root.path("store");
    std::string temporary;
};

constexpr char loginLines[] = "Tintgate.exe verion = 1.6.20\nTintgateLib.dll verion = 1.0.0\n";
constexpr char loadLines[] = "Logged in to = STORE\nVeryfing Job ID = 7\n"
                             "LoadKZJobReferences returns = 0\nLoadKZJobData returns = 0\n";
constexpr char compareLines[] = "parsePresetParameterXMLFile returns = 0\nm_jobType is = 2\n"
                                "Comparing existing data\nLoadKZJobMeasurements returns = 0\n";
constexpr char analysisLines[] = "Reference file = JOB/Measured reference.txt\n"
                                 "Measurement file = JOB/Measured sample.txt\n"
                                 "analyzeMeasurements returns = 0\n";

TEST(StoredJobs, AreComparedAndShown) {
    const Place place;
    const std::string before = place.tickets();
    const support::Outcome outcome = place.run();
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.output + outcome.error, "");
    EXPECT_EQ(place.log(), std::string(loginLines) + loadLines + compareLines + analysisLines +
                               "LaunchNerovaVerify\nOverall result = 0\n");
    EXPECT_EQ(place.shown(), "[-detail][-meta][" + place.jobFile("meta.json") + "]");
    EXPECT_THAT(support::contentsOf(place.jobFile("output.json")),
                HasSubstr("\"verdict\": \"failed\""));
    EXPECT_THAT(support::contentsOf(place.jobFile("meta.json")), HasSubstr("\"user\": \"press\""));
    EXPECT_EQ(place.tickets(), before);
    EXPECT_EQ(support::modeOf(place.temporary + "/Tintgate/TintgateKZ.log"), 0600u);

    // The file forms say the same of the two files.
    const std::string result = place.path("files.json");
    const support::Outcome files = place.runWords(
        {TINTGATE_PROGRAM, place.jobFile("Measured reference.txt"),
         place.jobFile("Measured sample.txt"), place.jobFile("CVP_0001.xml"), result});
    EXPECT_EQ(files.exitCode, 0);
    const std::regex time("\"created\": \"[^\"]*\"");
    EXPECT_EQ(std::regex_replace(support::contentsOf(result), time, ""),
              std::regex_replace(support::contentsOf(place.jobFile("output.json")), time, ""));
}

// Every code that a run can end with, but for those of jobs to be measured.
TEST(StoredJobs, EndWithTheCodeOfWhatWentWrong) {
    const auto noPreparation = [](const Place&) {};
    const auto set = [](const std::string& records) {
        return [records](const Place& place) { place.set(records); };
    };
    const auto setFormat = [](const char* version) {
        return [version](const Place& place) {
            support::run(
                {"python3", "-c",
                 "import sqlite3, sys\n"
                 "sqlite3.connect(sys.argv[1]).execute('PRAGMA user_version=' + sys.argv[2])",
                 place.address + "/tickets.db", version});
        };
    };
    const auto refusal = [](int code) {
        return "Not able to connect to = STORE last ComGui error = " + std::to_string(code) + "\n";
    };
    const auto ending = [](int code) { return "Overall result = " + std::to_string(code) + "\n"; };
    const struct {
        const char* what;
        std::function<void(const Place&)> prepare;
        Call call;
        int code;
        std::string log; ///< Its end.
    } cases[] = {
        {"no job", noPreparation, {.job = ""}, 5, loginLines},
        {"no strip", noPreparation, {.strip = ""}, 5, loginLines},
        {"a strip that is no number", noPreparation, {.strip = "first"}, 5, loginLines},
        {"a strip beyond all numbers", noPreparation, {.strip = "4294967296"}, 5, loginLines},
        {"no user", noPreparation, {.user = ""}, 5, loginLines},
        {"no store",
         noPreparation,
         {.host = "/no/store"},
         150,
         "Not able to connect to = /no/store last ComGui error = 150\n"},
        {"no password", noPreparation, {.password = ""}, 151, refusal(151)},
        {"another user", noPreparation, {.user = "proof"}, 151, refusal(151)},
        {"an old server",
         [](const Place& place) { place.set("System/Product/MajorVersion=4", 0, 0); },
         {},
         151,
         refusal(151)},
        {"a disabled user",
         [](const Place& place) {
             store::User user = *place.engine()->user("press");
             user.disabled = true;
             place.engine()->putUser(user);
         },
         {},
         152,
         refusal(152)},
        {"a newer store", setFormat("99"), {}, 153, refusal(153)},
        {"an older store", setFormat("0"), {}, 154, refusal(154)},
        {"another job", noPreparation, {.job = "8"}, 108, "Logged in to = STORE\n"},
        {"a closed job",
         set("Job/Display/Status=211 Remote/ShowInVerifier=0"),
         {},
         108,
         "Logged in to = STORE\n"},
        {"no name of a JDF",
         set("Output/Jdf/FileName=-"),
         {},
         255,
         "LoadKZJobData returns = -1\nOverall result = -1\n"},
        {"no JDF",
         set("Output/Jdf/FileName='none.jdf"),
         {},
         111,
         "LoadKZJobData returns = 111\nOverall result = 111\n"},
        {"a damaged preset",
         [](const Place& place) { place.putFile("/server/tickets/CVP_0001.xml", "<preset"); },
         {},
         103,
         "parsePresetParameterXMLFile returns = 103\nOverall result = 103\n"},
        {"no number of patches",
         set("Remote/Measurement/Numpatches=-"),
         {},
         107,
         "LoadKZJobMeasurements returns = -1\nOverall result = 107\n"},
        {"no patches",
         set("Remote/Measurement/Numpatches=0"),
         {},
         105,
         "Measurement file not found = JOB/Measured sample.txt\nOverall result = 105\n"},
        {"a sample that can't be written",
         [](const Place& place) { fs::create_directories(place.jobFile("Measured sample.txt")); },
         {},
         105,
         "Measurement file not found = JOB/Measured sample.txt\nOverall result = 105\n"},
        // On this road a missing reference is left to the analysis.
        {"no references",
         set("Workflow/Verify/MeasurementWorkflow=2 Workflow/Verify/CharacterizationData='none"),
         {},
         20,
         "Reference file not found = \nReference file = \n"
         "Measurement file = JOB/Measured sample.txt\nanalyzeMeasurements returns = 20\n" +
             ending(20)},
        {"no result",
         [](const Place& place) { fs::create_directories(place.jobFile("output.json")); },
         {},
         71,
         "Resulting json file not found = JOB/output.json\n" + ending(71)},
        {"no meta file",
         [](const Place& place) { fs::create_directories(place.jobFile("meta.json")); },
         {},
         72,
         "Resulting json meta file not found = JOB/meta.json\n" + ending(72)},
        {"no viewer",
         [](const Place& place) { fs::remove(place.path(viewer)); },
         {},
         109,
         "LaunchNerovaVerify\nNerova Verify.exe allready running\n" + ending(109)},
        {"a viewer that can't be started",
         [](const Place& place) { chmod(place.path(viewer).c_str(), 0644); },
         {},
         109,
         "LaunchNerovaVerify\nNerova Verify.exe allready running\n" + ending(109)},
        // The road of jobs to be measured: there is no measuring tool here.
        {"a job not measured",
         set("Remote/Measurement/Status=0 Workflow/Verify/MeasurementWorkflow=2 "
             "Workflow/Verify/CharacterizationData='none"),
         {},
         106,
         "Veryfing existing measurement job\nConfigureAndLaunchNerovaMeasure returns = -2\n" +
             ending(106)},
        {"a job to be remeasured",
         set("Job/Display/Status=211"),
         {.remeasure = "KEY_KZ_REMEASURE:=:true"},
         106,
         "Veryfing existing measurement job\nConfigureAndLaunchNerovaMeasure returns = -2\n" +
             ending(106)},
        {"almost a remeasurement",
         noPreparation,
         {.remeasure = "KEY_KZ_REMEASURE:=:True"},
         0,
         ending(0)},
    };
    for (const auto& [what, prepare, call, code, log] : cases) {
        SCOPED_TRACE(what);
        const Place place;
        prepare(place);
        const support::Outcome outcome = place.run(call);
        EXPECT_EQ(outcome.exitCode, code);
        EXPECT_EQ(outcome.output + outcome.error, "");
        EXPECT_THAT(place.log(), EndsWith(log));
    }
}

TEST(StoredJobs, TakeTheSecondStripOfAnInlineInstrument) {
    for (const auto& [device, code] :
         {std::pair{"40", 107}, {"44", 106}, {"45", 107}, {"47", 107}, {"48", 106}}) {
        const Place place;
        place.set(
            "Workflow/Verify/MeasurementWorkflow2=2 Workflow/Verify/CharacterizationData2='none "
            "Footer/ControlstripFile2='inline Workflow/Verify/DeltaEMode2=4 "
            "Workflow/Verify/ComparisonMethod2=1 Footer/Dynstrip/UseDynstrip=1");
        place.putFile("/server/ControlCharts/inline.it8", std::string("DEVICE ") + device + "\n");
        EXPECT_EQ(place.run({.strip = "1"}).exitCode, code) << device;
        EXPECT_THAT(place.log(), HasSubstr("m_jobType is = 0\n")) << device;
    }
}

// Whatever a ticket holds, a run ends with a code and without much memory.
TEST(StoredJobs, BearHostileTickets) {
    const std::string measurement = "Remote/Measurement/";
    const struct {
        std::string records;
        int code;
    } cases[] = {
        {measurement + "Numpatches='many", 107},
        {measurement + "Numpatches=-1", 105},
        {measurement + "Numpatches=2000000000", 105},
        {measurement + "Numpatches=2147483647 " + measurement + "SpectralValues/Length=36", 105},
        {measurement + "Numpatches=100000", 0},
        {measurement + "SpectralValues/Length=37", 0},
        {measurement + "SpectralValues/Length=-1", 0},
        {measurement + "SpectralValues/Length=2147483647", 0},
        {measurement + "SpectralValues/Length='ten", 107},
        {measurement + "SpectralValues/Base=2147483647 " + measurement +
             "SpectralValues/Stepsize=2147483647 " + measurement + "SpectralValues/Length=36",
         0},
        {measurement + "XYZValues/XValues=1.5 " + measurement + "LabValues/LValues=nan", 28},
        {measurement + "CMYKValues/CValues='none", 0},
        {measurement + "Reference/Numpatches=2000000000", 103},
        {measurement + "Reference/Numpatches='many", 103},
        {measurement + "Status=-2147483648", 103},
        {measurement + "Status=2147483647", 0},
        {"Workflow/Verify/ComparisonMethod=-5", 103},
        {"Workflow/Verify/ComparisonMethod=2147483647", 103},
        {"Workflow/Verify/DeltaEMode=-2147483648", 0},
        {"General/ParentID=2147483647 Footer/Nesting/PSDAssessment=' "
         "Footer/Nesting/ControlstripMode=1 Footer/Nesting/ControlstripFile='.",
         0},
        {"Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/DeviceID=-2147483648 "
         "Footer/Dynstrip/IT8='/ Footer/Dynstrip/File='..",
         20},
        {"Output/Jdf/FileName='../../../../../etc/passwd", 111},
        {"Output/Jdf/FileName='/", 111},
        {"Output/Jdf/FileName='..", 111},
        {"System/InstallFolder='../../..", 103},
    };
    for (const auto& [records, code] : cases) {
        const Place place;
        place.set(records);
        const support::Outcome outcome = place.run();
        EXPECT_EQ(outcome.exitCode, code) << records << "\n" << place.log();
        EXPECT_EQ(outcome.error, "") << records;
    }
}

// Bytes of a ticket are text, a path and a part of a JSON file.
TEST(StoredJobs, BearTextsOfAnyBytes) {
    const std::string strange = "a\n\t\"</script>%s\\\x01\xc3\xa9";
    const struct {
        const char* key;
        std::string text;
        int code;
    } cases[] = {
        {"Input/Title", strange + std::string(100'000, 'x'), 0},
        {"Input/Title", "caf\xe9", 0},
        {"CMM/PaperName", strange, 0},
        {"Footer/ControlstripFile", "/server/a\nb.it8", 0},
        {"Footer/ControlstripFile", std::string(5'000, 'x'), 0},
        {"Output/Jdf/FileName", "a\nb.jdf", 111},
        {"Output/Jdf/FileName", "\xff\xfe", 111},
        {"System/InstallFolder", "/server\n", 103},
    };
    for (const auto& [key, text, code] : cases) {
        const Place place;
        place.setText(key, text);
        EXPECT_EQ(place.run().exitCode, code) << key << " " << text.substr(0, 30) << "\n"
                                              << place.log();
        if (code == 0) {
            EXPECT_EQ(
                support::run({"python3", "-m", "json.tool", place.jobFile("meta.json")}).exitCode,
                0);
        }
    }
}

// Names outside ASCII in a locale that has no such characters.
TEST(StoredJobs, KeepEveryCharacterInEveryLocale) {
    std::string usual;
    for (const char* folder : {"tmp", "d\xc3\xa9p\xc3\xb4t \xe5\x88\xb7"}) {
        Place place;
        place.useTemporaryFolder(folder);
        place.setText("Input/Title", "\xc3\x89preuve \xf0\x9f\x8e\xa8");
        place.engine()->putUser({"J\xf6rg",
                                 store::passwordHash("\xfc"
                                                     "ber"),
                                 false});
        const support::Outcome outcome = place.run({.password = "\xc3\xbc"
                                                                "ber",
                                                    .user = "J\xc3\xb6rg"},
                                                   {{"LC_ALL", "C"}, {"LANG", "C"}});
        EXPECT_EQ(outcome.exitCode, 0) << folder << place.log();
        const std::string meta = support::contentsOf(place.jobFile("meta.json"));
        EXPECT_THAT(meta, HasSubstr("\\u00c9preuve \\ud83c\\udfa8"));
        EXPECT_THAT(meta, HasSubstr("J\\u00f6rg"));
        // From the verdict on, behind the paths.
        std::string result = support::contentsOf(place.jobFile("output.json"));
        result.erase(0, result.find("\"criteria\""));
        EXPECT_GT(result.size(), 1000u);
        usual = usual.empty() ? result : usual;
        EXPECT_EQ(result, usual) << folder;
        EXPECT_THAT(place.log(), HasSubstr("Measurement file = JOB/Measured sample.txt\n"));
    }
}

TEST(StoredJobs, ReadTheirArgumentsByPlace) {
    const Place place;
    const auto words = [&](const std::string& host, const std::string& job) {
        return std::vector<std::string>{TINTGATE_PROGRAM, host, "0",    job,
                                        "en_US",          "",   "room", "a:b:press"};
    };
    const struct {
        std::vector<std::string> words;
        int code;
    } cases[] = {
        {words("x KEY_KZ_HOST y:" + place.address, "7"), 0},
        {words("KEY_KZ_HOST", "7"), 150}, // A host of this name.
        {words("KEY_KZ_HOST:a:" + place.address, "K::7 and more"), 0},
        {words("KEY_KZ_HOST:", "7"), 5},
        {words(place.address, "7"), 255},
        {words("KEY_KZ_HOST:", "-1"), 0},
    };
    for (const auto& [call, code] : cases) {
        EXPECT_EQ(place.runWords(call).exitCode, code) << call[1];
    }
    const support::Outcome outcome = place.runWords(words("KEY_KZ_HOST:" + place.address, "seven"));
    EXPECT_EQ(outcome.signal, SIGABRT);
}

TEST(StoredJobs, StartTheViewerWithoutAJob) {
    const Place place;
    EXPECT_EQ(place.run({.job = "-1", .strip = "x", .user = "nobody"}).exitCode, 0);
    EXPECT_EQ(place.shown(), "[]");
    EXPECT_EQ(place.log(), loginLines);
    fs::remove(place.path(viewer));
    EXPECT_EQ(place.run({.job = "-1"}).exitCode, 255);
}

// What a job writes holds passwords, and in a shared folder anybody may make names.
TEST(StoredJobs, UseNoFolderOfOthers) {
    const Place place;
    fs::create_directories(place.path("theirs"));
    fs::create_directory_symlink(place.path("theirs"), place.temporary + "/Tintgate");
    EXPECT_EQ(place.run().exitCode, 111);
    EXPECT_TRUE(fs::is_empty(place.path("theirs")));
}

} // namespace
