// SPDX-License-Identifier: Apache-2.0
// The list is CMYK_ISO_12647-7_outer_gamut.ti1 of DisplayCAL (github.com/RomanHargrave/displaycal,
// DisplayCAL/ref, added 2017-08-29). The file states no edition of the standard. Its entries follow
// the rules below: paper, ramps of one ink, pairs of inks, and colours with black that have one
// full ink and at most one other.
#include "analysis/OuterGamut.h"

#include <algorithm>
#include <array>
#include <cstdint>

namespace analysis {
namespace {

constexpr int ramp[] = {3, 7, 10, 15, 20, 25, 30, 40, 50, 60, 70, 80, 90, 100};
constexpr int pairs[] = {10, 20, 40, 70, 100};

/// With this much black, one ink is 100 and a second ink has one of these values. -1 is padding.
constexpr struct {
    int black;
    int second[6];
} withBlack[] = {
    {20, {0, 10, 20, 40, 70, 100}}, {40, {0, 20, 40, 70, 100, -1}}, {60, {0, 20, 40, 70, 100, -1}},
    {70, {0, 100, -1, -1, -1, -1}}, {80, {0, 40, 70, 100, -1, -1}}, {100, {0, 100, -1, -1, -1, -1}},
};

constexpr std::uint32_t keyOf(int c, int m, int y, int k) {
    return static_cast<std::uint32_t>(c << 24 | m << 16 | y << 8 | k);
}

/// The key of a colour with x of ink `a`, y of ink `b` and k of black.
constexpr std::uint32_t keyOfPair(int a, int x, int b, int y, int k) {
    int inks[3] = {};
    inks[b] = y;
    inks[a] = x;
    return keyOf(inks[0], inks[1], inks[2], k);
}

struct List {
    std::array<std::uint32_t, outerGamutCount + 1> keys{};
    std::size_t count = 0;
    constexpr void add(std::uint32_t key) {
        if (count < keys.size()) {
            keys[count++] = key;
        }
    }
};

constexpr List listOfAll() {
    List list;
    list.add(keyOf(0, 0, 0, 0));
    for (int a = 0; a < 3; ++a) {
        for (const int x : ramp) {
            list.add(keyOfPair(a, x, (a + 1) % 3, 0, 0));
        }
        for (int b = a + 1; b < 3; ++b) {
            for (const int x : pairs) {
                for (const int y : pairs) {
                    list.add(keyOfPair(a, x, b, y, 0));
                }
            }
        }
        for (const auto& [black, second] : withBlack) {
            for (const int x : second) {
                for (int b = 0; b < 3; ++b) {
                    const bool once = x == 0 ? b == (a + 1) % 3 : x == 100 ? b > a : b != a;
                    if (x >= 0 && once) {
                        list.add(keyOfPair(a, 100, b, x, black));
                    }
                }
            }
        }
    }
    std::sort(list.keys.begin(), list.keys.begin() + list.count);
    return list;
}

constexpr List all = listOfAll();
static_assert(all.count == outerGamutCount);

constexpr std::array<bool, 101> isLevel = [] {
    std::array<bool, 101> is{};
    is[0] = true;
    for (const int level : ramp) {
        is[static_cast<std::size_t>(level)] = true;
    }
    return is;
}();

/// The ink level within 0.5 of a value, or -1. A value that ends with .5 is near two integers.
int levelOf(double value) {
    if (!(value >= -0.5 && value <= 100.5)) {
        return -1;
    }
    const int up = static_cast<int>(value + 0.5); // below 0 this gives 0 too
    if (up <= 100 && isLevel[static_cast<std::size_t>(up)]) {
        return up;
    }
    return up > 0 && up - value == 0.5 && isLevel[static_cast<std::size_t>(up - 1)] ? up - 1 : -1;
}

} // namespace

std::optional<std::size_t> outerGamutEntry(const double* cmyk) {
    int inks[4];
    for (int i = 0; i < 4; ++i) {
        inks[i] = levelOf(cmyk[i]);
        if (inks[i] < 0) {
            return std::nullopt;
        }
    }
    const std::uint32_t key = keyOf(inks[0], inks[1], inks[2], inks[3]);
    const auto end = all.keys.begin() + all.count;
    const auto found = std::lower_bound(all.keys.begin(), end, key);
    if (found == end || *found != key) {
        return std::nullopt;
    }
    return static_cast<std::size_t>(found - all.keys.begin());
}

} // namespace analysis
