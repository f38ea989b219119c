// SPDX-License-Identifier: Apache-2.0
// Several processes on one store, killed writers, and servers stopped during a write.
#include <atomic>
#include <csignal>
#include <new>
#include <random>
#include <set>
#include <string>

#include <sys/mman.h>

#include "StoreTest.h"

namespace {

class StoreProcesses : public StoreTest {};
ON_BOTH_ENGINES(StoreProcesses);

/// Writes that can be interrupted at any moment and checked for completeness: each is a table of
/// ticket 3/1 and a file, both with the same number.
class NumberedWrites {
  public:
    /// Numbers of completed writes, which the store must contain. All processes share them.
    struct Done {
        std::atomic<int> table, file;
        std::atomic<bool> begun; ///< Set after a writer's first table and file.
    };

    NumberedWrites()
        : m_done(*new(mmap(nullptr, sizeof(Done), PROT_READ | PROT_WRITE,
                           MAP_SHARED | MAP_ANONYMOUS, -1, 0)) Done{}) {}
    ~NumberedWrites() { munmap(&m_done, sizeof(Done)); }
    NumberedWrites(const NumberedWrites&) = delete;

    /// Starts writers one by one and interrupts each at a random moment.
    void expectWholeAfter(const std::string& store, int rounds,
                          const std::function<void(pid_t writer)>& cutOff) {
        store::openStore(store)->create(3, 1);
        int last = 0;
        int workedOn = 0; // Rounds in which a table was written.
        for (int round = 0; round < rounds && !testing::Test::HasFailure(); ++round) {
            m_done.begun = false;
            const pid_t writer = startProcess([&] {
                alarm(35); // For a server that stops answering instead of closing the connection.
                const auto fault =
                    StoreTest::faultOf([&] { write(*store::openStore(store), last + 1); });
                return fault == store::Fault::Lost || fault == store::Fault::Missing ? 0 : 2;
            });
            // One round in ten may be interrupted during its first write.
            for (int wait = 0; round % 10 != 0 && !m_done.begun && wait < 200'000; ++wait) {
                usleep(100);
            }
            usleep(m_random() % 60'000);
            cutOff(writer);
            const int table = expectWhole(*store::openStore(store));
            workedOn += table > last ? 1 : 0;
            last = table;
        }
        EXPECT_GT(workedOn, rounds / 3) << "writers were cut off before they wrote anything";
        expectWholeVersions(*store::openStore(store));
    }

  private:
    /// Writes with this number and the following ones, until the store fails.
    [[noreturn]] void write(store::StoreEngine& engine, int number) const {
        for (;; ++number) {
            const std::string text = std::to_string(number);
            std::string records = "first=" + text + " array=" + text;
            for (unsigned element = 1; element < arraySize; ++element) {
                records += "," + text;
            }
            if (StoreTest::send(engine, 3, 1, records + " last=" + text)[0] == 'r') {
                throw store::StoreFailure(store::Fault::Lost, "the table was refused");
            }
            m_done.table = number;
            StoreTest::putFile(engine, path, fileText(number));
            m_done.file = number;
            m_done.begun = true;
        }
    }

    /// Returns the number of the stored table. The file's number may be higher.
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
        EXPECT_GE(table, m_done.table);
        if (m_done.file > 0) {
            EXPECT_GE(expectWholeFile(StoreTest::file(engine, path)), m_done.file);
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

    Done& m_done;
    std::mt19937 m_random{5}; // NOLINT: the same sequence each time
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

    // Until one of them ends, every read shows a state between two tables.
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
    NumberedWrites().expectWholeAfter(address, roundsOr(25), [](pid_t writer) {
        kill(writer, SIGKILL);
        EXPECT_EQ(endOf(writer), 1000 + SIGKILL);
    });
}

// The server stops without a shutdown, as in a crash.
TEST(PostgresStop, LosesNothing) {
    const support::PostgresServer server;
    store::makeStore("tintgate", "Press room");
    NumberedWrites().expectWholeAfter("tintgate", roundsOr(5), [&](pid_t writer) {
        server.stop("immediate");
        server.startAgain();
        // The writer continues, or fails if it was sending a file. It is killed in both cases.
        usleep(100'000);
        kill(writer, SIGKILL);
        const int end = endOf(writer);
        EXPECT_TRUE(end == 0 || end == 1000 + SIGKILL) << end;
    });
    EXPECT_EQ(support::BarePostgres("tintgate")
                  .run("SELECT count(*) FROM tintgate.contents WHERE number NOT IN"
                       " (SELECT content FROM tintgate.files WHERE content IS NOT NULL UNION ALL"
                       " SELECT content FROM tintgate.versions)"),
              "0")
        << "contents that nobody can reach";
}
