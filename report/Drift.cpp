// SPDX-License-Identifier: Apache-2.0
#include "report/Drift.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace report {
namespace {

constexpr double limits = 3; ///< In standard errors.

/// Identical figures have no scatter. Then any visible change is significant.
constexpr double leastScatter = 1e-3;

std::vector<double> finite(const std::vector<double>& values) {
    std::vector<double> kept;
    std::copy_if(values.begin(), values.end(), std::back_inserter(kept),
                 [](double value) { return std::isfinite(value); });
    return kept;
}

} // namespace

std::vector<double> movingAverage(const std::vector<double>& values, double start, double weight) {
    std::vector<double> averages;
    averages.reserve(values.size());
    double average = start;
    for (const double value : values) {
        if (std::isfinite(value)) {
            average = weight * value + (1 - weight) * average;
        }
        averages.push_back(average);
    }
    return averages;
}

double scatterOf(const std::vector<double>& values) {
    constexpr double rangeToDeviation = 0.954;
    const std::vector<double> known = finite(values);
    if (known.size() < 2) {
        return 0;
    }
    std::vector<double> ranges;
    for (std::size_t i = 1; i < known.size(); ++i) {
        ranges.push_back(std::abs(known[i] - known[i - 1]));
    }
    const auto upper = ranges.begin() + static_cast<std::ptrdiff_t>(ranges.size() / 2);
    std::nth_element(ranges.begin(), upper, ranges.end());
    double median = *upper;
    if (ranges.size() % 2 == 0) {
        median = (median + *std::max_element(ranges.begin(), upper)) / 2;
    }
    return median / rangeToDeviation;
}

std::size_t beginningOf(std::size_t count) {
    return std::min(count, std::clamp<std::size_t>(count / 4, 5, 20));
}

Drift driftOf(const std::vector<double>& values) {
    const std::vector<double> known = finite(values);
    Drift drift;
    if (known.empty()) {
        drift.began = std::numeric_limits<double>::quiet_NaN();
        return drift;
    }
    const std::size_t first = beginningOf(known.size());
    for (std::size_t i = 0; i < first; ++i) {
        drift.began += known[i] / static_cast<double>(first);
    }
    drift.averages = movingAverage(values, drift.began, driftWeight);
    drift.shift = drift.averages.back() - drift.began;
    const double scatter = std::max(scatterOf(known), leastScatter);
    const double error =
        scatter * std::sqrt(driftWeight / (2 - driftWeight) + 1 / static_cast<double>(first));
    drift.significant = known.size() >= fewestForDrift && std::abs(drift.shift) > limits * error;
    return drift;
}

} // namespace report
