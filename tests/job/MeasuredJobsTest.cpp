// Runs of the real program on jobs to be measured: the whole suite, a store, and the measuring tool
// with its virtual instrument. A run takes two seconds at least, so runs go side by side, each with
// a system root and a temporary folder of its own.
#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <random>
#include <set>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Postgres.h"
#include "RunProgram.h"
#include "RunningProgram.h"
#include "SuiteRoot.h"
#include "comgui/StoreEngine.h"
#include "comgui/Users.h"
#include "tests/job/Rounds.h"

namespace {

namespace fs = std::filesystem;

const std::string profile = "/usr/share/color/icc/ghostscript/default_cmyk.icc";
const std::string instrument = "instrument = virtual\nspectra = yes\nprofile = " + profile + "\n";
const std::string poorPrint = "bias = 0 0 20\n";

/// What one run has for itself.
class Place {
  public:
    explicit Place(const std::string& settings = instrument) {
        m_root.installPlistReader(PLIST_READER);
        m_root.installCommBundle(COMGUI_BUNDLE);
        m_root.writePreferences("ApplicationsUsingNerovaMeasure_x64.plist",
                                {{"installed_path", m_root.path("Applications/Nerova")}});
        m_root.copyProgram(MEASURING_TOOL, toolName);
        // All that the tool asks of a viewer is that it can be started.
        m_root.copyProgram("/bin/true",
                           "Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify");
        write("Library/Preferences/NerovaMeasure.conf", settings);
        fs::create_directories(m_root.path("tmp"));
    }

    std::string path(const std::string& name) const { return m_root.path(name); }
    std::string tool() const { return path(toolName); }
    std::string jobFolder(int job) const {
        return path("tmp/Tintgate/JobID_" + std::to_string(job));
    }

    void replaceTool(const std::string& program) const { m_root.copyProgram(program, toolName); }

    std::string write(const std::string& name, const std::string& text) const {
        fs::create_directories(fs::path(path(name)).parent_path());
        std::ofstream(path(name)) << text;
        return path(name);
    }

    /// Kills the measuring tool of this place.
    bool killTool() const {
        for (const auto& entry : fs::directory_iterator("/proc")) {
            std::error_code none;
            if (fs::read_symlink(entry.path() / "exe", none) == tool()) {
                return kill(std::atoi(entry.path().filename().c_str()), SIGKILL) == 0;
            }
        }
        return false;
    }

  private:
    static constexpr const char* toolName =
        "Applications/Nerova/NerovaMeasure.app/Contents/MacOS/NerovaMeasure";
    const support::SuiteRoot m_root;
};

/// Whether the process has ended; its exit code, or 1000 and the signal that ended it.
bool hasEnded(pid_t process, int* code, bool wait) {
    int status = 0;
    if (waitpid(process, &status, wait ? 0 : WNOHANG) != process) {
        return false;
    }
    *code = WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
    return true;
}

int endOf(pid_t process) {
    int code = -1;
    hasEnded(process, &code, true);
    return code;
}

/// A store in a folder, or in a database of the tests' server.
class MeasuredJobs : public testing::Test {
  protected:
    explicit MeasuredJobs(bool onServer = false)
        : server(onServer ? std::make_unique<support::PostgresRoom>() : nullptr),
          address(onServer ? "room" : folder.path("store")) {
        store::makeStore(address, "Press room");
        engine = store::openStore(address);
        engine->putUser({"press", hash, false});
    }

    /// Brings an example job to the server.
    void deliver(int job, const std::vector<std::string>& options) const {
        const std::string parts = folder.path("delivered-" + std::to_string(job));
        std::vector<std::string> make = {
            "python3", TINTGATE_SOURCE_DIR "/docs/example-job/make-job.py",
            parts,     "--unmeasured",
            "--job",   std::to_string(job)};
        make.insert(make.end(), options.begin(), options.end());
        ASSERT_EQ(support::run(make).exitCode, 0);
        ASSERT_EQ(administer({"import", parts + "/tickets.json"}), 0);
        ASSERT_EQ(administer({"file", "put", parts + "/server", "/server"}), 0);
    }

    /// Brings a job with the same ticket and JDF under another number.
    void deliverAgain(int job, int from) const {
        const auto content = engine->content(3, from, store::KeyFilter());
        const std::string name = "job-" + std::to_string(job) + ".jdf";
        std::stringstream jdf;
        engine->getFile("server/temp/job-" + std::to_string(from) + ".jdf", jdf);
        engine->putFile("server/temp/" + name, jdf);
        engine->create(3, job);
        store::Scope all;
        all.everything = true;
        engine->change(3, job, all, [&](store::TicketContent& ticket) {
            ticket.transfer(*content, true);
            auto elements = std::make_shared<store::Elements>();
            elements->put(0, store::Text{std::make_shared<store::Bytes>(name)});
            ticket.put("Output/Jdf/FileName", elements);
        });
    }

    int administer(std::vector<std::string> words) const {
        words.insert(words.begin(), {TINTGATE_STORE_PROGRAM, "--store", address});
        return support::run(words).exitCode;
    }

    /// Starts the tool as a client does.
    pid_t start(const Place& place, int job, int strip = 0) const {
        const std::string arguments[] = {"KEY_KZ_HOST:=:" + address,
                                         "KEY_KZ_STRIP:=:" + std::to_string(strip),
                                         "KEY_KZ_JOBID:=:" + std::to_string(job),
                                         "KEY_KZ_LANGUAGE:=:en_US",
                                         "KEY_KZ_MODE:=:0",
                                         "KEY_KZ_PASSWORD:=:room",
                                         "KEY_KZ_USER:=:press"};
        const pid_t process = fork();
        if (process == 0) {
            setenv("TINTGATE_ROOT", place.path(".").c_str(), 1);
            setenv("TMPDIR", place.path("tmp").c_str(), 1);
            unsetenv("TINTGATE_MEASURE");
            const char* words[std::size(arguments) + 2] = {TINTGATE_PROGRAM};
            std::transform(std::begin(arguments), std::end(arguments), words + 1,
                           [](const std::string& word) { return word.c_str(); });
            execv(TINTGATE_PROGRAM, const_cast<char**>(words));
            _exit(99);
        }
        return process;
    }

    std::shared_ptr<const store::TicketContent> ticket(int job) const {
        return engine->content(3, job, store::KeyFilter());
    }

    /// The one int of a key; -1 where it is not there.
    static int number(const store::TicketContent& ticket, const std::string& key) {
        const auto elements = ticket.find(key);
        return elements == nullptr ? -1 : std::get<int>(*elements->first());
    }

    static bool isClosed(const store::TicketContent& ticket) {
        const int display = number(ticket, "Job/Display/Status");
        const int identification = number(ticket, "Job/Identification/Status");
        return (display == 211 || display == 212) &&
               (identification == 211 || identification == 212) &&
               number(ticket, "Remote/ShowInVerifier") == 0;
    }

    /// Element counts of all keys below a strip's root.
    static std::map<std::string, int> counts(const store::TicketContent& ticket) {
        std::map<std::string, int> all;
        for (const auto& [key, elements] : ticket.keys()) {
            if (key.rfind("Remote/Measurement/", 0) == 0) {
                all[key] = elements->count();
            }
        }
        return all;
    }

    const support::ScratchFolder folder;
    const std::unique_ptr<support::PostgresRoom> server;
    const std::string address;
    std::shared_ptr<store::StoreEngine> engine;

  private:
    /// Hashing is slow by intent.
    inline static const std::string hash = store::passwordHash("room");
};

class MeasuredJobsOfEachStore : public MeasuredJobs, public testing::WithParamInterface<bool> {
  protected:
    MeasuredJobsOfEachStore() : MeasuredJobs(GetParam()) {}
};

INSTANTIATE_TEST_SUITE_P(, MeasuredJobsOfEachStore, testing::Bool(), [](const auto& info) {
    return std::string(info.param ? "Postgres" : "Sqlite");
});

TEST_F(MeasuredJobs, EndWithTheCodeOfWhatWentWrong) {
    deliver(1, {"--references", profile});
    deliverAgain(2, 1);
    deliver(3, {}); // Characterisation data, of which the server's copy goes:
    fs::remove_all(address + "/files/server/IT8_CharacterizationData");
    const auto before = {ticket(1), ticket(3)};
    const std::string crash = instrument + "mishap = crash\n";

    enum Tool { ours, missing, running, notExecutable, other };
    const struct Case {
        const char* name;
        int job;
        std::string settings;
        Tool tool;
        int code;
    } cases[] = {
        {"measured", 2, instrument, ours, 0},
        {"running already", 1, instrument, running, 106},
        {"missing", 1, instrument, missing, 106},
        {"not to be executed", 1, instrument, notExecutable, 105},
        {"crashing half-way", 1, crash, ours, 105},
        {"failing", 1, instrument + "mishap = fail\n", ours, 105},
        {"cancelled", 1, instrument + "mishap = cancel\n", ours, 105},
        {"ending without a file", 1, instrument, other, 105},
        {"no references", 3, instrument, ours, 10},
        {"neither references nor measurement", 3, crash, ours, 105},
        {"hanging", 1, instrument + "mishap = hang\n", ours, -1},
    };
    struct Run {
        std::unique_ptr<Place> place;
        std::unique_ptr<support::RunningProgram> other;
        pid_t process;
    };
    std::vector<Run> runs;
    for (const auto& [name, job, settings, tool, code] : cases) {
        Run run{std::make_unique<Place>(settings), nullptr, 0};
        const std::string path = run.place->tool();
        if (tool == missing) {
            fs::remove_all(run.place->path("Applications/Nerova/NerovaMeasure.app"));
        } else if (tool == notExecutable) {
            fs::permissions(path, fs::perms(0600));
        } else if (tool == running) {
            run.place->replaceTool("/bin/sleep");
            run.other = std::make_unique<support::RunningProgram>(path);
        } else if (tool == other) {
            run.place->replaceTool("/bin/true");
        }
        // An old measurement, which must not be taken for a new one.
        run.place->write("tmp/Tintgate/JobID_" + std::to_string(job) + "/Measured sample.txt",
                         "old");
        run.process = start(*run.place, job);
        runs.push_back(std::move(run));
    }
    for (std::size_t i = 0; i + 1 < runs.size(); ++i) {
        SCOPED_TRACE(cases[i].name);
        EXPECT_EQ(endOf(runs[i].process), cases[i].code);
        EXPECT_EQ(fs::exists(runs[i].place->jobFolder(cases[i].job) + "/Measured sample.txt"),
                  cases[i].code == 0 || cases[i].code == 10);
    }
    // The tool has no patience of its own to lose; nobody waits for what hangs but a person.
    const Run& hanging = runs.back();
    int code = 0;
    EXPECT_FALSE(hasEnded(hanging.process, &code, false));
    EXPECT_TRUE(hanging.place->killTool());
    EXPECT_EQ(endOf(hanging.process), 105) << "a zombie does not run";

    EXPECT_TRUE(isClosed(*ticket(2)));
    for (const int job : {1, 3}) {
        const auto& content = *(begin(before) + (job == 1 ? 0 : 1));
        EXPECT_EQ(ticket(job)->keys().size(), content->keys().size());
        EXPECT_FALSE(isClosed(*ticket(job)));
    }
}

TEST_P(MeasuredJobsOfEachStore, OfTwoStripsAreClosedWhenBothHaveAResult) {
    constexpr int batch = 10; // Pairs that run at once.
    const int pairs = roundsOr(5);
    deliver(1, {"--references", profile, "--two-strips"});
    std::vector<std::unique_ptr<Place>> places;
    for (int i = 0; i < 2 * std::min(batch, pairs); ++i) {
        places.push_back(std::make_unique<Place>(instrument + (i % 2 == 0 ? "" : poorPrint)));
    }
    for (int first = 2; first < 2 + pairs; first += batch) { // The first is the model of all.
        const int last = std::min(first + batch, 2 + pairs) - 1;
        std::set<pid_t> running;
        for (int job = first; job <= last; ++job) {
            deliverAgain(job, 1);
        }
        for (int job = first; job <= last; ++job) {
            for (const int strip : {0, 1}) {
                const auto place = static_cast<std::size_t>(2 * (job - first) + strip);
                running.insert(start(*places[place], job, strip));
            }
        }
        // At no moment is a job closed that lacks a result.
        while (!running.empty() && !HasFailure()) {
            for (int job = first; job <= last; ++job) {
                const auto seen = ticket(job);
                const int status = number(*seen, "Job/Display/Status");
                EXPECT_TRUE(status == 208 || (number(*seen, "Remote/Measurement/Approval") == 1 &&
                                              number(*seen, "Remote/Measurement2/Approval") == 0));
            }
            for (auto process = running.begin(); process != running.end();) {
                int code = 0;
                const bool ended = hasEnded(*process, &code, false);
                EXPECT_EQ(code, 0);
                process = ended ? running.erase(process) : std::next(process);
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
        for (int job = first; job <= last; ++job) {
            EXPECT_TRUE(isClosed(*ticket(job))) << "job " << job;
        }
    }
}

TEST_P(MeasuredJobsOfEachStore, GiveTheirResultToTheirParentsJobs) {
    deliver(1, {"--references", profile, "--parent", "9"});
    deliverAgain(2, 1);
    deliver(3, {"--references", profile});
    const Place place;
    EXPECT_EQ(endOf(start(place, 1)), 0);
    for (const int job : {1, 2, 9}) {
        SCOPED_TRACE(job);
        EXPECT_TRUE(isClosed(*ticket(job)));
        EXPECT_EQ(number(*ticket(job), "Remote/Measurement/Status"), 1);
        EXPECT_EQ(counts(*ticket(job)), counts(*ticket(1)));
    }
    EXPECT_FALSE(isClosed(*ticket(3)));
}

TEST_P(MeasuredJobsOfEachStore, KilledWhileTheyWriteLeaveAllWholeAndCanBeRunAgain) {
    const int runs = roundsOr(8);
    constexpr int batch = 8;
    deliver(10, {"--references", profile}); // Numbers of two digits, for JDFs of one length.
    for (int job = 11; job <= 11 + runs; ++job) {
        deliverAgain(job, 10);
    }
    const auto jdfOf = [&](int job) {
        std::ostringstream to;
        engine->getFile("server/temp/job-" + std::to_string(job) + ".jdf", to);
        return to.str();
    };
    const std::string fresh = jdfOf(10);
    std::vector<std::unique_ptr<Place>> places;
    for (int i = 0; i < batch; ++i) {
        places.push_back(std::make_unique<Place>());
    }
    // One that is left alone shows what is whole, and how long the writing takes.
    const pid_t undisturbed = start(*places[0], 10);
    std::chrono::steady_clock::time_point began;
    int code = -1;
    while (!hasEnded(undisturbed, &code, false)) {
        if (engine->versions("server/temp/job-10.jdf").empty()) {
            began = std::chrono::steady_clock::now();
        }
        usleep(200);
    }
    ASSERT_EQ(code, 0);
    const std::chrono::duration<double, std::micro> taken =
        std::chrono::steady_clock::now() - began;
    const auto whole = counts(*ticket(10));
    const std::size_t updated = jdfOf(10).size();
    ASSERT_GT(updated, fresh.size());
    ASSERT_GT(whole.at("Remote/Measurement/SpectralValues/DValues"), 1000);

    std::mt19937 random(7); // NOLINT: the same moments, as far as that goes
    int cutOff = 0;
    for (int first = 11; first < 11 + runs; first += batch) {
        // A run for each place, to be killed some time after its JDF has changed.
        struct Victim {
            int job;
            pid_t process;
            std::chrono::steady_clock::time_point end;
        };
        std::vector<Victim> victims;
        for (int job = first; job < std::min(first + batch, 11 + runs); ++job) {
            victims.push_back(
                {job, start(*places[static_cast<std::size_t>(job - first)], job), {}});
        }
        std::size_t alive = victims.size();
        while (alive > 0) {
            for (Victim& victim : victims) {
                const auto now = std::chrono::steady_clock::now();
                const std::string local =
                    places[static_cast<std::size_t>(victim.job - first)]->jobFolder(victim.job) +
                    "/job-" + std::to_string(victim.job) + ".jdf";
                std::error_code none;
                if (victim.process == 0) {
                    continue;
                }
                if (hasEnded(victim.process, &code, false)) {
                    victim.process = 0;
                    --alive;
                } else if (victim.end == std::chrono::steady_clock::time_point() &&
                           fs::file_size(local, none) == updated) {
                    victim.end = now + std::chrono::microseconds(
                                           random() % static_cast<unsigned>(taken.count() * 0.8));
                } else if (victim.end != std::chrono::steady_clock::time_point() &&
                           now >= victim.end) {
                    kill(victim.process, SIGKILL);
                }
            }
            usleep(200);
        }
        for (const Victim& victim : victims) {
            SCOPED_TRACE(victim.job);
            const std::string jdf = jdfOf(victim.job);
            EXPECT_TRUE(jdf == fresh || jdf.size() == updated) << jdf.size();
            const auto content = ticket(victim.job);
            for (const auto& [key, count] : counts(*content)) {
                EXPECT_EQ(count, whole.at(key)) << key;
            }
            cutOff += isClosed(*content) ? 0 : 1;
            EXPECT_EQ(administer({"reset", std::to_string(victim.job)}), 0);
        }
        std::vector<pid_t> again;
        for (const Victim& victim : victims) {
            again.push_back(
                start(*places[static_cast<std::size_t>(victim.job - first)], victim.job));
        }
        for (std::size_t i = 0; i < again.size(); ++i) {
            EXPECT_EQ(endOf(again[i]), 0);
            EXPECT_TRUE(isClosed(*ticket(victims[i].job)));
            EXPECT_EQ(counts(*ticket(victims[i].job)), whole);
        }
    }
    EXPECT_GT(cutOff, 0) << "all were killed after they had written everything";
}

} // namespace
