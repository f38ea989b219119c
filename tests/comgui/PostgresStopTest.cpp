// A server that is stopped as a crash would stop it, while clients are at work.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <random>

#include <sys/mman.h>

#include "StoreTest.h"
#include "Suite.h"
#include "comgui/Users.h"

namespace {

constexpr int rounds = 30;

/// What the clients have been told to be done, which must then be there.
struct Done {
    std::atomic<int> table;
    std::atomic<int> file;
    std::atomic<int> started;
};

std::string fileText(int number) {
    return std::string(400'000, static_cast<char>('a' + number % 26)) + std::to_string(number);
}

bool isWholeFile(const std::string& text) {
    return text.size() > 400'000 && text == fileText(std::stoi(text.substr(400'000)));
}

std::string tableText(int number) {
    const std::string text = std::to_string(number);
    std::string records = "first=" + text + " array=" + text;
    for (int element = 1; element < 1'500; ++element) {
        records += " array[" + std::to_string(element) + "]=" + text;
    }
    return records + " last=" + text;
}

int endWith(std::optional<store::Fault> fault) {
    return !fault ? 1 : *fault == store::Fault::Lost ? 0 : *fault == store::Fault::Missing ? 0 : 2;
}

} // namespace

class PostgresStop : public testing::Test {
  protected:
    /// Writes tables and files through the engine until the server is gone.
    int writeThroughEngine(Done& done, int from) const {
        return endWith(StoreTest::faultOf([&] {
            const auto engine = store::openStore("tintgate");
            ++done.started;
            for (int i = from;; ++i) {
                if (StoreTest::send(*engine, 3, 1, tableText(i)) != "taken " + results) {
                    engine->ids(3); // Tells why.
                }
                done.table = i;
                StoreTest::putFile(*engine, "jobs/1/job.jdf", fileText(i));
                done.file = i;
            }
        }));
    }

    /// Reads and writes as a run of the tool does, and ends when something fails. Then the server
    /// is gone for good, and each further call says so at once.
    int workThroughConnector(Done& done) const {
        const auto connector = Suite::connect(L"tintgate");
        ++done.started;
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
            int* ids = nullptr;
            int count = 0;
            connector->GetVerifierJobTicketIDs(&ids, &count, false);
            std::free(ids);
            connector->UploadFile(folder.path("local"), "/server/file");
            if (connector->DownloadFile(copy, "/server/file", 200) &&
                support::contentsOf(copy) != "local") {
                return 4;
            }
        }
        return connector->IsAlive() || connector->UploadFile(folder.path("local"), "/x") ? 5 : 0;
    }

    /// The end of a process that may take this long, or 999.
    static int endInTime(pid_t child) {
        // A server that is stopped closes its connections at once; the limit is for silent ones.
        for (int tenths = 0; tenths < 350; ++tenths) {
            int status = 0;
            if (waitpid(child, &status, WNOHANG) == child) {
                return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
            }
            usleep(100'000);
        }
        kill(child, SIGKILL);
        endOf(child);
        return 999;
    }

    const std::string results = std::string(1'502, '1');
    const support::PostgresServer server;
    const Suite suite;
    const support::ScratchFolder folder;
};

TEST_F(PostgresStop, EachClientEndsAndAllIsWholeThirtyTimes) {
    store::makeStore("tintgate", "Press room");
    {
        const auto engine = store::openStore("tintgate");
        engine->putUser({"press", store::passwordHash("room"), false});
        engine->create(3, 1);
        engine->create(3, 2);
    }
    folder.write("local", "local");
    void* const memory =
        mmap(nullptr, sizeof(Done), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(memory, MAP_FAILED);
    auto& done = *static_cast<Done*>(memory);
    std::mt19937 random(11); // NOLINT: the same moments, as far as that goes
    int next = 1;
    int workedOn = 0; // Rounds in which something was written.
    for (int round = 0; round < rounds && !HasFailure(); ++round) {
        done.started = 0;
        const pid_t clients[] = {startProcess([&] { return writeThroughEngine(done, next); }),
                                 startProcess([&] { return workThroughConnector(done); })};
        // Mostly with both at work; at times while they log in.
        for (int wait = 0; round % 10 != 0 && done.started != 2 && wait < 50'000; ++wait) {
            usleep(100);
        }
        usleep(random() % 100'000);
        server.stop("immediate");
        for (const pid_t client : clients) {
            EXPECT_EQ(endInTime(client), 0) << (client == clients[0] ? "engine" : "connector");
        }
        server.startAgain();
        const auto engine = store::openStore("tintgate");
        const auto single = [&](const char* key) {
            const auto elements = engine->key(3, 1, key);
            return elements == nullptr ? 0 : std::get<int>(*elements->first());
        };
        const int table = single("first");
        EXPECT_EQ(single("last"), table);
        EXPECT_GE(table, done.table);
        if (table > 0) {
            const auto array = engine->key(3, 1, "array");
            EXPECT_EQ(array->count(), 1'500);
            array->visit([&](int, const store::Value& value) {
                EXPECT_EQ(std::get<int>(value), table);
                return !HasFailure();
            });
        }
        if (done.file > 0) {
            const std::string text = StoreTest::file(*engine, "jobs/1/job.jdf");
            ASSERT_TRUE(isWholeFile(text));
            EXPECT_GE(std::stoi(text.substr(400'000)), done.file);
        }
        workedOn += table >= next ? 1 : 0;
        next = table + 1;
    }
    EXPECT_GT(workedOn, rounds / 3) << "the server was stopped before anything was written";
    const auto engine = store::openStore("tintgate");
    for (const auto& version : engine->versions("jobs/1/job.jdf")) {
        std::ostringstream to;
        engine->getVersion("jobs/1/job.jdf", version.number, to);
        ASSERT_TRUE(isWholeFile(to.str()));
    }
    EXPECT_EQ(support::BarePostgres("tintgate")
                  .run("SELECT count(*) FROM tintgate.contents WHERE number NOT IN"
                       " (SELECT content FROM tintgate.files WHERE content IS NOT NULL UNION ALL"
                       " SELECT content FROM tintgate.versions)"),
              "0")
        << "contents that nobody can reach";
    munmap(memory, sizeof(Done));
}
