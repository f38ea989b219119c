// Several processes on one store, some of which are killed.
#include <algorithm>
#include <chrono>
#include <csignal>
#include <random>
#include <set>
#include <string>

#include "NumberedWrites.h"
#include "tests/job/Rounds.h"

namespace {

class StoreProcesses : public StoreTest {};
ON_BOTH_ENGINES(StoreProcesses);

const std::string& textOf(const store::Value* value) {
    return std::get<store::Text>(*value).bytes->text;
}

} // namespace

TEST_P(StoreProcesses, TwoWritersLoseAndMixNothing) {
    const int tables = roundsOr(250);
    open()->create(3, 1);
    const auto write = [&](const std::string& name) {
        return startProcess([&] {
            const auto engine = open();
            for (int i = 0; i < tables; ++i) {
                const std::string number = std::to_string(i);
                const std::string records = "both[-2]='" + name + number + " " + name +
                                            "[-2]=" + number + " twin='" + name + number;
                if (send(*engine, 3, 1, records) != "taken 111") {
                    return 1;
                }
            }
            return 0;
        });
    };
    const pid_t writers[] = {write("a"), write("b")};

    // Meanwhile each moment that is seen is one between two tables.
    const auto engine = open();
    int count = 0;
    do {
        const auto content = engine->content(3, 1, store::KeyFilter());
        if (content->empty()) {
            continue;
        }
        const auto both = content->find("both");
        count = both->count();
        ASSERT_EQ(textOf(both->at(count - 1)), textOf(content->find("twin")->first()));
        int sum = 0;
        for (const char* name : {"a", "b"}) {
            const auto own = content->find(name);
            sum += own == nullptr ? 0 : own->count();
        }
        ASSERT_EQ(count, sum);
    } while (count < 2 * tables && waitpid(-1, nullptr, WNOHANG | WNOWAIT) >= 0);
    EXPECT_EQ(endOf(writers[0]), 0);
    EXPECT_EQ(endOf(writers[1]), 0);

    const auto both = engine->key(3, 1, "both");
    ASSERT_EQ(both->count(), 2 * tables);
    int next[2] = {0, 0};
    both->visit([&](int, const store::Value& value) {
        const std::string& text = textOf(&value);
        EXPECT_EQ(text.substr(1), std::to_string(next[text[0] - 'a']++));
        return true;
    });
}

TEST_P(StoreProcesses, WritersKilledAtAnyMomentLeaveWholeTablesAndFiles) {
    const int rounds = roundsOr(25);
    open()->create(3, 1);
    const NumberedWrites writes;
    const auto start = [&](int from, int end) {
        return startProcess([&, from, end] {
            writes.write(*open(), from, end);
            return 0;
        });
    };
    // A few whole writes, to know how long one takes here.
    const auto began = std::chrono::steady_clock::now();
    ASSERT_EQ(endOf(start(1, 4)), 0);
    const std::chrono::duration<double, std::micro> three =
        std::chrono::steady_clock::now() - began;
    const auto window = static_cast<unsigned>(std::clamp(three.count(), 20e3, 200e3));
    std::mt19937 random(5); // NOLINT: the same moments, as far as that goes
    int written = 3;
    for (int round = 0; round < rounds && !HasFailure(); ++round) {
        writes.done.started = 0;
        const pid_t child = start(written + 1, INT_MAX);
        if (round % 10 != 0) { // Else at times while it starts.
            writes.waitForStart(1);
        }
        usleep(random() % window);
        kill(child, SIGKILL);
        ASSERT_EQ(endOf(child), 1000 + SIGKILL);
        written = writes.expectWhole(*open());
    }
    EXPECT_GT(written, rounds / 4) << "the writers were killed before they wrote anything";
    writes.expectWholeVersions(*open());
    EXPECT_EQ(open()->files().size(), 1u);
}

TEST_P(StoreProcesses, ManyDeliveriesToOnePlaceKeepEachOther) {
    constexpr int writers = 4;
    constexpr int files = 10;
    pid_t children[writers];
    for (int writer = 0; writer < writers; ++writer) {
        children[writer] = startProcess([&] {
            const auto engine = open();
            for (int i = 0; i < files; ++i) {
                putFile(*engine, "a/b/file", std::to_string(writer * files + i));
            }
            return 0;
        });
    }
    for (const pid_t child : children) {
        EXPECT_EQ(endOf(child), 0);
    }
    const auto engine = open();
    const auto former = versions(*engine, "a/b/file");
    std::set<std::string> texts(former.begin(), former.end());
    texts.insert(file(*engine, "a/b/file"));
    EXPECT_EQ(texts.size(), std::size_t{writers * files}) << "a version was lost";
}
