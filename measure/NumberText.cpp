// SPDX-License-Identifier: Apache-2.0
// The values of instruments lie in a few powers of ten, where 128 bits hold all that rounding has
// to know. That takes less than half the time of the C++ library's conversion, which does all the
// others.
#include "measure/NumberText.h"

#include <algorithm>
#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <iterator>

namespace {

using Wide = unsigned __int128;

constexpr auto tenTo = [] {
    std::array<std::uint64_t, 12> powers = {1};
    for (std::size_t i = 1; i < powers.size(); ++i) {
        powers[i] = 10 * powers[i - 1];
    }
    return powers;
}();

/// Below and above these all is left to the library. Those below 1 are a little more than the
/// powers of ten as which they stand here, but no other double lies between the two.
constexpr double magnitudes[] = {1e-4, 1e-3, 1e-2, 1e-1, 1e0, 1e1, 1e2, 1e3, 1e4, 1e5};

/// `value` in units of the last one of so many decimals: the nearest, and of two the even one.
std::uint64_t rounded(double value, std::size_t decimals) {
    constexpr int fractionBits = 52;
    constexpr std::uint64_t leadingBit = std::uint64_t{1} << fractionBits;
    const auto bits = std::bit_cast<std::uint64_t>(value);
    // value is mantissa / 2^shift, with a shift of 36 to 66.
    const std::uint64_t mantissa = leadingBit | (bits & (leadingBit - 1));
    const int shift = 1023 + fractionBits - static_cast<int>(bits >> fractionBits);
    const Wide product = Wide{mantissa} * tenTo[decimals];
    const auto below = static_cast<std::uint64_t>(product >> shift);
    const Wide justUnderHalf = (Wide{1} << (shift - 1)) - 1;
    return static_cast<std::uint64_t>((product + justUnderHalf + (below & 1)) >> shift);
}

/// Without zeros at the end; so what was rounded up to a power of ten has no digit too many.
char* writeDecimals(char* at, std::uint64_t units, std::size_t decimals) {
    at = std::to_chars(at, at + longestNumberText, units / tenTo[decimals]).ptr;
    std::uint64_t fraction = units % tenTo[decimals];
    if (fraction == 0) {
        return at;
    }
    *at = '.';
    char* last = at + decimals;
    for (char* digit = last; digit != at; --digit) {
        *digit = static_cast<char>('0' + fraction % 10);
        fraction /= 10;
    }
    while (*last == '0') {
        --last;
    }
    return last + 1;
}

} // namespace

char* writeNumberText(char* at, double value, int digits) {
    const double size = std::abs(value);
    if (!(size >= magnitudes[0] && size < *std::prev(std::end(magnitudes)))) {
        return std::to_chars(at, at + longestNumberText, value, std::chars_format::general, digits)
            .ptr;
    }
    if (value < 0) {
        *at++ = '-';
    }
    const auto above = std::upper_bound(std::begin(magnitudes), std::end(magnitudes), size);
    const auto decimals = static_cast<std::size_t>(digits + 4 - (above - magnitudes));
    return writeDecimals(at, rounded(size, decimals), decimals);
}
