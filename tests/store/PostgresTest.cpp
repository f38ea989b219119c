// SPDX-License-Identifier: Apache-2.0
// Situations that only a store on a server has: services without a server, servers that stop
// answering or are stopped, older schemas.
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <thread>

#include <netinet/in.h>
#include <poll.h>
#include <pwd.h>
#include <sys/socket.h>

#include "StoreTest.h"
#include "store/postgres/Postgres.h"

using store::Fault;

namespace {

class Postgres : public StoreTest {
  protected:
    Postgres() : StoreTest(Engine::Postgres) {}

    /// The fault of work that must end within a few seconds.
    static std::optional<Fault> faultInTime(const std::function<void()>& work) {
        const auto start = std::chrono::steady_clock::now();
        const auto fault = faultOf(work);
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
        return fault;
    }

    const support::BarePostgres bare{"room"};
};

} // namespace

TEST_F(Postgres, AServiceThatLeadsToNoStoreIsNone) {
    // A listener on a port that the system chooses. It never answers.
    const int silent = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in listener = {};
    socklen_t size = sizeof listener;
    ASSERT_EQ(listen(silent, 8), 0);
    ASSERT_EQ(getsockname(silent, reinterpret_cast<sockaddr*>(&listener), &size), 0);
    const std::string port = std::to_string(ntohs(listener.sin_port));
    const std::pair<const char*, std::string> services[] = {
        {"nobody", "host=/nowhere"},
        {"no-store", "dbname=template1"},
        {"silent", "host=127.0.0.1\nconnect_timeout=2\nport=" + port},
        {"not-a-number", "port=x"},
    };
    for (const auto& [name, lines] : services) {
        room->addService(name, lines);
        EXPECT_EQ(faultInTime([&, at = name] { store::openStore(at); }), Fault::Missing) << name;
    }
    for (const char* no :
         {"unknown", "host=/tmp dbname=x", "postgresql://localhost/room", "\xFF"}) {
        EXPECT_EQ(faultOf([&] { store::openStore(no); }), Fault::Missing) << no;
    }
    bare.run("DELETE FROM tintgate.store");
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Missing) << "what is there was not made here";
    close(silent);
}

TEST_F(Postgres, ATicketThatIsHeldKeepsNobodyForEver) {
    room->addService("impatient", "options=-c statement_timeout=300");
    const auto engine = store::openStore("impatient");
    engine->create(3, 1);
    engine->create(3, 2);
    bare.run("BEGIN; UPDATE tintgate.tickets SET changes = 0 WHERE type = 3 AND id = 1");
    EXPECT_EQ(faultInTime([&] { engine->remove(3, 1); }), Fault::Busy);
    EXPECT_EQ(send(*engine, 3, 1, "a=1"), "refused 0");
    EXPECT_EQ(send(*engine, 3, 2, "a=1"), "taken 1") << "others do not wait";
    EXPECT_EQ(ticket(*engine, 3, 1), "") << "readers do not wait";
    bare.run("ROLLBACK");
    EXPECT_EQ(send(*engine, 3, 1, "a=1"), "taken 1");
}

TEST_F(Postgres, ASessionThatIsEndedOrFallsSilentIsReplaced) {
    room->addService("impatient", "options=-c statement_timeout=700\ntcp_user_timeout=800");
    open()->create(3, 1);
    const std::string process = "SELECT pid FROM pg_stat_activity WHERE application_name = "
                                "'tintgate' AND datname = current_database()";
    const auto engine = store::openStore("impatient");
    std::string others;
    for (const bool stopped : {true, false}) {
        const std::string pid = bare.run(process + others);
        ASSERT_FALSE(pid.empty());
        if (stopped) {
            kill(std::stoi(pid), SIGSTOP);
        } else {
            bare.run("SELECT pg_terminate_backend(" + pid + ")");
        }
        EXPECT_EQ(faultInTime([&] { EXPECT_EQ(engine->ids(3), std::vector<int>{1}); }),
                  std::nullopt);
        EXPECT_EQ(send(*engine, 3, 1, "a=2"), "taken 1");
        EXPECT_TRUE(engine->alive());
        if (stopped) {
            kill(std::stoi(pid), SIGCONT);
            others = " AND pid <> " + pid;
        }
    }
}

TEST_F(Postgres, WhatWasSentIsRepeatedUnlessTwiceIsNotOnce) {
    const struct {
        const char* records;
        bool isRepeated;
    } cases[] = {
        {"v=1,2 d=0.5", true},
        {"v[1]=5 w=-", true},
        {"v=- v[-2]=1 v[-2]=2 v[0]=-", true}, // The previous value does not matter.
        {"v[-2]=3", false},
        {"v[0]=-", false},
    };
    open()->create(3, 1);
    open()->create(3, 2);
    const std::string waiting =
        "SELECT pid FROM pg_stat_activity WHERE application_name = 'tintgate'"
        " AND datname = current_database() AND wait_event_type = 'Lock'";
    for (const auto& [records, isRepeated] : cases) {
        send(*open(), 3, 1, "v=7,8,9 w=1");
        support::RecordTable table(records);
        store::TicketContent expected = *open()->content(3, 1, store::KeyFilter());
        const std::string before = contentText(expected);
        expected.apply(table.records());
        store::CachingStorage keep(open());
        bare.run(
            "BEGIN; UPDATE tintgate.tickets SET changes = changes + 1 WHERE type = 3 AND id = 1");
        std::thread killer([&] { // Kills while the change waits at the server.
            std::string pid;
            const support::BarePostgres other("room");
            while ((pid = other.run(waiting)).empty()) {
                usleep(1'000);
            }
            other.run("SELECT pg_terminate_backend(" + pid + ")");
            bare.run("COMMIT");
        });
        EXPECT_EQ(keep.apply(3, 1, table.records()), isRepeated) << records;
        killer.join();
        EXPECT_EQ(ticket(*open(), 3, 1), isRepeated ? contentText(expected) : before) << records;
        // After a lost write, this session can't change that ticket. Other sessions can.
        EXPECT_EQ(keep.apply(3, 1, support::RecordTable("status=1").records()), isRepeated);
        EXPECT_EQ(keep.remove(3, 1), isRepeated);
        EXPECT_TRUE(keep.apply(3, 2, support::RecordTable("status=1").records()));
        EXPECT_NE(keep.key(3, 2, "status"), nullptr);
        keep.create(3, 1);
    }
}

TEST(PostgresLoss, ASessionGoesOnWhenItsServerIsBack) {
    const support::PostgresServer server;
    store::makeStore("tintgate", "Press room");
    const auto engine = store::openStore("tintgate");
    engine->create(3, 1);
    std::ostringstream fetched;
    const std::function<void()> steps[] = {
        [&] { EXPECT_EQ(StoreTest::send(*engine, 3, 1, "a=1 b=2"), "taken 11"); },
        [&] { EXPECT_EQ(StoreTest::send(*engine, 3, 1, "a[-2]=2 b[0]=-"), "taken 11"); },
        [&] { EXPECT_EQ(StoreTest::ticket(*engine, 3, 1), "a[0]=1 a[1]=2"); },
        [&] { EXPECT_TRUE(engine->alive()); },
        [&] { StoreTest::putFile(*engine, "a/b", "text"); },
        [&] { engine->getFile("a/b", fetched); },
        [&] { EXPECT_EQ(engine->createNext(3), 2); },
    };
    for (const auto& step : steps) {
        server.stop("fast");
        std::thread back([&] {
            usleep(300'000);
            server.startAgain();
        });
        step();
        back.join();
    }
    EXPECT_EQ(fetched.str(), "text");

    // A session that has waited too long for its server, all waits added up, stays lost.
    using namespace store::postgres;
    static constexpr Statement one = {"SELECT 1"};
    Connection connection("tintgate", std::chrono::milliseconds(1'000));
    server.stop("fast");
    const auto ask = [&] {
        connection.repeating([&] { return connection.run(one).number(0, 0); });
    };
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(StoreTest::faultOf(ask), Fault::Lost);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(900));
    server.startAgain();
    EXPECT_EQ(StoreTest::faultOf(ask), Fault::Lost);
    EXPECT_FALSE(connection.isThere());
}

/// PgBouncer between a test and the tests' server, with one session for all clients. While it
/// exists, the service "pooled" connects through it.
class Pooler {
  public:
    explicit Pooler(const support::PostgresRoom& room) {
        EXPECT_NE(mkdtemp(m_folder.data()), nullptr);
        const std::string services = support::contentsOf(std::getenv("PGSERVICEFILE"));
        const auto at = services.find("host=") + 5;
        const std::string server = services.substr(at, services.find('\n', at) - at);
        std::ofstream(m_folder + "/ini")
            << "[databases]\n* = host=" << server << " user=tintgate\n"
            << "[pgbouncer]\nlisten_port=6543\nunix_socket_dir=" << m_folder
            << "\nauth_type=any\npool_mode=transaction\ndefault_pool_size=1\n";
        // PgBouncer refuses to run as root.
        const passwd* const user = geteuid() == 0 ? getpwnam("postgres") : nullptr;
        if (user != nullptr) {
            EXPECT_EQ(chown(m_folder.c_str(), user->pw_uid, user->pw_gid), 0);
        }
        m_process = startProcess([&] {
            if (user != nullptr && (setgid(user->pw_gid) != 0 || setuid(user->pw_uid) != 0)) {
                return 1;
            }
            execl("/usr/sbin/pgbouncer", "pgbouncer", "-q", (m_folder + "/ini").c_str(), nullptr);
            return 1;
        });
        room.addService("pooled", "port=6543\nhost=" + m_folder);
        for (int wait = 0; wait < 500 && !std::filesystem::exists(m_folder + "/.s.PGSQL.6543");
             ++wait) {
            usleep(10'000);
        }
    }
    ~Pooler() {
        kill(m_process, SIGKILL);
        endOf(m_process);
        std::filesystem::remove_all(m_folder);
    }
    Pooler(const Pooler&) = delete;

  private:
    std::string m_folder = "/tmp/tintgate-pooler-XXXXXX"; ///< Accessible to that user.
    pid_t m_process = 0;
};

TEST_F(Postgres, APoolerMayHandOutSingleTransactions) {
    const Pooler pooler(*room);
    const auto one = store::openStore("pooled");
    const auto other = store::openStore("pooled");
    EXPECT_EQ(one->createNext(3), 1);
    EXPECT_EQ(other->createNext(3), 2);
    for (const auto& engine : {one.get(), other.get(), one.get()}) {
        EXPECT_EQ(send(*engine, 3, 1, "a=1 b[-2]=2 Job/Display/Status=208"), "taken 111");
        putFile(*engine, "a/b", std::string(3 << 20, 'x'));
        store::JobOverview jobs;
        engine->overview(jobs);
        EXPECT_EQ(jobs.ids(), (std::vector<int>{1, 2}));
    }
    EXPECT_EQ(ticket(*open(), 3, 1), "Job/Display/Status[0]=208 a[0]=1 b[0]=2 b[1]=2 b[2]=2");
    EXPECT_EQ(file(*other, "a/b").size(), 3u << 20);
    EXPECT_EQ(versions(*one, "a/b").size(), 2u);
    EXPECT_EQ(faultOf([] { store::openCopy("pooled"); }), Fault::Other);
    // Limits are set for the transaction, so no other client of that session gets them.
    using namespace store::postgres;
    static constexpr Statement limit = {"SELECT current_setting('lock_timeout')::text"};
    Connection connection("pooled");
    EXPECT_TRUE(connection.pooled());
    EXPECT_EQ(connection.run(limit).text(0, 0), "10s");
    EXPECT_EQ(support::BarePostgres("pooled").run(limit.text), "0");
    EXPECT_FALSE(Connection("room").pooled());
    // A measurement may take longer than the server lets a session idle.
    room->addService("idle", "options=-c idle_session_timeout=300");
    static constexpr Statement idle = {"SELECT current_setting('idle_session_timeout')::text"};
    EXPECT_EQ(Connection("idle").run(idle).text(0, 0), "0");
}

TEST_F(Postgres, ADislikedPasswordFileAndAnAddressCostNothing) {
    // libpq must print nothing to stderr, and there must be only one connection attempt.
    folder.write("passwords", "*:*:*:*:x\n");
    const std::string fileOption = "passfile=" + folder.path("passwords");
    std::filesystem::permissions(folder.path("passwords"), std::filesystem::perms(0644));
    const int listener = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in place = {};
    socklen_t size = sizeof place;
    ASSERT_EQ(listen(listener, 8), 0);
    ASSERT_EQ(getsockname(listener, reinterpret_cast<sockaddr*>(&place), &size), 0);
    room->addService("disliked", fileOption);
    room->addService("addressed", "host=localhost\nhostaddr=127.0.0.1\nconnect_timeout=2\nport=" +
                                      std::to_string(ntohs(place.sin_port)));
    testing::internal::CaptureStderr();
    EXPECT_NO_THROW(store::openStore("disliked"));
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
    std::thread opening(
        [] { EXPECT_EQ(faultOf([] { store::openStore("addressed"); }), Fault::Missing); });
    int connections = 0;
    for (pollfd wait = {listener, POLLIN, 0}; poll(&wait, 1, 1'000) > 0; ++connections) {
        close(accept(listener, nullptr, nullptr));
    }
    opening.join();
    EXPECT_EQ(connections, 1);
    close(listener);
}

TEST_F(Postgres, AServerThatTakesNoChangesIsReadOnly) {
    room->addService("standby", "options=-c default_transaction_read_only=on");
    const auto engine = store::openStore("standby");
    EXPECT_EQ(faultOf([&] { engine->create(3, 1); }), Fault::ReadOnly);
    EXPECT_EQ(faultOf([&] { putFile(*engine, "a/b", "x"); }), Fault::ReadOnly);
    EXPECT_EQ(send(*engine, 0, 0, "a=1"), "refused 0");
    EXPECT_NE(engine->key(0, 0, "System/Product/MajorVersion"), nullptr);
}

TEST_F(Postgres, AnOlderSchemaIsBroughtUpToDateOnce) {
    open()->createNext(3);
    // The schema before files existed.
    bare.run("DROP TABLE tintgate.files, tintgate.versions, tintgate.contents, tintgate.pieces,"
             " tintgate.job_blocks;"
             "UPDATE tintgate.store SET format = 1");
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Older);
    pid_t upgrades[2];
    for (pid_t& upgrade : upgrades) {
        upgrade = startProcess([&] { return store::bringStoreUpToDate(address) ? 1 : 0; });
    }
    EXPECT_EQ(endOf(upgrades[0]) + endOf(upgrades[1]), 1) << "one of the two has nothing to do";
    putFile(*open(), "a/b", "x");
    EXPECT_EQ(open()->ids(3), std::vector<int>{1});
}
