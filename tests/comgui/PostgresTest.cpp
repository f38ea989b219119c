// What only a store on a server can meet: services that lead nowhere, servers that fall silent or
// are stopped, older schemas.
#include <algorithm>
#include <chrono>
#include <csignal>

#include <netinet/in.h>
#include <sys/socket.h>

#include "StoreTest.h"

using store::Fault;

namespace {

class Postgres : public StoreTest {
  protected:
    Postgres() : StoreTest(Engine::Postgres) {}

    /// The fault of work, which must end within some seconds.
    static std::optional<Fault> faultInTime(const std::function<void()>& work) {
        const auto start = std::chrono::steady_clock::now();
        const auto fault = faultOf(work);
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
        return fault;
    }
};

/// Takes connections and never says a word.
class SilentServer {
  public:
    SilentServer() : m_socket(socket(AF_INET, SOCK_STREAM, 0)) {
        sockaddr_in address = {};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        socklen_t size = sizeof address;
        auto* const plain = reinterpret_cast<sockaddr*>(&address);
        if (bind(m_socket, plain, size) != 0 || listen(m_socket, 8) != 0 ||
            getsockname(m_socket, plain, &size) != 0) {
            throw std::runtime_error("no silent server");
        }
        port = ntohs(address.sin_port);
    }
    ~SilentServer() { close(m_socket); }

    int port = 0;

  private:
    const int m_socket;
};

} // namespace

TEST_F(Postgres, AServiceThatLeadsToNoStoreIsNone) {
    const SilentServer silent;
    room->addService("nobody", "host=/nowhere");
    room->addService("no-database", "dbname=none");
    room->addService("no-store", "dbname=template1");
    room->addService("no-user", "user=none");
    room->addService("silent",
                     "host=127.0.0.1\nconnect_timeout=2\nport=" + std::to_string(silent.port));
    room->addService("not-a-number", "port=x");
    const std::string addresses[] = {"unknown",
                                     "nobody",
                                     "no-database",
                                     "no-store",
                                     "no-user",
                                     "silent",
                                     "not-a-number",
                                     "host=/tmp dbname=x",
                                     "postgresql://localhost/room",
                                     "\xFF"};
    for (const auto& service : addresses) {
        EXPECT_EQ(faultInTime([&] { store::openStore(service); }), Fault::Missing) << service;
    }
    support::BarePostgres("room").run("DELETE FROM tintgate.store");
    EXPECT_EQ(faultInTime([&] { open(); }), Fault::Missing) << "what is there was not made here";
}

TEST_F(Postgres, AServerThatFallsSilentIsGivenUp) {
    room->addService("impatient", "options=-c statement_timeout=700\ntcp_user_timeout=800");
    const support::BarePostgres bare("room");
    {
        const auto engine = store::openStore("impatient");
        engine->create(3, 1);
        // Held by somebody else for longer than a statement may take.
        bare.run("BEGIN; UPDATE tintgate.tickets SET changes = 0 WHERE type = 3");
        EXPECT_EQ(faultInTime([&] { engine->remove(3, 1); }), Fault::Busy);
        EXPECT_EQ(send(*engine, 3, 1, "a=1"), "refused 0");
        bare.run("ROLLBACK");
        EXPECT_EQ(send(*engine, 3, 1, "a=1"), "taken 1");
        EXPECT_EQ(ticket(*engine, 3, 1), "a[0]=1");
    }
    for (const bool stopped : {true, false}) {
        const auto engine = store::openStore("impatient");
        const std::string process = "SELECT pid FROM pg_stat_activity WHERE application_name = "
                                    "'tintgate' AND datname = current_database()";
        const std::string pid = bare.run(process);
        ASSERT_FALSE(pid.empty());
        EXPECT_TRUE(engine->alive());
        if (stopped) {
            kill(std::stoi(pid), SIGSTOP);
        } else {
            bare.run("SELECT pg_terminate_backend(" + pid + ")");
        }
        EXPECT_EQ(faultInTime([&] { engine->ids(3); }), Fault::Lost);
        EXPECT_FALSE(engine->alive());
        // At once, however often it is asked.
        const auto start = std::chrono::steady_clock::now();
        for (int i = 0; i < 100; ++i) {
            EXPECT_EQ(faultOf([&] { putFile(*engine, "a/b", "x"); }), Fault::Lost);
            EXPECT_EQ(send(*engine, 3, 1, "a=2"), "refused 0");
        }
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(1));
        if (stopped) {
            kill(std::stoi(pid), SIGCONT);
            while (!bare.run(process).empty()) {
                usleep(1'000);
            }
        }
    }
    EXPECT_EQ(ticket(*open(), 3, 1), "a[0]=1");
    EXPECT_TRUE(open()->files().empty());
}

TEST_F(Postgres, AServerThatTakesNoChangesIsReadOnly) {
    room->addService("standby", "options=-c default_transaction_read_only=on");
    const auto engine = store::openStore("standby");
    EXPECT_EQ(faultOf([&] { engine->create(3, 1); }), Fault::ReadOnly);
    EXPECT_EQ(faultOf([&] { putFile(*engine, "a/b", "x"); }), Fault::ReadOnly);
    EXPECT_EQ(send(*engine, 0, 0, "a=1"), "refused 0");
    EXPECT_EQ(std::get<int>(*engine->key(0, 0, "System/Product/MajorVersion")->first()), 5);
}

TEST_F(Postgres, AnOlderSchemaIsBroughtUpToDateOnce) {
    open()->createNext(3);
    // As it was before there were files.
    sql("", "DROP TABLE tintgate.files, tintgate.versions, tintgate.contents, tintgate.pieces;"
            "UPDATE tintgate.store SET format = 1");
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Older);
    pid_t upgrades[2];
    for (pid_t& upgrade : upgrades) {
        upgrade = startProcess([&] { return store::bringStoreUpToDate(address) ? 1 : 0; });
    }
    EXPECT_EQ(endOf(upgrades[0]) + endOf(upgrades[1]), 1) << "one of the two has nothing to do";
    const auto engine = open();
    putFile(*engine, "a/b", "x");
    EXPECT_EQ(engine->ids(3), std::vector<int>{1});
    EXPECT_FALSE(store::bringStoreUpToDate(address));
}

TEST_F(Postgres, AChangeWaitsForTheTicketsRowAndForNoOther) {
    const auto engine = open();
    engine->create(3, 1);
    engine->create(3, 2);
    const support::BarePostgres bare("room");
    bare.run("BEGIN; UPDATE tintgate.tickets SET changes = changes WHERE type = 3 AND id = 1");
    EXPECT_EQ(send(*engine, 3, 2, "a=1"), "taken 1");
    const pid_t waiting =
        startProcess([&] { return send(*open(), 3, 1, "seen[-2]=2") == "taken 1" ? 0 : 1; });
    const support::BarePostgres onlooker("room"); // Within a transaction that list stays as it is.
    while (onlooker.run("SELECT count(*) FROM pg_stat_activity WHERE wait_event_type = 'Lock'"
                        " AND datname = current_database()") == "0") {
        usleep(1'000);
    }
    EXPECT_EQ(ticket(*engine, 3, 1), "") << "readers do not wait";
    // What the one who held it wrote meanwhile, the other one appends to: 1 as KeyBytes.h tells.
    bare.run("INSERT INTO tintgate.keys (ticket, name, value, change)"
             " SELECT number, 'seen', '\\x01020100000001000000', changes FROM tintgate.tickets"
             " WHERE type = 3 AND id = 1; COMMIT");
    EXPECT_EQ(endOf(waiting), 0);
    EXPECT_EQ(ticket(*engine, 3, 1), "seen[0]=1 seen[1]=2");
}
