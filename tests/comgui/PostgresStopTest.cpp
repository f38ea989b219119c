// A server that is stopped as a crash would stop it, while clients are at work.
#include <csignal>
#include <random>

#include "NumberedWrites.h"
#include "Suite.h"
#include "comgui/Users.h"
#include "tests/job/Rounds.h"

namespace {

class PostgresStop : public testing::Test {
  protected:
    /// Writes through the engine until the server is gone.
    int writeThroughEngine(int from) const {
        const auto fault = StoreTest::faultOf([&] {
            const auto engine = store::openStore("tintgate");
            writes.write(*engine, from);
        });
        return fault == store::Fault::Lost || fault == store::Fault::Missing ? 0 : 2;
    }

    /// Reads and writes as a run of the tool does, and ends when something fails. Then the server
    /// is gone for good, and each further call says so at once.
    int workThroughConnector() const {
        const auto connector = Suite::connect(L"tintgate");
        ++writes.done.started;
        if (!connector->IsLoggedIn()) {
            // Without a code where the server went away behind the login itself: what it then does
            // not say of its version counts as a server of an early one.
            const int code = connector->getLastRetCode();
            return code == -2005 || code == 0 ? 0 : 3;
        }
        const std::string copy = folder.path("copy-" + std::to_string(getpid()));
        int value = 0;
        while (connector->SetJobTicketKeyValue(3, 2, "Value", PARAM_INT, &++value, -1) == 0) {
            int read = -1;
            connector->GetJobTicketKeyValue(3, 2, "Value", PARAM_INT, &read, nullptr, -1);
            connector->UploadFile(local, "/server/file");
            if (connector->DownloadFile(copy, "/server/file", 200) &&
                support::contentsOf(copy) != "local") {
                return 4;
            }
        }
        return connector->IsAlive() || connector->UploadFile(local, "/x") ? 5 : 0;
    }

    /// The end of a process that may take this long, or 999.
    static int endInTime(pid_t child) {
        // A server that is stopped closes its connections at once; the limit is for silent ones.
        for (int wait = 0; wait < 3'500; ++wait) {
            int status = 0;
            if (waitpid(child, &status, WNOHANG) == child) {
                return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
            }
            usleep(10'000);
        }
        kill(child, SIGKILL);
        endOf(child);
        return 999;
    }

    const support::PostgresServer server;
    const Suite suite;
    const support::ScratchFolder folder;
    const std::string local = folder.write("local", "local");
    const NumberedWrites writes;
};

} // namespace

TEST_F(PostgresStop, EachClientEndsAndAllIsWhole) {
    const int rounds = roundsOr(5);
    store::makeStore("tintgate", "Press room");
    {
        const auto engine = store::openStore("tintgate");
        engine->putUser({"press", store::passwordHash("room"), false});
        engine->create(3, 1);
        engine->create(3, 2);
    }
    std::mt19937 random(11); // NOLINT: the same moments, as far as that goes
    int last = 0;
    int workedOn = 0; // Rounds in which something was written.
    for (int round = 0; round < rounds && !HasFailure(); ++round) {
        writes.done.started = 0;
        const pid_t clients[] = {startProcess([&] { return writeThroughEngine(last + 1); }),
                                 startProcess([&] { return workThroughConnector(); })};
        if (round % 10 != 0) { // Else at times while they log in.
            writes.waitForStart(2);
        }
        usleep(random() % 100'000);
        server.stop("immediate");
        EXPECT_EQ(endInTime(clients[0]), 0) << "engine";
        EXPECT_EQ(endInTime(clients[1]), 0) << "connector";
        server.startAgain();
        const int table = writes.expectWhole(*store::openStore("tintgate"));
        workedOn += table > last ? 1 : 0;
        last = table;
    }
    EXPECT_GT(workedOn, rounds / 3) << "the server was stopped before anything was written";
    const auto engine = store::openStore("tintgate");
    writes.expectWholeVersions(*engine);
    EXPECT_EQ(support::BarePostgres("tintgate")
                  .run("SELECT count(*) FROM tintgate.contents WHERE number NOT IN"
                       " (SELECT content FROM tintgate.files WHERE content IS NOT NULL UNION ALL"
                       " SELECT content FROM tintgate.versions)"),
              "0")
        << "contents that nobody can reach";
}
