// Filling a parameter list, against bare sets that take the same keys and values.
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

/// Seconds of the fastest of several runs.
double fastest(const std::function<void()>& work) {
    double best = std::numeric_limits<double>::max();
    for (int run = 0; run < 7; ++run) {
        const auto start = std::chrono::steady_clock::now();
        work();
        const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
        best = std::min(best, taken.count());
    }
    return best;
}

/// Keeps a result from being optimised away.
volatile std::size_t g_sink;

/// Fills a list and makes its table; the bare loop inserts the same into two sets and no more.
void fill(const char* name, const std::vector<std::string>& keys,
          const std::vector<double>& values) {
    const double bare = fastest([&] {
        std::set<std::string> keySet;
        std::set<double> valueSet;
        for (std::size_t i = 0; i < keys.size(); ++i) {
            keySet.insert(keys[i]);
            valueSet.insert(values[i]);
        }
        g_sink = keySet.size() + valueSet.size();
    });
    const double list = fastest([&] {
        SETMULTIPAR_LIST records(true);
        for (std::size_t i = 0; i < keys.size(); ++i) {
            records.ySetParameter(keys[i].c_str(), PARAM_DOUBLE, &values[i], static_cast<int>(i));
        }
        g_sink = records.Table(false) != nullptr ? records.Size() : 0;
    });
    std::printf("%-46s %7.1f ms, %.2f times the bare sets\n", name, list * 1e3, list / bare);
}

/// The time of one look-up should grow with the logarithm of the number of prefixes.
void filter() {
    constexpr int queries = 100'000;
    double first = 0;
    for (const int count : {100, 10'000, 1'000'000}) {
        PARTIAL_MODE mode;
        for (int i = 0; i < count; ++i) {
            mode.insert("Job/" + std::to_string(1'000'000 + i) + "*");
        }
        std::vector<std::string> keys;
        std::mt19937 random(7); // NOLINT: the same keys each time
        for (int i = 0; i < queries; ++i) {
            const int stored = static_cast<int>(random() % static_cast<unsigned>(count));
            keys.push_back("Job/" + std::to_string(1'000'000 + stored) + "/Result");
        }
        const double taken = fastest([&] {
            std::size_t found = 0;
            for (const std::string& key : keys) {
                found += mode.multi_contains(key) ? 1 : 0;
            }
            g_sink = found;
        });
        const std::set<std::string> peer = [&] {
            std::set<std::string> exact;
            for (const std::string& prefix : mode.m_prefixes) {
                exact.insert(prefix + "/Result");
            }
            return exact;
        }();
        const double bare = fastest([&] {
            std::size_t found = 0;
            for (const std::string& key : keys) {
                found += peer.contains(key) ? 1 : 0;
            }
            g_sink = found;
        });
        first = first == 0 ? taken : first;
        std::printf(
            "look-up among %7d prefixes %18.0f ns, %.2f times an exact set, %.1f times 100\n",
            count, taken / queries * 1e9, taken / bare, taken / first);
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
