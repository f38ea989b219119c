// SPDX-License-Identifier: Apache-2.0
// A store's log, and what roles of a server may do.
#include <ctime>
#include <set>
#include <string>

#include <sys/stat.h>

#include "AnyStoreProgram.h"
#include "store/Users.h"

namespace {

using store::Fault;
using testing::HasSubstr;

class StoreLog : public AnyStoreProgram {};
ON_BOTH_ENGINES(StoreLog);

TEST_P(StoreLog, HasWhatWasChangedAndNoPasswords) {
    answer({"user", "add", "anna", "--password-file", folder.write("secret", "hush-hush")});
    answer({"ticket", "create", "job/7"});
    answer({"key", "set", "job/7", "Input/Title", "string", "[a]"});
    answer({"file", "put", folder.write("f", "x"), "/a/b"});
    answer({"file", "delete", "/a/b", "--dry-run"});
    EXPECT_EQ(run({"job", "delete", "8"}).exitCode, 1);
    EXPECT_EQ(run({"jobs"}).exitCode, 0);
    answer({"job", "delete", "7"});
    std::string log;
    for (const auto& entry : jsonOf({"log", "--since", "1d"})) {
        EXPECT_EQ(entry["event"], "administration");
        EXPECT_EQ(entry["user"], nullptr);
        EXPECT_EQ(entry["origin"], store::thisOrigin());
        log += entry["what"].get<std::string>() + "\n";
    }
    EXPECT_EQ(log, "user add anna\nticket create job/7\nkey set job/7 Input/Title\n"
                   "file put /a/b\njob delete 8: there is no job 8\njob delete 7\n");
    EXPECT_THAT(answer({"log"}), HasSubstr("administration  -"));
    expectRefusal({"log", "--since", "yesterday"}, 3);
}

TEST_P(StoreLog, IsBoundedAndNeverInTheWay) {
    const auto engine = open();
    const std::string longest(2'000, '\xC3');
    const std::int64_t now = std::time(nullptr);
    const int bySql = room ? 11'990 : -1;
    if (room) { // Each by itself would wait for the disk.
        support::BarePostgres("room").run(
            "INSERT INTO tintgate.log (time, event, who, origin, what)"
            " SELECT " +
            std::to_string(now) +
            " + i, 'refusal', 'anna', '', ''"
            " FROM generate_series(0, 11990) AS i");
    }
    for (int i = bySql + 1; i < 12'000; ++i) {
        engine->log({now + i, store::Event::Refusal, "anna\t\n", longest.substr(0, 150),
                     std::to_string(i) + longest.substr(0, 100)});
    }
    engine->log({now, store::Event::LostWrite, longest, longest, longest});
    const auto entries = engine->logEntries();
    EXPECT_GT(entries.size(), room ? 9'999u : 1'000u);
    EXPECT_LE(entries.size(), room ? 10'100u : 12'001u);
    EXPECT_EQ(entries.back().event, store::Event::LostWrite);
    EXPECT_EQ(entries[entries.size() - 2].time, now + 11'999);
    EXPECT_EQ(engine->refusalsSince(now + 11'990), 10);
    EXPECT_EQ(engine->refusalsSince(now + 12'000), 0);
    if (room) {
        // Of a store that has none, and of one that gets it from an upgrade.
        support::BarePostgres("room").run("DROP TABLE tintgate.log;"
                                          "DROP FUNCTION tintgate.shorten_log");
        open()->log({now, store::Event::Refusal, "", "", ""});
        EXPECT_EQ(open()->logEntries().size(), 0u);
        EXPECT_EQ(open()->refusalsSince(0), 0);
        EXPECT_EQ(run({"info"}).exitCode, 0);
        answer({"upgrade"});
        EXPECT_EQ(jsonOf({"log"}).size(), 1u) << "the upgrade itself";
    } else {
        struct stat status;
        for (const char* const name : {"/log.txt", "/log.txt.old"}) {
            ASSERT_EQ(stat((address + name).c_str(), &status), 0);
            EXPECT_LT(status.st_size, (1 << 20) + 10'000);
            EXPECT_EQ(status.st_mode & 07, 0u);
        }
    }
}

/// Of a server's roles. They are the server's, so that each name is a test's own.
class StoreRoles : public AnyStoreProgram {
  protected:
    StoreRoles() : AnyStoreProgram(Engine::Postgres) {
        for (const std::string& role : {client, reports}) {
            bare("DROP ROLE IF EXISTS \"" + doubled(role) + "\"");
            bare("CREATE ROLE \"" + doubled(role) + "\" LOGIN");
        }
        room->addService("client", "user=" + client);
        room->addService("reports", "user=" + reports);
    }
    ~StoreRoles() override {
        bare("DROP SCHEMA tintgate CASCADE");
        for (const std::string& role : {client, reports}) {
            bare("DROP OWNED BY \"" + doubled(role) + "\"; DROP ROLE \"" + doubled(role) + "\"");
        }
    }

    static std::string doubled(const std::string& name) {
        return name.substr(0, 4) + "\"" + name.substr(4);
    }
    static void bare(const std::string& statements) {
        support::BarePostgres("room").run(statements);
    }
    static std::optional<Fault> faultOfSql(const std::string& service, const std::string& sql) {
        try {
            support::BarePostgres(service).run(sql);
            return std::nullopt;
        } catch (const std::runtime_error& failure) {
            return std::string(failure.what()).find("permission denied") != std::string::npos
                       ? Fault::ReadOnly
                       : Fault::Other;
        }
    }

    const std::string client = "tin\"client " + std::to_string(getpid());
    const std::string reports = "tin\"reports " + std::to_string(getpid());
};

TEST_F(StoreRoles, HaveWhatTheyNeedAndNoMore) {
    open()->putUser({"anna", store::passwordHash("p"), false});
    bare("CREATE TABLE tintgate.other (secret int)");
    EXPECT_EQ(faultOf([] { store::openStore("client"); }), Fault::Missing);
    EXPECT_EQ(jsonOf({"grant", client, "--client"})["rights"], "client");
    answer({"grant", reports, "--reports"});

    // All that a session does.
    const auto engine = store::openStore("client");
    EXPECT_EQ(store::checkLogin(*engine, "anna", "p"), store::LoginAnswer::Welcome);
    EXPECT_EQ(engine->createNext(3), 1);
    EXPECT_TRUE(engine->create(3, 70));
    EXPECT_EQ(send(*engine, 3, 1, "Job/Display/Status=208 a=1,2 b='x"), "taken 1111");
    EXPECT_EQ(send(*engine, 3, 1, "a[-2]=3 b=-"), "taken 11");
    EXPECT_EQ(ticket(*engine, 3, 1), "Job/Display/Status[0]=208 a[0]=1 a[1]=2 a[2]=3");
    for (const char* const text : {"one", "two"}) {
        putFile(*engine, "jobs/1/a.jdf", text + std::string(400'000, 'x'));
    }
    EXPECT_EQ(versions(*engine, "jobs/1/a.jdf").size(), 1u);
    EXPECT_TRUE(engine->remove(3, 70));
    engine->log({std::time(nullptr), store::Event::Refusal, "anna", "here", "wrong"});
    EXPECT_EQ(engine->refusalsSince(0), 1);
    EXPECT_EQ(open()->logEntries().size(), 3u);

    // What reports read.
    const auto reader = store::openStore("reports");
    EXPECT_EQ(ticket(*reader, 3, 1), ticket(*engine, 3, 1));
    EXPECT_EQ(file(*reader, "jobs/1/a.jdf").substr(0, 3), "two");
    EXPECT_EQ(versions(*reader, "jobs/1/a.jdf").size(), 1u);
    store::JobOverview overview;
    reader->overview(overview);
    EXPECT_EQ(overview.ids(), std::vector<int>{1});
    for (const std::string service : {"reports", "client"}) {
        EXPECT_EQ(run({"-s", service, "jobs"}).exitCode, 0);
        EXPECT_EQ(run({"-s", service, "export"}).exitCode, 0);
    }

    // What neither may do.
    const std::function<void(store::StoreEngine&)> forbidden[] = {
        [](auto& each) {
            each.putUser({"eve", "", false});
        },
        [](auto& each) { each.removeUser("anna"); },
        [](auto& each) { each.pruneVersions("jobs/1/a.jdf", {}); },
        [](auto& each) { each.removeFile("jobs/1/a.jdf"); },
        [](auto& each) { each.logEntries(); },
    };
    for (const auto& deed : forbidden) {
        EXPECT_EQ(faultOf([&] { deed(*engine); }), Fault::ReadOnly);
        EXPECT_EQ(faultOf([&] { deed(*reader); }), Fault::ReadOnly);
    }
    for (const std::string service : {"reports", "client"}) {
        for (const char* const sql :
             {"SELECT * FROM tintgate.other", "DELETE FROM tintgate.log",
              "DROP TABLE tintgate.keys", "CREATE TABLE tintgate.mine (a int)",
              "UPDATE tintgate.store SET format = 9", "UPDATE tintgate.users SET disabled = false",
              "UPDATE tintgate.tickets SET type = 4", "TRUNCATE tintgate.keys"}) {
            const auto fault = faultOfSql(service, sql);
            EXPECT_TRUE(fault.has_value()) << service << sql;
        }
        expectRefusal({"-s", service, "upgrade"}, 7);
        expectRefusal({"-s", service, "grant", client, "--client"}, 7);
    }
    EXPECT_EQ(faultOf([&] { reader->user("anna"); }), Fault::ReadOnly);
    EXPECT_EQ(faultOf([&] { reader->create(3, 2); }), Fault::ReadOnly);
    EXPECT_EQ(faultOf([&] { putFile(*reader, "x", "y"); }), Fault::ReadOnly);
    EXPECT_EQ(send(*reader, 3, 1, "a=1").substr(0, 7), "refused");

    // Rights are exchanged, not added.
    answer({"grant", client, "--reports"});
    EXPECT_EQ(faultOf([&] { store::openStore("client")->create(3, 5); }), Fault::ReadOnly);
    EXPECT_EQ(faultOf([&] { store::openStore("client")->user("anna"); }), Fault::ReadOnly);

    expectRefusal({"grant", "nobody here", "--client"}, 13, "no role nobody here");
    expectRefusal({"grant", "tintgate", "--reports"}, 13, "owns the store");
    expectRefusal({"grant", client}, 64, "--client or --reports");
    expectRefusal({"-s", folder.path("x") + "/", "grant", client, "--client"}, 13, "no roles");
}

} // namespace
