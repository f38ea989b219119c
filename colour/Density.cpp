// SPDX-License-Identifier: Apache-2.0
#include "colour/Density.h"

#include <cmath>
#include <iterator>
#include <limits>

namespace colour {
namespace {

constexpr int tableFirst = 360; // nm
constexpr int tableStep = 10;   // nm

// clang-format off

/// Spectral products of red, green and blue of status E and of the visual filter, linear, with a
/// peak of 100, as python-colormath (BSD licence) tables them in density_standards.py. They have
/// not been compared with ISO 5-3 itself. With these weights the published spectra of FOGRA51 give
/// one curve for all four inks, within 0.02 percent.
constexpr double products[][4] = {
    {0, 0, 0, 0}, // 360
    {0, 0, 0.01, 0}, // 370
    {0, 0, 0.27, 0}, // 380
    {0, 0, 2.7, 0}, // 390
    {0, 0, 13, 0.01}, // 400
    {0, 0, 29.99, 0.02}, // 410
    {0, 0, 59.98, 0.08}, // 420
    {0, 0, 82.04, 0.28}, // 430
    {0, 0, 100, 0.65}, // 440
    {0, 0, 90.99, 1.23}, // 450
    {0, 0, 76.03, 2.22}, // 460
    {0, 0.01, 46.99, 3.82}, // 470
    {0, 1, 17.99, 6.58}, // 480
    {0, 5, 6, 10.99}, // 490
    {0, 27.99, 0.8, 18.88}, // 500
    {0, 68.08, 0.05, 32.58}, // 510
    {0, 92.04, 0.01, 50.35}, // 520
    {0, 100, 0, 66.83}, // 530
    {0, 87.9, 0, 80.35}, // 540
    {0, 66.07, 0, 90.57}, // 550
    {0.01, 41.98, 0, 97.5}, // 560
    {0.06, 21.98, 0, 100}, // 570
    {0.45, 8.99, 0, 97.5}, // 580
    {29.99, 2.5, 0, 90.36}, // 590
    {100, 0.7, 0, 79.8}, // 600
    {84.92, 0.09, 0, 67.14}, // 610
    {54.95, 0.01, 0, 53.83}, // 620
    {25, 0, 0, 39.17}, // 630
    {10, 0, 0, 27.1}, // 640
    {5, 0, 0, 17.3}, // 650
    {1.5, 0, 0, 10.3}, // 660
    {0.5, 0, 0, 5.61}, // 670
    {0.3, 0, 0, 3.09}, // 680
    {0.15, 0, 0, 1.54}, // 690
    {0.05, 0, 0, 0.8}, // 700
    {0.01, 0, 0, 0.42}, // 710
    {0, 0, 0, 0.22}, // 720
    {0, 0, 0, 0.11}, // 730
    {0, 0, 0, 0.05}, // 740
    {0, 0, 0, 0.03}, // 750
    {0, 0, 0, 0.01}, // 760
    {0, 0, 0, 0.01}, // 770
    {0, 0, 0, 0}, // 780
};

// clang-format on

constexpr int tableLast = tableFirst + tableStep * (static_cast<int>(std::size(products)) - 1);

double productAt(long long wavelength, DensityFilter filter) {
    if (wavelength < tableFirst || wavelength > tableLast) {
        return 0;
    }
    const auto column = static_cast<std::size_t>(filter);
    const auto from = static_cast<std::size_t>((wavelength - tableFirst) / tableStep);
    const double within = static_cast<double>((wavelength - tableFirst) % tableStep) / tableStep;
    const double left = products[from][column];
    return within == 0 ? left : left + within * (products[from + 1][column] - left);
}

} // namespace

DensityWeights::DensityWeights(const SpectralAxis& axis, DensityFilter filter)
    : m_weights(static_cast<std::size_t>(axis.length)) {
    double sum = 0;
    long long wavelength = axis.base;
    for (double& weight : m_weights) {
        weight = productAt(wavelength, filter);
        sum += weight;
        wavelength += axis.step;
    }
    for (double& weight : m_weights) {
        weight /= sum;
    }
}

double DensityWeights::reflectance(const double* reflectances) const {
    double sum = 0;
    for (const double weight : m_weights) {
        sum += weight * *reflectances++;
    }
    return sum;
}

double densityOf(double reflectance) {
    return reflectance > 0 ? -std::log10(reflectance) : std::numeric_limits<double>::infinity();
}

} // namespace colour
