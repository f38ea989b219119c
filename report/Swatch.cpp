// SPDX-License-Identifier: Apache-2.0
#include "report/Swatch.h"

#include <algorithm>
#include <cmath>

namespace report {
namespace {

constexpr double white[3] = {0.9642, 1.0, 0.8249};

constexpr double toLinear[3][3] = {{3.1338561, -1.6168667, -0.4906146},
                                   {-0.9787684, 1.9161415, 0.0334540},
                                   {0.0719453, -0.2289914, 1.4052427}};

// Inverse of CIELAB's function of ratios.
double ratio(double f) {
    constexpr double knee = 6.0 / 29;
    return f > knee ? f * f * f : 3 * knee * knee * (f - 4.0 / 29);
}

double encoded(double linear) {
    return linear <= 0.0031308 ? 12.92 * linear : 1.055 * std::pow(linear, 1 / 2.4) - 0.055;
}

} // namespace

Swatch swatch(const colour::Lab& lab) {
    if (!std::isfinite(lab.L) || !std::isfinite(lab.a) || !std::isfinite(lab.b)) {
        return {0, 0, 0, true};
    }
    // Far outside the colours of any print; beyond this the cubes could overflow.
    const auto bounded = [](double value) { return std::clamp(value, -1000.0, 1000.0); };
    const double y = (bounded(lab.L) + 16) / 116;
    const double xyz[3] = {white[0] * ratio(y + bounded(lab.a) / 500), white[1] * ratio(y),
                           white[2] * ratio(y - bounded(lab.b) / 200)};
    Swatch result;
    std::uint8_t* const channels[3] = {&result.red, &result.green, &result.blue};
    for (int i = 0; i < 3; ++i) {
        const double linear =
            toLinear[i][0] * xyz[0] + toLinear[i][1] * xyz[1] + toLinear[i][2] * xyz[2];
        const double value = 255 * encoded(linear);
        result.clipped = result.clipped || !(value > -0.5 && value < 255.5);
        *channels[i] = static_cast<std::uint8_t>(std::lround(std::clamp(value, 0.0, 255.0)));
    }
    return result;
}

} // namespace report
