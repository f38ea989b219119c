// SPDX-License-Identifier: Apache-2.0
// Shared by the benchmarks of stores.
//
// The two sides of a ratio take turns, and each counts with its best time, so that other load slows
// both.
#pragma once

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <functional>
#include <limits>
#include <random>
#include <vector>

#include "Timing.h"

namespace bench {

constexpr int elements = 58'212; // 1,617 patches of 36 spectral samples.
constexpr int jobs = 10'000;
constexpr const char* arrayKey = "Remote/Measurement/Spectral";
constexpr const char* overviewKeys[] = {"Input/SubType", "Job/Display/Status",
                                        "Remote/ShowInVerifier", "Input/FileType",
                                        "Workflow/Verify/Active"};

/// `before` is not timed.
inline void compare(const char* name, double limit, int rounds, const std::function<void()>& before,
                    const std::function<void()>& ours, const std::function<void()>& bare) {
    double best = std::numeric_limits<double>::max();
    double bareBest = best;
    for (int round = 0; round < rounds; ++round) {
        before();
        best = std::min(best, secondsOf(ours));
        before();
        bareBest = std::min(bareBest, secondsOf(bare));
    }
    std::printf("%-48s %7.2f ms, %.2f times the bare %.2f ms (at most %g)\n", name, best * 1e3,
                best / bareBest, bareBest * 1e3, limit);
}

/// Reflectances, like measured ones: all different, in random order.
inline std::vector<double> measuredValues(std::size_t count) {
    std::mt19937 random(3); // NOLINT: the same each time
    std::vector<double> values(count);
    for (double& value : values) {
        value = std::uniform_real_distribution<double>(0, 1)(random);
    }
    return values;
}

/// Keeps a result from being optimised away.
inline volatile double g_sink;

struct Call {
    const double* values;
    std::size_t count;
};

/// The minimum work of a slot: check type, id and key.
inline int bareGet(const Call* call, int type, int id, const char* key, int position, double* out) {
    if (type != 3 || id != 1 || std::strcmp(key, arrayKey) != 0 ||
        static_cast<std::size_t>(position) >= call->count) {
        return 0;
    }
    *out = call->values[position];
    return 1;
}

using BareSlot = int (*)(const Call*, int, int, const char*, int, double*);
inline volatile BareSlot g_slot = bareGet; // Loaded at each call, like a slot of a table.

/// Reads an array with a loop of calls, without anything else.
inline void readBare(const std::vector<double>& values) {
    const Call call = {values.data(), values.size()};
    double sum = 0;
    for (std::size_t i = 0; i < values.size(); ++i) {
        double value = 0;
        g_slot(&call, 3, 1, arrayKey, static_cast<int>(i), &value);
        sum += value;
    }
    g_sink = sum;
}

} // namespace bench
