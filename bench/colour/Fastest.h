// SPDX-License-Identifier: Apache-2.0
// The shortest time of a piece of work.
#pragma once

#include <algorithm>
#include <chrono>
#include <functional>
#include <limits>

namespace bench {

inline volatile double sink; ///< Keeps a result from being optimised away.

/// Milliseconds of the fastest of several runs.
inline double fastest(const std::function<double()>& work) {
    double best = std::numeric_limits<double>::max();
    for (int run = 0; run < 9; ++run) {
        const auto start = std::chrono::steady_clock::now();
        sink = work();
        const std::chrono::duration<double, std::milli> taken =
            std::chrono::steady_clock::now() - start;
        best = std::min(best, taken.count());
    }
    return best;
}

} // namespace bench
