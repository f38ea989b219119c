// SPDX-License-Identifier: Apache-2.0
// What the benchmarks of stores share.
//
// The two sides of a ratio run by turns, each at its best of several, so that a machine that is
// busy with something else slows both.
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

/// Before is not timed.
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

/// Reflectances, as measured: no two alike, in no order.
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

/// What a slot has to do at the least: tell by type, id and key whether this is the one.
inline int bareGet(const Call* call, int type, int id, const char* key, int position, double* out) {
    if (type != 3 || id != 1 || std::strcmp(key, arrayKey) != 0 ||
        static_cast<std::size_t>(position) >= call->count) {
        return 0;
    }
    *out = call->values[position];
    return 1;
}

using BareSlot = int (*)(const Call*, int, int, const char*, int, double*);
inline volatile BareSlot g_slot = bareGet; // Asked for at each call, as a slot of a table is.

/// Reads an array as the loop of calls does, without anything behind it.
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
