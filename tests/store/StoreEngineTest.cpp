// SPDX-License-Identifier: Apache-2.0
#include "store/StoreEngine.h"

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <map>
#include <random>
#include <ranges>

#include <sys/resource.h>
#include <sys/stat.h>

#include "StoreTest.h"

using store::Fault;

namespace {

class StoreEngine : public StoreTest {
  protected:
    /// Puts a file. Returns the version number of what it replaced.
    static int putAndKeep(store::StoreEngine& engine, const std::string& path, const char* text) {
        putFile(engine, path, text);
        return engine.versions(path).back().number;
    }
};

/// Tests for stores in a folder.
class FolderStore : public StoreTest {
  protected:
    FolderStore() : StoreTest(Engine::Sqlite) {}
};

ON_BOTH_ENGINES(StoreEngine);

} // namespace

TEST_P(StoreEngine, IdsAreNotUsedTwice) {
    const auto engine = open();
    EXPECT_EQ(ticket(*engine, 0, 0),
              "System/Product/MajorVersion[0]=5 System/ServerName[0]='Press room");
    EXPECT_EQ(engine->createNext(3), 1);
    EXPECT_TRUE(engine->create(3, 40));
    EXPECT_EQ(engine->createNext(3), 41);
    EXPECT_TRUE(engine->remove(3, 41));
    EXPECT_EQ(engine->createNext(3), 42);
    EXPECT_TRUE(engine->create(3, 0xFFFFFF));
    EXPECT_EQ(engine->createNext(3), 2) << "the lowest free one, when the highest is used up";
    EXPECT_EQ(engine->ids(3), (std::vector<int>{1, 2, 40, 42, 0xFFFFFF}));
    EXPECT_EQ(engine->ids(4), std::vector<int>());
}

TEST_P(StoreEngine, NumbersOfVersionsAndNamesOfUsersAreTakenOnce) {
    const auto engine = open();
    for (const char* text : {"one", "two", "three"}) {
        putFile(*engine, "a/b", text);
    }
    EXPECT_EQ(engine->pruneVersions("a/b", {.keepNewest = 0}), 2);
    EXPECT_EQ(engine->pruneVersions("a/b", {.keepNewest = 0}), 0);
    putFile(*engine, "a/b", "four");
    ASSERT_EQ(engine->versions("a/b").size(), 1u);
    EXPECT_EQ(engine->versions("a/b")[0].number, 3);
    EXPECT_EQ(engine->pruneVersions("a/b", {.keepNewest = 0}), 1);
    engine->restoreVersion("a/b", putAndKeep(*engine, "a/b", "five"));
    EXPECT_EQ(engine->versions("a/b").back().number, 5);
    EXPECT_EQ(engine->files().size(), 1u);

    pid_t adding[4];
    for (pid_t& process : adding) {
        process = startProcess([&] { return open()->addUser({"anna", "hash", false}) ? 1 : 0; });
    }
    int added = 0;
    for (const pid_t process : adding) {
        added += endOf(process);
    }
    EXPECT_EQ(added, 1);
}

TEST_P(StoreEngine, TablesFollowTheTicketRulesAndSurviveReopening) {
    open()->createNext(3);
    const struct {
        const char* sent;
        const char* results;
        const char* ticket; // Keys are ordered as bytes.
    } tables[] = {
        {"a=1 a[16777215]=2 a[-2]=3 a[16777216]=1 a[-3]=- a[-2]=- z[0]=- z=-", "taken 11000001",
         "a[0]=1 a[16777215]=2"},
        {"a*=- *[0]=1 =- a[-1]=9 a[-2]='x e=# p=p0", "taken 0001111",
         "a[0]=9 a[1]='x e[0]=# p[0]=p0"},
        {"a=- a[-2]=7 a[0]=- e=- p=-", "taken 11111", ""},
        // Whole arrays, one of them followed by another element.
        {"c[0]=1 c[1]=2 c[2]=3 c[4]=9 d=- d[0]=0.5 d[1]=2.5 d[2]='x", "taken 11111111",
         "c[0]=1 c[1]=2 c[2]=3 c[4]=9 d[0]=0.5 d[1]=2.5 d[2]='x"},
        {"c=- d=- b=1,2.5,'x é=7 b2=U9 A=#00 b[5]=l-1 zz*=1 =1 b[-3]=4", "taken 111111111000",
         "A[0]=#00 b[0]=1 b[1]=2.5 b[2]='x b[5]=l-1 b2[0]=U9 é[0]=7"},
        // Changes and deletions of keys that exist, and deletions of others.
        {"b[5]=- b[-2]=9 A=- gone=- b2=1 b2[-2]=2 é[3]=-", "taken 1111110",
         "b[0]=1 b[1]=2.5 b[2]='x b[3]=9 b2[0]=1 b2[1]=2 é[0]=7"},
        {"b[-1]='new b[1]=-", "taken 10", "b[0]='new b2[0]=1 b2[1]=2 é[0]=7"},
    };
    for (const auto& [sent, results, expected] : tables) {
        EXPECT_EQ(send(*open(), 3, 1, sent), results);
        EXPECT_EQ(ticket(*open(), 3, 1), expected);
    }
    const auto engine = open();
    const std::pair<std::vector<const char*>, const char*> filters[] = {
        {{"b", "é*", nullptr}, "b[0]='new é[0]=7"},
        {{"b*", "b2", "no", nullptr}, "b[0]='new b2[0]=1 b2[1]=2"},
        {{"b2", nullptr}, "b2[0]=1 b2[1]=2"},
        {{"no", nullptr}, ""},
        {{"\xC3*", nullptr}, "é[0]=7"},
        {{"\xFF*", "c*", nullptr}, ""},
        {{"*", nullptr}, "b[0]='new b2[0]=1 b2[1]=2 é[0]=7"},
    };
    for (const auto& [keys, expected] : filters) {
        const store::KeyFilter filter(keys.data());
        EXPECT_EQ(contentText(*engine->content(3, 1, filter)), expected) << keys[0];
        EXPECT_EQ(engine->content(3, 2, filter), nullptr) << "there is no such ticket";
    }

    // A change that throws halfway leaves the ticket as it was.
    const auto failing = [](store::TicketContent& content) {
        content.apply(support::RecordTable("b=1,2,3").records());
        throw std::runtime_error("on the way");
    };
    EXPECT_THROW(engine->change(3, 1, {.keys = {{"b", true}}}, failing), std::runtime_error);
    EXPECT_EQ(ticket(*open(), 3, 1), std::end(tables)[-1].ticket);
}

TEST_P(StoreEngine, AChangeMakesItsTicketWithAllKeysOrNone) {
    const auto engine = open();
    const auto other = open();
    for (const bool replace : {true, false}) {
        const store::Scope scope{.everything = replace, .make = true, .keys = {{"a", false}}};
        const auto put = [&](const char* records) {
            return [=](store::TicketContent& content) {
                content.apply(support::RecordTable(records).records());
            };
        };
        EXPECT_THROW(engine->change(3, 7, scope,
                                    [&](store::TicketContent& content) {
                                        put("a=1")(content);
                                        EXPECT_FALSE(other->exists(3, 7));
                                        throw std::runtime_error("on the way");
                                    }),
                     std::runtime_error);
        EXPECT_FALSE(other->exists(3, 7));
        EXPECT_TRUE(engine->change(3, 7, scope, put("a=1")));
        EXPECT_EQ(ticket(*other, 3, 7), "a[0]=1");
        EXPECT_TRUE(engine->change(3, 7, scope, put("a=2"))) << "one that is there";
        EXPECT_EQ(ticket(*other, 3, 7), "a[0]=2");
        EXPECT_EQ(engine->createNext(3), replace ? 8 : 9);
        engine->remove(3, 7);
    }
    EXPECT_TRUE(engine->change(3, 20, {.make = true}, [](auto&) {}));
    EXPECT_EQ(ticket(*other, 3, 20), "");
}

TEST_P(StoreEngine, ReadersSeeWhatIsThereNow) {
    // The first two keys are cached for all jobs at once when a reader asks for the ids.
    const std::string keys[] = {"Job/Display/Status", "Input/FileType", "Other"};
    store::CachingStorage reader(open());
    store::CachingStorage other(open());
    std::map<int, std::map<std::string, int>> jobs; // The expected content.
    std::mt19937 random(1);
    const auto below = [&](int limit) { return static_cast<int>(random() % unsigned(limit)); };
    other.create(27, 2); // A ticket of another type.
    for (int step = 0; step < 250 && !HasFailure(); ++step) {
        store::CachingStorage& writer = below(3) == 0 ? reader : other;
        const int id = 1 + below(3);
        const std::string& key = keys[below(3)];
        const int what = below(9);
        if (what == 0) {
            EXPECT_EQ(writer.remove(3, id), jobs.erase(id) != 0);
        } else if (what == 1) {
            EXPECT_EQ(writer.create(3, id), jobs.try_emplace(id).second);
        } else if (what == 2) {
            sql("PRAGMA wal_checkpoint(TRUNCATE)", "SELECT 1");
        } else {
            std::string records = key + "=" + std::to_string(step);
            for (int more = what == 3 ? 100 : 0; more > 0; --more) { // Too many to be cached.
                records += " " + key + "[-2]=1";
            }
            support::RecordTable table(records);
            other.apply(27, 2, table.records());
            const bool isThere = jobs.count(id) != 0;
            EXPECT_EQ(writer.apply(3, id, table.records()), isThere);
            if (isThere) {
                jobs[id][key] = step;
            }
        }
        if (below(4) == 0) {
            EXPECT_TRUE(std::ranges::equal(reader.ids(3), std::views::keys(jobs)));
        }
        // This order never continues a listing, which may return older values.
        for (int job = 3; job > 0; --job) {
            for (const int index : {1, 0, 2}) {
                const std::string& name = keys[index == 2 && step / 8 % 3 + 1 != job ? 0 : index];
                const auto elements = reader.key(3, job, name);
                const bool isThere = jobs.count(job) != 0 && jobs[job].count(name) != 0;
                ASSERT_EQ(elements ? std::get<int>(*elements->first()) : -1,
                          isThere ? jobs[job][name] : -1)
                    << step << ": " << job << " " << name;
            }
        }
    }
}

TEST_P(StoreEngine, KeepsTheOverviewOfJobsInStep) {
    // For each job: "-" for a missing key, a number, or "?" for any other value.
    const auto shown = [](store::StoreEngine& engine) {
        store::JobOverview jobs;
        engine.overview(jobs);
        std::string text;
        for (const int id : jobs.ids()) {
            text += " " + std::to_string(id) + ":";
            for (std::size_t key = 0; key < store::overviewKeys.size(); ++key) {
                int number = 0;
                const auto holds = jobs.find(id, key, number);
                text += holds == store::JobOverview::Holds::Number    ? std::to_string(number) + ","
                        : holds == store::JobOverview::Holds::Nothing ? "-,"
                                                                      : "?,";
            }
        }
        return text;
    };
    const auto engine = open();
    for (const int id : {0, 1, 63, 64, 200, 201, 0xFFFFFF}) {
        engine->create(3, id);
    }
    engine->create(4, 5);
    EXPECT_EQ(engine->createNext(3), 2);
    const std::pair<int, const char*> tables[] = {
        {0, "Input/SubType=-2147483648 Job/Display/Status=258 Remote/ShowInVerifier=1"},
        {0, "Remote/ShowInVerifier=- Workflow/Verify/Active[-2]=-1"},
        {1, "Input/SubType=1,2 Input/FileType=u7 Job/Display/Status[3]=1 Other=1"},
        {63, "Job/Display/Status=1,2 Workflow/Verify/Active='3"},
        {63, "Job/Display/Status[1]=- Workflow/Verify/Active=3"},
        {64, "Job/Display/Status=211 Input/FileType=4096"},
        {64, "Job/Display/Status=- Other=2"},
        {200, "Input/SubType=80"},
        {0xFFFFFF, "Workflow/Verify/Active=3"},
    };
    for (const auto& [id, records] : tables) {
        send(*engine, 3, id, records);
    }
    send(*engine, 4, 5, "Input/SubType=1");
    engine->remove(3, 200);
    store::Scope everything;
    everything.everything = true;
    engine->change(3, 201, everything, [](store::TicketContent& content) {
        content.apply(support::RecordTable("Input/FileType=4 Input/SubType='x").records());
    });
    const std::string expected = " 0:-2147483648,258,-,-,-1, 1:?,?,-,?,-, 2:-,-,-,-,-,"
                                 " 63:-,1,-,-,3, 64:-,-,-,4096,-, 201:?,-,-,4,-,"
                                 " 16777215:-,-,-,-,3,";
    EXPECT_EQ(shown(*engine), expected);
    EXPECT_TRUE(engine->remove(3, 0) && engine->create(3, 0)) << "it starts without keys";
    EXPECT_EQ(shown(*engine), " 0:-,-,-,-,-," + expected.substr(expected.find(" 1:")));

    // A store made before the overview existed must get the same one.
    const std::string before = shown(*engine);
    sql("DROP TABLE job_blocks",
        "DROP TABLE tintgate.job_blocks; ALTER TABLE tintgate.files DROP last_version");
    setFormat(room ? 2 : 1);
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Older);
    EXPECT_TRUE(store::bringStoreUpToDate(address));
    EXPECT_EQ(shown(*open()), before);
    sql("UPDATE job_blocks SET content = CAST(substr(content, 2) AS BLOB)",
        "UPDATE tintgate.job_blocks SET content = substring(content FROM 2)");
    EXPECT_EQ(faultOf([&] { shown(*open()); }), Fault::Damaged);
}

TEST_F(FolderStore, OpensOnlyFoldersWithAStore) {
    folder.makeFolder("strange/files");
    folder.write("strange/tickets.db", "");
    folder.makeFolder("noise/files");
    folder.write("noise/tickets.db", std::string(5000, 'x'));
    const std::pair<std::string, Fault> cases[] = {
        {folder.path("nowhere"), Fault::Missing},
        {folder.makeFolder("empty"), Fault::Missing},
        {folder.write("file", "x"), Fault::Missing},
        {folder.path("strange"), Fault::Missing},
        {folder.path("noise"), Fault::Damaged},
        {"", Fault::Missing},
        {address + std::string("\0", 1), Fault::Missing},
        {"file:" + address + "?mode=memory", Fault::Missing},
    };
    for (const auto& [place, fault] : cases) {
        EXPECT_EQ(faultOf([&, at = place] { store::openStore(at); }), fault) << place;
    }
    folder.makeFolder("begun/files"); // Left by a process that was killed while it made the store.
    folder.write("begun/tickets.db-journal", "");
    EXPECT_NO_THROW(store::makeStore(folder.path("begun"), "press"));
    EXPECT_EQ(support::modeOf(folder.path("begun/tickets.db")) & 0007u, 0u);
}

TEST_P(StoreEngine, NeitherOverwritesAStoreNorReadsADamagedKey) {
    EXPECT_EQ(faultOf([&] { store::makeStore(address, "x"); }), Fault::Exists);
    EXPECT_EQ(faultOf([&] { store::openCopy(address); }), Fault::Exists);
    EXPECT_FALSE(store::bringStoreUpToDate(address));
    setFormat(9);
    EXPECT_EQ(faultOf([&] { store::bringStoreUpToDate(address); }), Fault::Newer);
    setFormat(room ? 3 : 2);
    sql("INSERT INTO keys SELECT number, x'61', x'010299' FROM tickets",
        "INSERT INTO tintgate.keys (ticket, name, value, change)"
        " SELECT number, '\\x61', '\\x010299', 0 FROM tintgate.tickets");
    const auto engine = open();
    EXPECT_EQ(faultOf([&] { engine->key(0, 0, "a"); }), Fault::Damaged);
    EXPECT_EQ(send(*engine, 0, 0, "a[1]=1"), "refused 0");
    EXPECT_EQ(send(*engine, 0, 0, "a=1"), "taken 1") << "replacing it mends it";
}

// Any changed byte is a failure or goes unnoticed, and never crashes the program.
TEST_P(StoreEngine, BearsAnyByteThatHasChanged) {
    {
        const auto engine = open();
        for (int id = 1; id <= 70; ++id) {
            engine->create(3, id);
            send(*engine, 3, id,
                 "Job/Display/Status=208 Input/FileType=0 Input/SubType=1 v=1,2,3"
                 " t='text,'more b=#0001 p=2.5,'x n[7]=1");
        }
        engine->putUser({"press", "no hash", false});
        putFile(*engine, "a/b", "one");
        putFile(*engine, "a/b", "two");
    }
    int noticed = 0;
    const auto work = [&](bool writes) {
        const auto fault = faultOf([&] {
            const std::shared_ptr<store::StoreEngine> engine = open();
            const std::vector<std::string> names = {"Job/Display/Status", "Input/FileType", "v"};
            engine->keysOfAll(3, names, 64, [](int, std::size_t, const auto&) {});
            for (const int id : engine->ids(3)) {
                engine->content(3, id, store::KeyFilter());
            }
            engine->user("press");
            engine->users();
            engine->highestIds();
            engine->versions("a/b");
            store::CachingStorage keep(engine);
            for (const int id : keep.listIds(3)) {
                engine->key(3, id, "n");
                keep.key(3, id, "Job/Display/Status");
            }
            if (writes) {
                send(*engine, 3, 7, "Job/Display/Status[-2]=1 v[1]=- t=-");
                engine->change(3, 8, {.everything = true, .keys = {}}, [](auto&) {});
                engine->remove(3, 9);
                engine->createNext(3);
            }
        });
        noticed += fault ? 1 : 0;
    };
    std::mt19937 random(11); // NOLINT: the same bytes each time
    const auto below = [&](std::size_t limit) { return random() % limit; };
    const int rounds = roundsOr(80);
    const std::string whole = room ? "" : support::contentsOf(address + "/tickets.db");
    for (int round = 0; round < rounds; ++round) {
        const auto bits = static_cast<char>(1 + below(255));
        if (!room) {
            std::string damaged = whole;
            damaged[below(whole.size())] ^= bits;
            std::filesystem::remove(address + "/tickets.db-wal");
            std::filesystem::remove(address + "/tickets.db-shm");
            folder.write("store/tickets.db", damaged);
            work(round % 4 == 0);
            continue;
        }
        const std::pair<const char*, const char*> places[] = {
            {"keys", "value"}, {"job_blocks", "content"}, {"users", "hash"}, {"keys", "name"}};
        const auto& [table, column] = places[below(std::size(places))];
        const std::string name = column;
        const support::BarePostgres bare("room");
        // Only values longer than 4 bytes: a short key name could turn into another one. The row is
        // found by its ctid. The same statement at the new ctid reverts the change.
        std::string place = bare.run("SELECT ctid FROM tintgate." + std::string(table) +
                                     " WHERE length(" + name + ") > 4 ORDER BY random() LIMIT 1");
        const std::string at = std::to_string(below(1'000));
        const auto change = [&] {
            place = bare.run("UPDATE tintgate." + std::string(table) + " SET " + name +
                             " = set_byte(" + name + ", " + at + " % length(" + name +
                             "), get_byte(" + name + ", " + at + " % length(" + name + ")) # " +
                             std::to_string(static_cast<unsigned char>(bits)) + ") WHERE ctid = '" +
                             place + "' RETURNING ctid");
        };
        change();
        work(false);
        change();
    }
    EXPECT_GT(noticed, rounds / 20);
    EXPECT_LT(noticed, rounds);
}

TEST_F(FolderStore, CanBeReadOnAFullDisk) {
    open()->create(3, 1);
    send(*open(), 3, 1, "kept=1,2,3");
    for (const auto& [access, result] :
         {std::pair(store::Access::ReadAndWrite, 2), {store::Access::Read, 0}}) {
        const pid_t child = startProcess([&, access = access] {
            signal(SIGXFSZ, SIG_IGN);
            const rlimit limit = {20'000, 20'000}; // The index of the log takes 32 KB.
            setrlimit(RLIMIT_FSIZE, &limit);
            const auto fault = faultOf([&] {
                const std::shared_ptr<store::StoreEngine> engine =
                    store::openStore(address, access);
                EXPECT_EQ(ticket(*engine, 3, 1), "kept[0]=1 kept[1]=2 kept[2]=3");
                EXPECT_EQ(store::CachingStorage(engine).ids(3), std::vector<int>{1});
                EXPECT_EQ(faultOf([&] { putFile(*engine, "a", std::string(30'000, 'x')); }),
                          Fault::Full);
            });
            return HasFailure() ? 1 : fault == Fault::Full ? 2 : 0;
        });
        EXPECT_EQ(endOf(child), result);
    }
}

TEST_F(FolderStore, AFullDiskLosesNothingThatWasThere) {
    const std::string much(300'000, 'x');
    open()->create(3, 1);
    send(*open(), 3, 1, "kept=1,2,3");
    putFile(*open(), "kept", "old");
    // A limit on the size of files. The kernel reports it much like a full disk.
    const pid_t child = startProcess([&] {
        signal(SIGXFSZ, SIG_IGN);
        const rlimit limit = {200'000, 200'000};
        setrlimit(RLIMIT_FSIZE, &limit);
        const auto engine = open();
        EXPECT_EQ(send(*engine, 3, 1, "kept='" + much + " other=1"), "refused 00");
        EXPECT_EQ(faultOf([&] { putFile(*engine, "kept", much); }), Fault::Full);
        EXPECT_EQ(send(*engine, 3, 1, "small=1"), "taken 1");
        // A session that lost a write refuses further changes of that ticket.
        engine->create(3, 2);
        store::CachingStorage keep(open());
        EXPECT_FALSE(keep.apply(3, 1, support::RecordTable("big='" + much).records()));
        EXPECT_FALSE(keep.apply(3, 1, support::RecordTable("status=1").records()));
        EXPECT_TRUE(keep.apply(3, 2, support::RecordTable("status=1").records()));
        return HasFailure() ? 1 : 0;
    });
    EXPECT_EQ(endOf(child), 0);
    const auto engine = open();
    EXPECT_EQ(ticket(*engine, 3, 1), "kept[0]=1 kept[1]=2 kept[2]=3 small[0]=1");
    EXPECT_EQ(file(*engine, "kept"), "old");
    EXPECT_EQ(engine->files().size(), 1u);
    EXPECT_TRUE(engine->versions("kept").empty());
}
