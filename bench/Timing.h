// SPDX-License-Identifier: Apache-2.0
// Shared by all benchmarks.
#pragma once

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>

#include <malloc.h>

namespace bench {

inline double secondsOf(const std::function<void()>& work) {
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

/// Exits if the work failed: its time would mean nothing.
inline void check(bool done, const char* what) {
    if (!done) {
        std::fprintf(stderr, "%s failed\n", what);
        std::exit(1);
    }
}

/// Keeps freed memory for reuse, as the program itself does.
inline void keepFreedMemory() {
    constexpr int piece = 32 << 20;
    mallopt(M_MMAP_THRESHOLD, piece);
    mallopt(M_TRIM_THRESHOLD, piece);
    mallopt(M_TOP_PAD, piece / 4);
}

} // namespace bench
