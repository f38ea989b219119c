// SPDX-License-Identifier: Apache-2.0
#include "colour/ToneValue.h"

#include <algorithm>
#include <cmath>

namespace colour {
namespace {

constexpr double full = 100;
constexpr double shareOfZ = 0.55;

/// Every 10 percent from 0 on. A is that of FOGRA51's spectra by status E density, C that of the
/// black ramp of FOGRA52 by Y. B is confirmed only at 50 and 80, by the black ramp of
/// ISO15339-CRPC6; other sets that name this curve are up to 1 lower between these.
constexpr double increases[][11] = {
    {0, 6.1, 10.5, 13.5, 15.3, 16.0, 15.6, 14.0, 11.0, 6.5, 0},
    {0, 8.3, 13.9, 17.2, 18.8, 19.0, 17.9, 15.7, 12.1, 7.0, 0},
    {0, 10.6, 17.2, 20.9, 22.3, 22.0, 20.4, 17.4, 13.2, 7.5, 0},
};
constexpr double step = 10;
constexpr int lastPoint = 10;

/// The three coordinates of spot colour tone values.
struct Lightnesses {
    explicit Lightnesses(const Lab& lab)
        : y(lab.L), x(116 * ((lab.L + 16) / 116 + lab.a / 500) - 16),
          z(116 * ((lab.L + 16) / 116 - lab.b / 200) - 16) {}

    double squaredDistance(const Lightnesses& other) const {
        return (x - other.x) * (x - other.x) + (y - other.y) * (y - other.y) +
               (z - other.z) * (z - other.z);
    }

    double y;
    double x;
    double z;
};

} // namespace

std::optional<double> toneValue(double paper, double solid, double tint) {
    if (paper == solid) {
        return std::nullopt;
    }
    return full * (paper - tint) / (paper - solid);
}

double colorimetricReflectance(ProcessInk ink, const Xyz& xyz) {
    switch (ink) {
    case ProcessInk::Cyan:
        return xyz.X - shareOfZ * xyz.Z;
    case ProcessInk::Yellow:
        return xyz.Z;
    case ProcessInk::Magenta:
    case ProcessInk::Black:
        break;
    }
    return xyz.Y;
}

std::optional<double> spotToneValue(const Lab& paper, const Lab& solid, const Lab& tint) {
    const Lightnesses p(paper);
    const double range = Lightnesses(solid).squaredDistance(p);
    if (range == 0) {
        return std::nullopt;
    }
    return full * std::sqrt(Lightnesses(tint).squaredDistance(p) / range);
}

double toneIncrease(ToneCurve curve, double nominal) {
    if (!(nominal > 0 && nominal < full)) {
        return 0;
    }
    // A cubic through the four nearest points, in Lagrange's form.
    const double at = nominal / step;
    const int first = std::clamp(static_cast<int>(at) - 1, 0, lastPoint - 3);
    double increase = 0;
    for (int i = first; i < first + 4; ++i) {
        double part = increases[static_cast<int>(curve)][i];
        for (int j = first; j < first + 4; ++j) {
            part *= i == j ? 1 : (at - j) / (i - j);
        }
        increase += part;
    }
    return increase;
}

} // namespace colour
