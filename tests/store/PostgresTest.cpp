// What only a store on a server can meet: services that lead nowhere, servers that fall silent or
// are stopped, older schemas.
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

    const support::BarePostgres bare{"room"};
};

} // namespace

TEST_F(Postgres, AServiceThatLeadsToNoStoreIsNone) {
    // Takes connections, at a port that the system chooses, and never says a word.
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

TEST_F(Postgres, AServerThatFallsSilentIsGivenUp) {
    room->addService("impatient", "options=-c statement_timeout=700\ntcp_user_timeout=800");
    open()->create(3, 1);
    const std::string process = "SELECT pid FROM pg_stat_activity WHERE application_name = "
                                "'tintgate' AND datname = current_database()";
    for (const bool stopped : {true, false}) {
        while (!bare.run(process).empty()) {
            usleep(1'000);
        }
        const auto engine = store::openStore("impatient");
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
        faultInTime([&] { // At once, however often it is asked.
            for (int i = 0; i < 100; ++i) {
                EXPECT_EQ(faultOf([&] { putFile(*engine, "a/b", "x"); }), Fault::Lost);
                EXPECT_EQ(send(*engine, 3, 1, "a=2"), "refused 0");
            }
        });
        if (stopped) {
            kill(std::stoi(pid), SIGCONT);
        }
    }
    EXPECT_EQ(ticket(*open(), 3, 1), "");
    EXPECT_TRUE(open()->files().empty());
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
    // As it was before there were files.
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
