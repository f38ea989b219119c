// Several processes on one store; writers that are killed, and servers that are stopped under them.
#include <atomic>
#include <csignal>
#include <new>
#include <random>
#include <set>
#include <string>

#include <sys/mman.h>

#include "StoreTest.h"
#include "tests/job/Rounds.h"

namespace {

class StoreProcesses : public StoreTest {};
ON_BOTH_ENGINES(StoreProcesses);

/// Writes that can be cut off at any moment, and of which one can tell whether they are there
/// whole: each is a table of ticket 3/1 and a file, both of one number.
class NumberedWrites {
  public:
    /// What writers have been told to be done, which must then be there. All processes share it.
    struct Done {
        std::atomic<int> table, file;
        std::atomic<bool> begun; ///< A first write is done, since somebody set it to false.
    };

    NumberedWrites()
        : done(*new (mmap(nullptr, sizeof(Done), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS,
                          -1, 0)) Done{}) {}
    ~NumberedWrites() { munmap(&done, sizeof(Done)); }
    NumberedWrites(const NumberedWrites&) = delete;

    /// Writes with this number and those behind it, until the store fails.
    [[noreturn]] void write(store::StoreEngine& engine, int number) const {
        for (;; ++number) {
            const std::string text = std::to_string(number);
            std::string records = "first=" + text + " array=" + text;
            for (unsigned element = 1; element < arraySize; ++element) {
                records += "," + text;
            }
            if (StoreTest::send(engine, 3, 1, records + " last=" + text)[0] == 'r') {
                engine.ids(3); // Tells why it was refused.
            }
            done.table = number;
            StoreTest::putFile(engine, path, fileText(number));
            done.file = number;
            done.begun = true;
        }
    }

    /// Waits for a moment in a writer's work: of every ten rounds one may be in its first write.
    void waitForAMoment(int round, unsigned window) {
        for (int wait = 0; round % 10 != 0 && !done.begun && wait < 200'000; ++wait) {
            usleep(100);
        }
        usleep(m_random() % window);
    }

    /// The number of the table that is there; the file's may be a further one.
    int expectWhole(store::StoreEngine& engine) const {
        std::multiset<int> numbers;
        const auto content = engine.content(3, 1, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            elements->visit([&](int, const store::Value& value) {
                numbers.insert(std::get<int>(value));
                return true;
            });
        }
        const int table = numbers.empty() ? 0 : *numbers.begin();
        EXPECT_EQ(numbers.count(table), numbers.empty() ? 0u : arraySize + 2);
        EXPECT_EQ(numbers.count(table), numbers.size());
        EXPECT_GE(table, done.table);
        if (done.file > 0) {
            EXPECT_GE(expectWholeFile(StoreTest::file(engine, path)), done.file);
        }
        return table;
    }

    void expectWholeVersions(store::StoreEngine& engine) const {
        int last = 0;
        for (const std::string& text : StoreTest::versions(engine, path)) {
            const int number = expectWholeFile(text);
            EXPECT_GE(number, last);
            last = number;
        }
        EXPECT_GT(last, 0);
        EXPECT_EQ(engine.files().size(), 1u);
    }

    Done& done;

  private:
    static constexpr const char* path = "jobs/1/job.jdf";
    static constexpr unsigned arraySize = 1'500;
    static constexpr std::size_t fill = 100'000;

    static std::string fileText(int number) {
        return std::string(fill, static_cast<char>('a' + number % 26)) + std::to_string(number);
    }

    static int expectWholeFile(const std::string& text) {
        const int number = text.size() > fill ? std::stoi(text.substr(fill)) : -1;
        EXPECT_TRUE(number > 0 && text == fileText(number)) << text.size() << " bytes";
        return number;
    }

    std::mt19937 m_random{5}; // NOLINT: the same moments, as far as that goes
};

} // namespace

TEST_P(StoreProcesses, TwoWritersLoseAndMixNothing) {
    const int tables = 10 * roundsOr(25);
    open()->create(3, 1);
    const auto write = [&](const std::string& name) {
        return startProcess([&] {
            const auto engine = open();
            for (int i = 0; i < tables; ++i) {
                const std::string number = std::to_string(i);
                EXPECT_EQ(send(*engine, 3, 1,
                               "both[-2]='" + name + number + " " + name + "[-2]=" + number),
                          "taken 11");
                if (i % 5 == 0) {
                    putFile(*engine, "a/b/file", name + number);
                    engine->createNext(4);
                }
            }
            return HasFailure() ? 1 : 0;
        });
    };
    const pid_t writers[] = {write("a"), write("b")};

    // Until one of them ends, each moment that is seen is one between two tables.
    const auto engine = open();
    for (siginfo_t ended = {}; ended.si_pid == 0;) {
        const auto content = engine->content(3, 1, store::KeyFilter());
        const auto countOf = [&](const char* key) {
            const auto elements = content->find(key);
            return elements == nullptr ? 0 : elements->count();
        };
        ASSERT_EQ(countOf("both"), countOf("a") + countOf("b"));
        waitid(P_ALL, 0, &ended, WEXITED | WNOHANG | WNOWAIT);
    }
    EXPECT_EQ(endOf(writers[0]), 0);
    EXPECT_EQ(endOf(writers[1]), 0);

    const auto both = engine->key(3, 1, "both");
    ASSERT_EQ(both->count(), 2 * tables);
    int next[2] = {0, 0};
    both->visit([&](int, const store::Value& value) {
        const auto& text = std::get<store::Text>(value).bytes->text;
        EXPECT_EQ(text.substr(1), std::to_string(next[text[0] - 'a']++));
        return true;
    });
    const auto former = versions(*engine, "a/b/file");
    std::set<std::string> texts(former.begin(), former.end());
    texts.insert(file(*engine, "a/b/file"));
    EXPECT_EQ(texts.size(), 2u * tables / 5) << "a version was lost";
    EXPECT_EQ(engine->ids(4).size(), 2u * tables / 5);
}

TEST_P(StoreProcesses, WritersKilledAtAnyMomentLeaveWholeTablesAndFiles) {
    const int rounds = roundsOr(25);
    open()->create(3, 1);
    NumberedWrites writes;
    int written = 0;
    for (int round = 0; round < rounds && !HasFailure(); ++round) {
        writes.done.begun = false;
        const pid_t child = startProcess([&] {
            writes.write(*open(), written + 1);
            return 0;
        });
        writes.waitForAMoment(round, 50'000);
        kill(child, SIGKILL);
        ASSERT_EQ(endOf(child), 1000 + SIGKILL);
        written = writes.expectWhole(*open());
    }
    EXPECT_GT(written, rounds / 4) << "the writers were killed before they wrote anything";
    writes.expectWholeVersions(*open());
}

// As a crash would stop it.
TEST(PostgresStop, LosesNothingAndLeavesNoWriterHanging) {
    const int rounds = roundsOr(5);
    const support::PostgresServer server;
    store::makeStore("tintgate", "Press room");
    store::openStore("tintgate")->create(3, 1);
    NumberedWrites writes;
    int last = 0;
    int workedOn = 0; // Rounds in which something was written.
    for (int round = 0; round < rounds && !testing::Test::HasFailure(); ++round) {
        writes.done.begun = false;
        const pid_t client = startProcess([&] {
            alarm(35); // It is told at once; the limit is for a server that only falls silent.
            const auto fault =
                StoreTest::faultOf([&] { writes.write(*store::openStore("tintgate"), last + 1); });
            return fault == store::Fault::Lost || fault == store::Fault::Missing ? 0 : 2;
        });
        writes.waitForAMoment(round, 100'000);
        server.stop("immediate");
        EXPECT_EQ(endOf(client), 0);
        server.startAgain();
        const int table = writes.expectWhole(*store::openStore("tintgate"));
        workedOn += table > last ? 1 : 0;
        last = table;
    }
    EXPECT_GT(workedOn, rounds / 3) << "the server was stopped before anything was written";
    writes.expectWholeVersions(*store::openStore("tintgate"));
    EXPECT_EQ(support::BarePostgres("tintgate")
                  .run("SELECT count(*) FROM tintgate.contents WHERE number NOT IN"
                       " (SELECT content FROM tintgate.files WHERE content IS NOT NULL UNION ALL"
                       " SELECT content FROM tintgate.versions)"),
              "0")
        << "contents that nobody can reach";
}
