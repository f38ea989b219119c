// SPDX-License-Identifier: Apache-2.0
// Verifying a store, and backups of one that others work on.
#include <atomic>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <string>

#include <sys/mman.h>

#include "AnyStoreProgram.h"

namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

class StoreBackup : public AnyStoreProgram {
  protected:
    void fill() const {
        const auto engine = open();
        for (int id = 1; id <= 70; ++id) {
            makeJob(*engine, id, "Job/Display/Status=208 Input/Title='job");
        }
        engine->create(12, 5);
        for (const std::string path : {"a/b/file", "a/other", "empty"}) {
            for (int version = 0; version <= 4; ++version) {
                putFile(*engine, path,
                        path == "empty" ? "" : std::string(300'000, 'x') + std::to_string(version));
            }
        }
        engine->pruneVersions("a/b/file", {.keepNewest = 3});
        engine->pruneVersions("a/other", {});
    }

    /// Names, times and contents of a folder's files.
    static std::string shapeOf(const std::string& folder) {
        return support::run({"sh", "-c",
                             "cd \"$0\" && find . -type f -printf '%p %T@ %s %i\\n' | sort && "
                             "find . -type f -print0 | sort -z | xargs -0 md5sum",
                             folder})
            .output;
    }
};
ON_BOTH_ENGINES(StoreBackup);

/// On a server a backup is the server's.
class FolderBackup : public AnyStoreProgram {
  protected:
    FolderBackup() : AnyStoreProgram(Engine::Sqlite) {}
};

TEST_P(StoreBackup, VerifyFindsWhatIsDamagedAndChangesNothing) {
    fill();
    const std::string before = room ? allOf(*open()) : shapeOf(address);
    auto found = jsonOf({"verify"});
    EXPECT_EQ(found["faults"].size(), 0u) << found;
    EXPECT_EQ(found["tickets"], 72);
    EXPECT_EQ(found["files"], 3);
    EXPECT_EQ(found["versions"], 3 + 0 + 4);
    EXPECT_EQ(found["bytes"], 300'001 * 5);
    EXPECT_EQ(room ? allOf(*open()) : shapeOf(address), before);

    const std::string kept = address + "/files/.tintgate-versions/";
    const std::string orphan = "INSERT INTO tintgate.contents DEFAULT VALUES";
    const auto damage = [&](const std::string& sqlite, const std::string& postgres,
                            const std::function<void()>& folder = {}) {
        if (folder && !room) {
            folder();
        } else {
            sql(sqlite, postgres);
        }
    };
    const struct {
        std::function<void()> damage;
        std::string where, what;
    } cases[] = {
        {[&] {
             damage("UPDATE keys SET value = x'0102' WHERE name = CAST('Input/Title' AS BLOB) AND"
                    " ticket = (SELECT number FROM tickets WHERE type = 3 AND id = 9)",
                    "UPDATE tintgate.keys SET value = '\\x0102' WHERE name = 'Input/Title' AND"
                    " ticket = (SELECT number FROM tintgate.tickets WHERE type = 3 AND id = 9)");
         },
         "job/9", "key Input/Title can't be decoded"},
        {[&] {
             damage("UPDATE job_blocks SET content = zeroblob(length(content)) WHERE number = 1",
                    "UPDATE tintgate.job_blocks SET content ="
                    " overlay(content PLACING '\\x03' FROM 160) WHERE number = 1");
         },
         "jobs 64 to 127", "overview"},
        {[&] {
             damage("DELETE FROM highest_ids WHERE type = 12",
                    "DELETE FROM tintgate.highest_ids WHERE type = 12");
         },
         "the database", "a second time"},
        {[&] {
             damage("", "DELETE FROM tintgate.versions WHERE path = 'empty' AND number = 2",
                    [&] { fs::remove(kept + "empty/.tintgate-2"); });
         },
         "/empty", "version 2 is missing"},
        {[&] {
             damage("", "UPDATE tintgate.files SET last_version = 7 WHERE path = 'a/b/file'", [&] {
                 fs::rename(kept + "a/b/file/.tintgate-2", kept + "a/b/file/.tintgate-7");
             });
         },
         "/a/b/file", "version 5 is missing"},
        {[&] {
             damage("",
                    "DELETE FROM tintgate.pieces WHERE position = 1 AND content ="
                    " (SELECT content FROM tintgate.files WHERE path = 'a/other')",
                    [&] {
                        fs::remove(address + "/files/a/other");
                        fs::create_symlink("/etc/passwd", address + "/files/a/other");
                    });
         },
         "/a/other", room ? "a part of its content is missing" : "neither a file"},
        {[&] {
             damage("", orphan, [&] {
                 fs::create_directories(kept + "gone/file");
                 std::ofstream(kept + "gone/file/.tintgate-1") << "x";
             });
         },
         room ? "content " : "/gone/file", room ? "belongs to no file" : "but no file"},
    };
    std::size_t faults = 0;
    for (const auto& [harm, where, what] : cases) {
        SCOPED_TRACE(what);
        harm();
        const auto outcome = run({"--json", "verify"});
        EXPECT_EQ(outcome.exitCode, 10) << outcome.error;
        found = nlohmann::json::parse(outcome.output)["faults"];
        EXPECT_GT(found.size(), faults);
        faults = found.size();
        EXPECT_TRUE(std::any_of(found.begin(), found.end(), [&](const auto& fault) {
            return fault["where"].template get<std::string>().starts_with(where) &&
                   fault["what"].template get<std::string>().find(what) != std::string::npos;
        })) << found;
    }
    EXPECT_EQ(run({"verify"}).exitCode, 10);
    if (!room) {
        expectRefusal({"-s", folder.path("new"), "restore", address}, 10, "the backup is damaged");
        EXPECT_FALSE(fs::exists(folder.path("new")));
        // A page of the database: no crash, whatever it makes of it.
        std::fstream database(address + "/tickets.db", std::ios::in | std::ios::out);
        database.seekp(4'096 * 3);
        database << std::string(2'000, '\xA5');
        database.close();
        EXPECT_EQ(run({"verify"}).exitCode, 10);
    }
}

TEST_P(StoreBackup, ARestoredStoreIsTheOneThatWasBackedUp) {
    fill();
    const std::string before = allOf(*open());
    const std::string backup = folder.path("backup");
    if (room) {
        expectRefusal({"backup", backup}, 13, "pg_dump");
        // As docs/stores.md says it.
        for (const std::string command :
             {"pg_dump --format=custom --schema=tintgate --file=\"$0\" service=room",
              "psql --quiet service=room --command='DROP SCHEMA tintgate CASCADE'",
              "pg_restore --dbname=service=room \"$0\""}) {
            const auto outcome = support::run({"sh", "-c", command + " 2>&1", backup});
            EXPECT_EQ(outcome.exitCode, 0) << command << outcome.output;
        }
        EXPECT_TRUE(allOf(*open()) == before);
        EXPECT_EQ(jsonOf({"verify"})["faults"].size(), 0u);
        return;
    }
    answer({"user", "add", "anna", "--password-file", folder.write("secret", "p")});
    EXPECT_EQ(jsonOf({"backup", backup})["backup"], backup);
    EXPECT_TRUE(allOf(*store::openStore(backup)) == before);
    EXPECT_EQ(jsonOf({"-s", backup, "verify"})["faults"].size(), 0u);
    expectRefusal({"backup", backup}, 2, "is not empty");

    // Elsewhere, on a server, and in the place of what is there.
    const std::string other = folder.path("other");
    answer({"-s", other, "restore", backup});
    EXPECT_TRUE(allOf(*store::openStore(other)) == before);
    const support::PostgresRoom server;
    answer({"-s", "room", "restore", backup});
    EXPECT_TRUE(allOf(*store::openStore("room")) == before);

    makeJob(*open(), 5, "changed=1");
    const std::string changed = allOf(*open());
    expectRefusal({"restore", backup}, 2, "");
    fs::permissions(address, fs::perms(02770));
    const auto restored = jsonOf({"restore", backup, "--replace"});
    EXPECT_TRUE(allOf(*open()) == before);
    EXPECT_EQ(open()->users().size(), 1u);
    EXPECT_EQ(fs::status(address).permissions(), fs::perms(02770));
    const std::string former = restored["former"];
    EXPECT_THAT(former, HasSubstr(address + ".before-"));
    EXPECT_TRUE(allOf(*store::openStore(former)) == changed);
}

/// What a writer has done; processes share it.
struct Progress {
    std::atomic<int> last;
};

// The writer puts number n in two files and then in a ticket. A backup of one moment has the same
// number in each, or what comes first is one ahead. Between the names of the two files there are
// many, so that they are not listed at once.
TEST_F(FolderBackup, TicketsAndFilesAreOfOneMoment) {
    {
        const auto engine = open();
        makeJob(*engine, 1, "n=0");
        putFile(*engine, "z/first", "0");
        putFile(*engine, "a/second", "0");
        for (int i = 0; i < 600; ++i) {
            folder.write("store/files/many/" + std::to_string(i), "x");
        }
    }
    auto& progress = *new (mmap(nullptr, sizeof(Progress), PROT_READ | PROT_WRITE,
                                MAP_SHARED | MAP_ANONYMOUS, -1, 0)) Progress{};
    const pid_t writer = startProcess([&] {
        const auto engine = open();
        for (int n = 1;; ++n) {
            putFile(*engine, "z/first", std::to_string(n));
            putFile(*engine, "a/second", std::to_string(n));
            send(*engine, 3, 1, "n=" + std::to_string(n));
            progress.last = n;
        }
        return 0;
    });
    int advanced = 0;
    for (int round = 0; round < roundsOr(6); ++round) {
        const std::string backup = folder.path("backup-" + std::to_string(round));
        const int from = progress.last;
        const auto outcome = run({"backup", backup});
        ASSERT_EQ(outcome.exitCode, 0) << outcome.error;
        advanced += progress.last > from ? 1 : 0;
        const auto engine = store::openStore(backup);
        const std::string stored = ticket(*engine, 3, 1);
        const int inTicket = std::stoi(stored.substr(stored.find('=') + 1));
        const int first = std::stoi(file(*engine, "z/first"));
        const int second = std::stoi(file(*engine, "a/second"));
        EXPECT_GE(inTicket, from);
        EXPECT_TRUE(inTicket <= second && second <= first && first <= inTicket + 1)
            << first << ' ' << second << ' ' << inTicket;
        EXPECT_EQ(jsonOf({"-s", backup, "verify"})["faults"].size(), 0u);
        fs::remove_all(backup);
    }
    EXPECT_GT(advanced, 0) << "the writer did not work meanwhile";
    kill(writer, SIGKILL);
    endOf(writer);
    munmap(&progress, sizeof(Progress));
}

} // namespace
