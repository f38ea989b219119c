// SPDX-License-Identifier: Apache-2.0
// Detects whether a series of figures has moved from its beginning.
#pragma once

#include <cstddef>
#include <vector>

namespace report {

/// Exponentially weighted moving average: the first is weight * x + (1 - weight) * start. NaN
/// leaves the average unchanged.
std::vector<double> movingAverage(const std::vector<double>& values, double start, double weight);

/// The scatter from one value to the next as a standard deviation: the median of the moving ranges
/// over 0.954 (ISO 7870-2). Slow drifts and single steps don't increase it. 0 for fewer than two.
double scatterOf(const std::vector<double>& values);

/// One axis of a colour, or any other figure, over time.
struct Drift {
    double began = 0;             ///< Mean of the first values; NaN without values.
    double shift = 0;             ///< Latest average minus `began`.
    bool significant = false;     ///< More than the scatter explains.
    std::vector<double> averages; ///< One per value, from the first on.
};

/// Values in order of time, NaN if missing.
///
/// This is the EWMA chart of ISO 7870-6 with weight 0.2 and limits of three standard errors: those
/// of the average, scatter / 3, and of the beginning, scatter / sqrt(first).
Drift driftOf(const std::vector<double>& values);

inline constexpr double driftWeight = 0.2;
/// Number of values in the beginning: a quarter of them, 5 to 20.
std::size_t beginningOf(std::size_t count);
/// With fewer values there is no result.
inline constexpr std::size_t fewestForDrift = 10;
/// A smaller shift, in CIELAB units, is invisible and within the differences between instruments.
inline constexpr double smallestDrift = 0.5;

} // namespace report
