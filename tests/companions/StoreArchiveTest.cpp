// SPDX-License-Identifier: Apache-2.0
// Jobs that move to another store, compared with a literal model of which do.
#include <algorithm>
#include <ctime>
#include <map>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "AnyStoreProgram.h"

namespace {

using testing::HasSubstr;

struct ModelJob {
    int id = 0;
    int parent = 0;
    int status = 0;
    bool shown = false;
    int ages[2] = {-1, -1}; ///< In days; -1: not measured.
    std::string jdf;

    std::string keys() const {
        std::string text =
            "Job/Display/Status=" + std::to_string(status) +
            " Remote/ShowInVerifier=" + (shown ? "1" : "0") +
            " System/Folders/Temp='/server/temp Footer/ControlstripFile='/x/strip.tif"
            " System/InstallFolder='/server Workflow/Verify/ComparisonMethod=4" +
            " Number=" + std::to_string(id);
        text += parent > 0 ? " General/ParentID=" + std::to_string(parent) : "";
        text += jdf.empty() ? "" : " Output/Jdf/FileName='" + jdf;
        for (int strip = 0; strip < 2; ++strip) {
            if (ages[strip] >= 0) {
                text += std::string(" Remote/Measurement") + (strip == 0 ? "" : "2") + "/Date='" +
                        day(ages[strip]);
            }
        }
        return text;
    }

    static std::string day(int age) {
        const std::time_t then = std::time(nullptr) - age * std::time_t{86'400};
        char text[20];
        std::strftime(text, sizeof text, "%Y-%m-%d", std::localtime(&then));
        return text;
    }
};

/// The jobs that move, found by looking at all pairs until nothing changes any more.
std::set<int> movedOf(const std::vector<ModelJob>& jobs, bool undated) {
    std::map<int, int> family;
    for (const auto& job : jobs) {
        family[job.id] = job.id;
    }
    for (bool changed = true; changed;) {
        changed = false;
        for (const auto& a : jobs) {
            for (const auto& b : jobs) {
                const bool related =
                    a.parent == b.id || b.parent == a.id || (a.parent > 0 && a.parent == b.parent);
                if (related && family[a.id] != family[b.id]) {
                    family[a.id] = family[b.id] = std::min(family[a.id], family[b.id]);
                    changed = true;
                }
            }
        }
    }
    std::set<int> moved;
    for (const auto& job : jobs) {
        bool closed = false, waits = false, dated = false, young = false;
        for (const auto& other : jobs) {
            if (family[other.id] != family[job.id]) {
                continue;
            }
            waits = waits || other.status == 208 || other.shown;
            closed = closed || other.status == 211 || other.status == 212;
            for (const int age : other.ages) {
                dated = dated || age >= 0;
                young = young || (age >= 0 && age <= 90);
            }
        }
        if (closed && !waits && !young && (dated || undated)) {
            moved.insert(job.id);
        }
    }
    return moved;
}

class StoreArchive : public AnyStoreProgram {
  protected:
    /// The other store: on a server if the first one is not, too.
    StoreArchive() : server(room ? nullptr : std::make_unique<support::PostgresRoom>()) {
        store::makeStore(archive, "Archive");
    }

    static std::string fileText(store::StoreEngine& engine, const std::string& path) {
        if (!engine.fileAt(path)) {
            return "none";
        }
        std::string text = file(engine, path) + std::to_string(engine.fileAt(path)->time) +
                           std::to_string(engine.highestVersion(path));
        for (const auto& version : engine.versions(path)) {
            text += " " + std::to_string(version.number) + " " + std::to_string(version.time);
        }
        for (const auto& version : versions(engine, path)) {
            text += " " + version;
        }
        return text;
    }

    const std::unique_ptr<support::PostgresRoom> server;
    const std::string archive = server ? "room" : folder.path("archive");
};
ON_BOTH_ENGINES(StoreArchive);

TEST_P(StoreArchive, MovesWhatAModelMoves) {
    std::mt19937 random(29); // NOLINT: the same jobs in each run
    const auto upTo = [&](int most) { return static_cast<int>(random() % (most + 1U)); };
    std::vector<ModelJob> jobs;
    const auto from = open();
    for (int id = 1; id <= 60; ++id) {
        ModelJob job;
        job.id = id;
        job.parent = upTo(2) == 0 ? 1 + upTo(80) : 0; // Some parents are not there.
        const int states[] = {211, 212, 211, 212, 211, 212, 30, 208};
        job.status = states[upTo(7)];
        job.shown = upTo(15) == 0;
        const int days[] = {-1, 5, 89, 92, 200, 400, 400, 95};
        job.ages[0] = days[upTo(7)];
        job.ages[1] = upTo(3) == 0 ? days[upTo(7)] : -1;
        job.jdf = upTo(8) == 0 ? "" : std::to_string(upTo(6) == 0 ? 1 : id) + ".jdf";
        jobs.push_back(job);
        makeJob(*from, id, job.keys());
    }
    makeJob(*from, 61, "Other=1");
    for (const auto& job : jobs) {
        const std::string path = "server/temp/" + std::to_string(job.id) + ".jdf";
        for (int version = 0; version < job.id % 4; ++version) {
            putFile(*from, path, "jdf " + std::to_string(job.id * 10 + version));
        }
        if (job.id % 8 == 3) {
            from->pruneVersions(path, {.keepNewest = job.id % 16 == 3 ? 0 : 1});
        }
    }
    putFile(*from, "server/ControlCharts/strip.it8", "strip");
    putFile(*from, "server/tickets/CVP_0004.xml", "preset");
    from->change(27, 4, {.everything = true, .make = true}, [](store::TicketContent& content) {
        content.apply(support::RecordTable("Name='Coated").records());
    });
    std::map<int, std::string> before;
    std::map<std::string, std::string> files;
    for (const int id : from->ids(3)) {
        before[id] = ticket(*from, 3, id);
    }
    for (const auto& entry : from->files()) {
        files[entry.path] = fileText(*from, entry.path);
    }

    const auto to = store::openStore(archive);
    std::set<int> moved;
    for (const bool undated : {false, true}) {
        std::vector<std::string> command = {"archive", "--closed", "90d", archive};
        if (undated) {
            command.emplace_back("--undated");
        }
        auto dry = command;
        dry.emplace_back("--dry-run");
        auto foretold = jsonOf(dry);
        const std::set<int> expected = movedOf(jobs, undated);
        EXPECT_GT(expected.size(), moved.size());
        for (const int id : moved) {
            EXPECT_TRUE(expected.contains(id));
        }
        const auto done = jsonOf(command);
        foretold["dryRun"] = false;
        EXPECT_EQ(done, foretold);
        EXPECT_EQ(done["jobs"].size(), expected.size() - moved.size());
        moved = expected;
        for (const auto& [id, text] : before) {
            EXPECT_EQ(ticket(*from, 3, id), moved.contains(id) ? "none" : text) << id;
            EXPECT_EQ(ticket(*to, 3, id), moved.contains(id) ? text : "none") << id;
        }
        for (const auto& [path, text] : files) {
            bool isMoved = false, isNamed = false;
            for (const auto& job : jobs) {
                if (path == "server/temp/" + job.jdf) {
                    (moved.contains(job.id) ? isMoved : isNamed) = true;
                }
            }
            const bool isShared = !path.starts_with("server/temp");
            EXPECT_EQ(fileText(*from, path), isMoved && !isNamed ? "none" : text) << path;
            EXPECT_EQ(fileText(*to, path), isMoved || isShared ? text : "none") << path;
        }
    }
    EXPECT_EQ(ticket(*to, 27, 4), "Name[0]='Coated");
    EXPECT_EQ(from->createNext(3), 62) << "numbers of moved jobs are not used again";
    for (const std::string& each : {address, archive}) {
        EXPECT_EQ(jsonOf({"-s", each, "verify"})["faults"].size(), 0u);
    }
}

TEST_P(StoreArchive, LeavesJobsThatTheOtherStoreHasOthersOf) {
    const auto from = open();
    const auto to = store::openStore(archive);
    const auto closed = [](int id) {
        ModelJob job;
        job.id = id;
        job.status = 211;
        job.ages[0] = 500;
        job.jdf = std::to_string(id) + ".jdf";
        return job.keys();
    };
    for (int id = 1; id <= 4; ++id) {
        makeJob(*from, id, closed(id));
        for (const char* const text : {"1", "2", "3"}) {
            putFile(*from, "server/temp/" + std::to_string(id) + ".jdf", text);
        }
    }
    makeJob(*to, 1, "Another=1");
    putFile(*to, "server/temp/2.jdf", "another");
    putFile(*to, "server/temp/3.jdf", "1"); // As a cut-off run may leave it: an earlier state.
    const auto outcome = run({"--json", "archive", "--closed", "90d", archive});
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_THAT(outcome.error,
                HasSubstr("2 jobs stayed; job/1: the other store has another job 1"));
    const auto done = nlohmann::json::parse(outcome.output);
    EXPECT_EQ(done["jobs"], (std::vector<int>{3, 4}));
    EXPECT_EQ(done["stayed"][1]["why"], "the other store has another file /server/temp/2.jdf");
    EXPECT_EQ(from->ids(3), (std::vector<int>{1, 2}));
    EXPECT_EQ(file(*from, "server/temp/2.jdf"), "3");
    EXPECT_EQ(file(*to, "server/temp/2.jdf"), "another");
    EXPECT_EQ(versions(*to, "server/temp/3.jdf"), (std::vector<std::string>{"1", "2"}));

    // A run that was cut off after it removed the ticket left the JDF.
    for (const char* const text : {"1", "2", "3"}) {
        putFile(*from, "server/temp/4.jdf", text);
        putFile(*from, "server/temp/5.jdf", text); // Nobody's.
    }
    putFile(*from, "server/temp/3.jdf", "other content");
    EXPECT_EQ(run({"archive", "--closed", "90d", archive}).exitCode, 2);
    EXPECT_FALSE(from->fileAt("server/temp/4.jdf"));
    EXPECT_TRUE(from->fileAt("server/temp/5.jdf"));
    EXPECT_TRUE(from->fileAt("server/temp/3.jdf"));

    expectRefusal({"archive", "--closed", "90d", address}, 3, "both are the same store");
    expectRefusal({"archive", "--closed", "90d", folder.path("none")}, 4, "");
    expectRefusal({"archive", "--closed", "soon", archive}, 3, "90d");
    EXPECT_EQ(from->ids(3), (std::vector<int>{1, 2}));
}

} // namespace
