// Several processes on one store, some of which are killed.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <climits>
#include <csignal>
#include <random>
#include <string>

#include <sys/mman.h>

#include "StoreTest.h"

namespace {

class StoreProcesses : public StoreTest {};
ON_BOTH_ENGINES(StoreProcesses);

/// The one int that a ticket's key holds, or -1.
int single(store::StoreEngine& engine, const char* key) {
    const auto elements = engine.key(3, 1, key);
    return elements == nullptr ? -1 : std::get<int>(*elements->first());
}

} // namespace

TEST_P(StoreProcesses, TwoWritersOfAThousandTablesEachLoseAndMixNothing) {
    constexpr int tables = 1'000;
    open()->create(3, 1);
    const auto write = [&](const std::string& name) {
        const auto engine = open();
        for (int i = 0; i < tables; ++i) {
            const std::string number = std::to_string(i);
            const std::string records = "both[-2]='" + name + number + " last=" + number + " " +
                                        name + "[-2]=" + number + " twin='" + name + number;
            if (send(*engine, 3, 1, records) != "taken 1111") {
                return 1;
            }
        }
        return 0;
    };
    const pid_t first = startProcess([&] { return write("a"); });
    const pid_t second = startProcess([&] { return write("b"); });

    // Meanwhile each moment that is seen is one between two tables.
    const auto engine = open();
    int count = 0;
    do {
        const auto content = engine->content(3, 1, store::KeyFilter());
        ASSERT_NE(content, nullptr);
        if (content->empty()) {
            continue;
        }
        const auto both = content->find("both");
        const auto last = both->at(both->count() - 1);
        count = both->count();
        const auto& text = std::get<store::Text>(*last).bytes->text;
        ASSERT_EQ(text, std::get<store::Text>(*content->find("twin")->first()).bytes->text);
        ASSERT_EQ(text.substr(1), std::to_string(std::get<int>(*content->find("last")->first())));
        const auto of = [&](const char* name) {
            const auto own = content->find(name);
            return own == nullptr ? 0 : own->count();
        };
        ASSERT_EQ(count, of("a") + of("b"));
    } while (count < 2 * tables && waitpid(-1, nullptr, WNOHANG | WNOWAIT) >= 0 &&
             !testing::Test::HasFailure());
    EXPECT_EQ(endOf(first), 0);
    EXPECT_EQ(endOf(second), 0);

    const auto both = engine->key(3, 1, "both");
    ASSERT_EQ(both->count(), 2 * tables);
    int next[2] = {0, 0};
    both->visit([&](int, const store::Value& value) {
        const auto& text = std::get<store::Text>(value).bytes->text;
        EXPECT_EQ(text.substr(1), std::to_string(next[text[0] - 'a']++));
        return true;
    });
}

TEST_P(StoreProcesses, WritersKilledAtAnyMomentLeaveWholeTablesAndFiles) {
    constexpr int rounds = 100;
    open()->create(3, 1);
    // What the writer has been told to be done, which must then be there.
    struct Shared {
        std::atomic<int> table;
        std::atomic<int> file;
        std::atomic<int> round;
    };
    void* const memory =
        mmap(nullptr, sizeof(Shared), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(memory, MAP_FAILED);
    auto& done = *static_cast<Shared*>(memory);
    const auto fileText = [](int number) {
        return std::string(40'000, static_cast<char>('a' + number % 26)) + std::to_string(number);
    };
    const auto write = [&](int from, int to, int round) {
        const auto engine = open();
        done.round = round;
        for (int i = from; i < to; ++i) {
            std::string records = "first=" + std::to_string(i) + " array=" + std::to_string(i);
            for (int element = 1; element < 1'500; ++element) {
                records += " array[" + std::to_string(element) + "]=" + std::to_string(i);
            }
            send(*engine, 3, 1, records + " last=" + std::to_string(i));
            done.table = i;
            putFile(*engine, "jobs/1/job.jdf", fileText(i));
            done.file = i;
        }
        return 0;
    };
    const auto isWhole = [&](const std::string& text) {
        return text.size() > 40'000 && text == fileText(std::stoi(text.substr(40'000)));
    };
    // A few whole writes, to know how long one takes here.
    const auto start = std::chrono::steady_clock::now();
    ASSERT_EQ(endOf(startProcess([&] { return write(1, 4, 0); })), 0);
    const std::chrono::duration<double, std::micro> three =
        std::chrono::steady_clock::now() - start;
    const auto window = static_cast<unsigned>(std::clamp(three.count(), 20e3, 200e3));
    std::mt19937 random(5); // NOLINT: the same moments, as far as that goes
    int written = 3;
    for (int round = 0; round < rounds && !HasFailure(); ++round) {
        const pid_t child = startProcess([&] { return write(written + 1, INT_MAX, round); });
        // Counted from its start, and at times within it.
        for (int wait = 0; round % 10 != 0 && done.round != round && wait < 50'000; ++wait) {
            usleep(100);
        }
        usleep(random() % window);
        kill(child, SIGKILL);
        ASSERT_EQ(endOf(child), 1000 + SIGKILL);

        const auto engine = open();
        const int first = single(*engine, "first");
        EXPECT_EQ(single(*engine, "last"), first);
        EXPECT_GE(std::max(first, 0), done.table.load());
        if (first > 0) {
            const auto array = engine->key(3, 1, "array");
            EXPECT_EQ(array->count(), 1'500);
            array->visit([&](int, const store::Value& value) {
                EXPECT_EQ(std::get<int>(value), first);
                return !HasFailure();
            });
            written = first;
        }
        if (done.file > 0) {
            const std::string text = file(*engine, "jobs/1/job.jdf");
            EXPECT_TRUE(isWhole(text));
            EXPECT_GE(std::stoi(text.substr(40'000)), done.file.load());
        }
    }
    const auto engine = open();
    EXPECT_GT(written, rounds / 4) << "the writers were killed before they wrote anything";
    int last = 0;
    for (const auto& version : engine->versions("jobs/1/job.jdf")) {
        std::ostringstream to;
        engine->getVersion("jobs/1/job.jdf", version.number, to);
        ASSERT_TRUE(isWhole(to.str()));
        const int number = std::stoi(to.str().substr(40'000));
        EXPECT_GE(number, last);
        last = number;
    }
    EXPECT_EQ(engine->files().size(), 1u);
    munmap(memory, sizeof(Shared));
}

TEST_P(StoreProcesses, ManyDeliveriesToOnePlaceKeepEachOther) {
    constexpr int writers = 4;
    constexpr int files = 25;
    std::vector<pid_t> children;
    for (int writer = 0; writer < writers; ++writer) {
        children.push_back(startProcess([&] {
            const auto engine = open();
            for (int i = 0; i < files; ++i) {
                putFile(*engine, "a/b/file", std::to_string(writer * files + i));
            }
            return 0;
        }));
    }
    for (const pid_t child : children) {
        EXPECT_EQ(endOf(child), 0);
    }
    const auto engine = open();
    std::vector<std::string> texts = {file(*engine, "a/b/file")};
    for (const auto& version : engine->versions("a/b/file")) {
        std::ostringstream to;
        engine->getVersion("a/b/file", version.number, to);
        texts.push_back(to.str());
    }
    std::sort(texts.begin(), texts.end());
    EXPECT_EQ(std::unique(texts.begin(), texts.end()), texts.end());
    EXPECT_EQ(texts.size(), std::size_t{writers * files}) << "a version was lost";
}
