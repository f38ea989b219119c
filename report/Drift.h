// SPDX-License-Identifier: Apache-2.0
// Whether a row of figures still stands where it began.
#pragma once

#include <cstddef>
#include <vector>

namespace report {

/// Exponentially weighted moving average: the first is weight * x + (1 - weight) * start. A value
/// that is no number leaves the average where it is.
std::vector<double> movingAverage(const std::vector<double>& values, double start, double weight);

/// The scatter from one value to the next, as a standard deviation: the median of the moving ranges
/// over 0.954 (ISO 7870-2). A slow drift or a single step does not widen it. 0 for fewer than two.
double scatterOf(const std::vector<double>& values);

/// One axis of a colour, or any other figure, over time.
struct Drift {
    double began = 0;             ///< Mean of the first ones; NaN for no values.
    double shift = 0;             ///< Latest average less `began`.
    bool significant = false;     ///< Beyond what the scatter explains.
    std::vector<double> averages; ///< One a value, from the begin on.
};

/// Values in the order of time, NaN where there is none.
///
/// The chart is the EWMA chart of ISO 7870-6 with weight 0.2 and limits of three standard errors:
/// here the average's own, scatter / 3, and that of the beginning, scatter / sqrt(first).
Drift driftOf(const std::vector<double>& values);

inline constexpr double driftWeight = 0.2;
/// How many values make the beginning: a quarter of them, 5 to 20.
std::size_t beginningOf(std::size_t count);
/// With fewer values nothing is said.
inline constexpr std::size_t fewestForDrift = 10;
/// A shift below this, in CIELAB units, is too small to see and within what instruments differ by.
inline constexpr double smallestDrift = 0.5;

} // namespace report
