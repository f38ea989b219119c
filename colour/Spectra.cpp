// SPDX-License-Identifier: Apache-2.0
// XYZ from reflectances by ASTM E308: one weight per wavelength and coordinate.
//
// The weights are computed for the given axis by the method of ASTM E2022, the source of the
// printed tables for 10 and 20 nm: between its wavelengths a spectrum is a cubic through four
// neighbours (a parabola in the first and the last interval), integrated every nm against observer
// times illuminant. At 10 nm the result equals the printed figures to their last decimal.
#include "colour/Spectra.h"

#include <algorithm>
#include <array>

#include "colour/SpectralTables.h"

namespace colour {
namespace {

/// ASTM E308 has no tables coarser than 20 nm and requires at least 400 to 700 nm.
constexpr int coarsestStep = 20;
constexpr int latestStart = 400;
constexpr int earliestEnd = 700;
constexpr int longestAxis = 4096;

long long lastWavelength(const SpectralAxis& axis) {
    return axis.base + static_cast<long long>(axis.step) * (axis.length - 1);
}

/// Value of coefficient `which` of the polynomial through the integer points 0 to points - 1.
double lagrange(int points, int which, double at) {
    double value = 1;
    for (int other = 0; other < points; ++other) {
        if (other != which) {
            value *= (at - other) / (which - other);
        }
    }
    return value;
}

/// Composition of a value at `position` (in steps from point 0) from `count` points one step apart.
struct Interpolation {
    int first = 0;  ///< First of the points.
    int points = 0; ///< Number of coefficients.
    std::array<double, 4> coefficients{};
};

Interpolation interpolate(int count, int interval, double within) {
    Interpolation result;
    const bool atEnd = interval == 0 || interval == count - 2;
    result.points = atEnd ? 3 : 4;
    result.first = interval == 0 ? 0 : interval - 1;
    for (int i = 0; i < result.points; ++i) {
        result.coefficients[i] = lagrange(result.points, i, interval - result.first + within);
    }
    return result;
}

/// D50 at an integer nm: a cubic through the 5 nm table, as in ASTM E308. (Linear interpolation,
/// which the CIE specifies for other uses, changes Z of a dark blue by a hundredth.)
double illuminantAt(int wavelength) {
    const int offset = wavelength - illuminantFirst;
    const int interval = std::min(offset / illuminantStep, illuminantLength - 2);
    const double within = static_cast<double>(offset) / illuminantStep - interval;
    const Interpolation parts = interpolate(illuminantLength, interval, within);
    double power = 0;
    for (int i = 0; i < parts.points; ++i) {
        power += parts.coefficients[i] * illuminantD50[parts.first + i];
    }
    return power;
}

/// Observer times D50 for every nm of the observer; the sum over Y is 100.
std::array<Xyz, observerLength> observedLight() {
    std::array<Xyz, observerLength> light;
    double sum = 0;
    for (int i = 0; i < observerLength; ++i) {
        const double power = illuminantAt(observerFirst + i);
        const Xyz& observer = observer1931[i];
        light[i] = {power * observer.X, power * observer.Y, power * observer.Z};
        sum += light[i].Y;
    }
    for (Xyz& value : light) {
        value = {100 * value.X / sum, 100 * value.Y / sum, 100 * value.Z / sum};
    }
    return light;
}

} // namespace

bool spectraUsable(const SpectralAxis& axis) {
    return axis.step >= 1 && axis.step <= coarsestStep && axis.length >= 1 &&
           axis.length <= longestAxis && axis.base >= 0 && axis.base <= latestStart &&
           lastWavelength(axis) >= earliestEnd;
}

SpectralWeights::SpectralWeights(const SpectralAxis& axis) : m_weights(axis.length) {
    // The axis's own wavelengths, extended or cut to just cover the observer. Weights of unmeasured
    // wavelengths are added to the nearest measured one (ASTM E308, 7.3.2.2).
    const int step = axis.step;
    const auto cover = [&](int wavelength) { return (wavelength - axis.base) / step; };
    const int first =
        cover(observerFirst) - (axis.base + cover(observerFirst) * step > observerFirst);
    const int last = cover(observerLast) + (axis.base + cover(observerLast) * step < observerLast);
    const int count = last - first + 1;

    const std::array<Xyz, observerLength> light = observedLight();
    for (int i = 0; i < observerLength; ++i) {
        const int offset = observerFirst + i - (axis.base + first * step);
        const int interval = std::min(offset / step, count - 2);
        const double within = static_cast<double>(offset) / step - interval;
        const Interpolation parts = interpolate(count, interval, within);
        for (int k = 0; k < parts.points; ++k) {
            const int point = std::clamp(first + parts.first + k, 0, axis.length - 1);
            m_weights[point].X += parts.coefficients[k] * light[i].X;
            m_weights[point].Y += parts.coefficients[k] * light[i].Y;
            m_weights[point].Z += parts.coefficients[k] * light[i].Z;
        }
    }
}

Xyz SpectralWeights::xyz(const double* reflectances) const {
    Xyz sum;
    for (const Xyz& weight : m_weights) {
        sum.X += weight.X * *reflectances;
        sum.Y += weight.Y * *reflectances;
        sum.Z += weight.Z * *reflectances;
        ++reflectances;
    }
    return sum;
}

} // namespace colour
