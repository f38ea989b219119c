// SPDX-License-Identifier: Apache-2.0
// Filling a parameter list, against bare sets that receive the same keys and values.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <functional>
#include <limits>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "ticket/ParameterList.h"
#include "ticket/PartialMode.h"

namespace {

struct Times {
    double work = std::numeric_limits<double>::max(); ///< Seconds.
    double peer = std::numeric_limits<double>::max();
};

/// The fastest of several runs of each. They take turns, so that other load slows both.
Times fastest(const std::function<void()>& work, const std::function<void()>& peer) {
    const auto keepFastest = [](double& best, const std::function<void()>& run) {
        const auto start = std::chrono::steady_clock::now();
        run();
        const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
        best = std::min(best, taken.count());
    };
    Times times;
    for (int turn = 0; turn < 9; ++turn) {
        keepFastest(times.peer, peer);
        keepFastest(times.work, work);
    }
    return times;
}

/// Keeps a result from being optimised away.
volatile std::size_t g_sink;

/// Fills a list and creates its table. The bare loop only inserts the same data into two sets.
void fill(const char* name, const std::vector<std::string>& keys,
          const std::vector<double>& values) {
    const auto bareSets = [&] {
        std::set<std::string> keySet;
        std::set<double> valueSet;
        for (std::size_t i = 0; i < keys.size(); ++i) {
            keySet.insert(keys[i]);
            valueSet.insert(values[i]);
        }
        g_sink = keySet.size() + valueSet.size();
    };
    const auto list = [&] {
        SETMULTIPAR_LIST records(true);
        for (std::size_t i = 0; i < keys.size(); ++i) {
            records.ySetParameter(keys[i].c_str(), PARAM_DOUBLE, &values[i], static_cast<int>(i));
        }
        g_sink = records.Table(false) != nullptr ? records.Size() : 0;
    };
    const Times times = fastest(list, bareSets);
    std::printf("%-46s %7.1f ms, %.2f times the bare sets\n", name, times.work * 1e3,
                times.work / times.peer);
}

/// The time of one look-up should grow with the logarithm of the number of prefixes.
void filter() {
    constexpr int queries = 100'000;
    double first = 0;
    for (const int stored : {100, 10'000, 1'000'000}) {
        PARTIAL_MODE mode;
        for (int i = 0; i < stored; ++i) {
            mode.insert("Job/" + std::to_string(1'000'000 + i) + "*");
        }
        std::vector<std::string> keys;
        std::mt19937 random(7); // NOLINT: the same keys each time
        for (int i = 0; i < queries; ++i) {
            const int one = static_cast<int>(random() % static_cast<unsigned>(stored));
            keys.push_back("Job/" + std::to_string(1'000'000 + one) + "/Result");
        }
        std::set<std::string> exact;
        for (const std::string& prefix : mode.m_prefixes) {
            exact.insert(prefix + "/Result");
        }
        const auto count = [&](auto contains) {
            g_sink = static_cast<std::size_t>(std::count_if(keys.begin(), keys.end(), contains));
        };
        const Times times =
            fastest([&] { count([&](auto& key) { return mode.multi_contains(key); }); },
                    [&] { count([&](auto& key) { return exact.contains(key); }); });
        first = first == 0 ? times.work : first;
        std::printf(
            "look-up among %7d prefixes %18.0f ns, %.2f times an exact set, %.1f times 100\n",
            stored, times.work / queries * 1e9, times.work / times.peer, times.work / first);
    }
}

} // namespace

int main() {
    constexpr std::size_t count = 100'000;
    std::mt19937 random(1); // NOLINT: the same records each time
    std::vector<std::string> sorted;
    std::vector<std::string> single(count, "Job/Measurement/Spectral");
    std::vector<double> values;
    for (std::size_t i = 0; i < count; ++i) {
        sorted.push_back("Job/Measurement/" + std::to_string(1'000'000 + i));
        values.push_back(static_cast<double>(random()) / 7);
    }
    std::vector<std::string> shuffled = sorted;
    std::shuffle(shuffled.begin(), shuffled.end(), random);

    fill("100,000 keys in order, one value each", sorted, values);
    fill("100,000 keys in any order, one value each", shuffled, values);
    fill("100,000 values of one key", single, values);
    filter();
}
