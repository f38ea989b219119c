// SPDX-License-Identifier: Apache-2.0
// A place in which the real program verifies jobs for a client: a store, a system root with the
// suite, and a temporary folder.
#pragma once

#include <atomic>
#include <chrono>
#include <filesystem>
#include <map>
#include <memory>
#include <regex>
#include <string>
#include <thread>
#include <vector>

#include <sys/stat.h>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "RunningProgram.h"
#include "SuiteRoot.h"
#include "TicketText.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/Users.h"

namespace support {

namespace fs = std::filesystem;

inline constexpr const char* viewer =
    "Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify";
inline constexpr const char* profile = "/usr/share/color/icc/ghostscript/default_cmyk.icc";

inline constexpr char makeExample[] = R"sh(
    make() {
        python3 "$1/docs/example-job/make-job.py" "$2/made" $job
        "$3" -s "$2/store" import "$2/made/tickets.json"
    }
    IFS=,
    for job in "--job 7" "--job 8 --unmeasured --references $4" $5; do
        IFS=" "
        make "$@"
    done
    "$3" -s "$2/store" file put "$2/made/server" /server)sh";

/// The arguments of the job form that differ from the usual ones.
struct Call {
    std::string job = "7";
    std::string strip = "0";
    std::string password = "room";
    std::string user = "press";
    std::string host = {};      ///< Empty: the store's.
    std::string remeasure = {}; ///< Empty: none.
};

/// A system root with the viewer, a temporary folder, and a store with the example jobs: 7 has its
/// measurement, 8 is to be measured.
class Place {
  public:
    /// `moreJobs` is a comma-separated list of option lists for make-job.py.
    explicit Place(const std::string& moreJobs = {}) {
        fs::copy(example(moreJobs).path("store"), address, fs::copy_options::recursive);
        m_root.installPlistReader(PLIST_READER);
        m_root.installCommBundle(COMGUI_BUNDLE);
        const std::string program =
            write(viewer, "#!/bin/sh\nprintf '[%s]' \"$@\" > \"$TINTGATE_ROOT/part\"\n"
                          "mv \"$TINTGATE_ROOT/part\" \"$TINTGATE_ROOT/shown\"\n");
        chmod(program.c_str(), 0755);
        fs::create_directories(temporary);
    }

    std::string path(const std::string& name) const { return m_root.path(name); }

    std::string write(const std::string& name, const std::string& text) const {
        return m_root.write(name, text);
    }

    /// Installs a measuring tool, by default ours with its virtual instrument. Returns its path.
    std::string installTool(const std::string& settings = {},
                            const std::string& program = MEASURING_TOOL) const {
        m_root.writePreferences("ApplicationsUsingNerovaMeasure_x64.plist",
                                {{"installed_path", path("Applications/Nerova")}});
        write("Library/Preferences/NerovaMeasure.conf",
              std::string("instrument = virtual\nspectra = yes\nprofile = ") + profile + "\n" +
                  settings);
        return m_root.copyProgram(
            program, "Applications/Nerova/NerovaMeasure.app/Contents/MacOS/NerovaMeasure");
    }

    std::string jobFile(const std::string& name, const std::string& job = "7") const {
        return temporary + "/Tintgate/JobID_" + job + "/" + name;
    }

    std::vector<std::string> words(const Call& call = {}) const {
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
        return words;
    }

    support::Outcome run(std::vector<std::string> words) const {
#ifndef __SANITIZE_ADDRESS__
        words.insert(words.begin(), {"prlimit", "--as=1500000000"});
#endif
        support::RunOptions options;
        options.environment = {{"TMPDIR", temporary}, {"TINTGATE_ROOT", m_root.path()}};
        return support::run(words, options);
    }

    support::Outcome run(const Call& call = {}) const { return run(words(call)); }

    /// The messages of the job's log, with placeholders for the folders. Empty if there is no log.
    std::string log() const {
        const std::string file = temporary + "/Tintgate/TintgateKZ.log";
        std::string text = support::exists(file) ? support::contentsOf(file) : "";
        text = std::regex_replace(text, std::regex("(^|\n)[^\n]*?:\t"), "$1");
        text = std::regex_replace(text, std::regex(temporary + "/Tintgate/JobID_[78]"), "JOB");
        return std::regex_replace(text, std::regex(address), "STORE");
    }

    std::shared_ptr<store::StoreEngine> engine() const { return store::openStore(address); }

    /// Changes a ticket, in the notation of TicketText.h.
    void set(const std::string& records, int id = 7, int type = 3) const {
        store::CachingStorage keep(engine());
        ASSERT_TRUE(keep.apply(type, id, support::RecordTable(records).records())) << records;
    }

    std::string administer(std::vector<std::string> words) const {
        words.insert(words.begin(), {TINTGATE_STORE_PROGRAM, "-s", address});
        const support::Outcome outcome = support::run(words);
        EXPECT_EQ(outcome.exitCode, 0) << words[3] << outcome.error;
        return outcome.output;
    }

    /// The keys of a job, each with its number of elements.
    std::map<std::string, int> counts(int job) const {
        std::map<std::string, int> all;
        const auto content = engine()->content(3, job, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            all[key] = elements->count();
        }
        return all;
    }

    /// The job's status on the server: 208 to be verified, 211 passed, 212 failed.
    int status(const std::string& job) const {
        const auto content = engine()->content(3, std::stoi(job), store::KeyFilter());
        return std::get<int>(*content->find("Job/Display/Status")->first());
    }

    /// The viewer's arguments. The tool does not wait for the viewer, so this may have to.
    std::string shown() const {
        for (int i = 0; i < 200 && !support::exists(path("shown")); ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
        }
        return support::contentsOf(path("shown"));
    }

  private:
    /// Created once; a store can be copied like any folder.
    static const support::ScratchFolder& example(const std::string& moreJobs) {
        static std::map<std::string, support::ScratchFolder> folders;
        const auto [found, isNew] = folders.try_emplace(moreJobs);
        const support::ScratchFolder& folder = found->second;
        if (isNew) {
            store::makeStore(folder.path("store"), "Press room");
            store::openStore(folder.path("store"))
                ->putUser({"press", store::passwordHash("room"), false});
            const support::Outcome outcome =
                support::run({"sh", "-ec", makeExample, "sh", TINTGATE_SOURCE_DIR, folder.path(),
                              TINTGATE_STORE_PROGRAM, profile, moreJobs});
            EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
        }
        return folder;
    }

    const support::SuiteRoot m_root;

  public:
    const std::string address = m_root.path("store");
    std::string temporary = m_root.path("tmp");
    std::unique_ptr<support::RunningProgram> beside; ///< A program running during the test.
};

/// Runs mostly wait, so several run in parallel.
template<class Work>
void sideBySide(std::size_t count, Work work) {
    std::atomic<std::size_t> next = 0;
    std::vector<std::jthread> threads;
    for (int i = 0; i < 8; ++i) {
        threads.emplace_back([&] {
            for (std::size_t number; (number = next++) < count;) {
                work(number);
            }
        });
    }
}

} // namespace support
