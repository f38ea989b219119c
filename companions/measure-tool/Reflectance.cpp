// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Reflectance.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "colour/Spectra.h"

namespace measuretool {
namespace {

constexpr int mostSteps = 200;
constexpr double shortestStep = 1e-6;
constexpr double exactEnough = 1e-12;
constexpr double darkest = 1e-6; ///< Black below this XYZ value, on a scale of 100.

/// Solves a linear system in place by Gaussian elimination; false if it is singular.
template<class Matrix, class Vector>
bool solveLinear(Matrix& matrix, Vector& right) {
    const std::size_t size = right.size();
    for (std::size_t column = 0; column < size; ++column) {
        std::size_t pivot = column;
        for (std::size_t row = column + 1; row < size; ++row) {
            if (std::abs(matrix[row][column]) > std::abs(matrix[pivot][column])) {
                pivot = row;
            }
        }
        if (!(std::abs(matrix[pivot][column]) > 1e-300)) {
            return false;
        }
        std::swap(matrix[pivot], matrix[column]);
        std::swap(right[pivot], right[column]);
        for (std::size_t row = column + 1; row < size; ++row) {
            const double factor = matrix[row][column] / matrix[column][column];
            if (factor == 0) {
                continue;
            }
            for (std::size_t i = column; i < size; ++i) {
                matrix[row][i] -= factor * matrix[column][i];
            }
            right[row] -= factor * right[column];
        }
    }
    for (std::size_t row = size; row-- > 0;) {
        for (std::size_t i = row + 1; i < size; ++i) {
            right[row] -= matrix[row][i] * right[i];
        }
        right[row] /= matrix[row][row];
    }
    return true;
}

double reflectanceOf(double z, double most) {
    return most * (std::tanh(z) + 1) / 2;
}

} // namespace

ReflectanceMaker::ReflectanceMaker() {
    const colour::SpectralWeights weights(axis);
    for (std::size_t i = 0; i < length; ++i) {
        std::array<double, length> line{};
        line[i] = 1;
        const colour::Xyz xyz = weights.xyz(line.data());
        m_weights[i] = {xyz.X / 100, xyz.Y / 100, xyz.Z / 100};
    }
}

/// The unknowns are z, one for each wavelength, with reflectance = most (tanh z + 1) / 2, and three
/// multipliers. The residuals are the derivative of the sum of squared steps of z plus the
/// multipliers times the errors of X, Y and Z, and these errors. Returns the largest residual.
double ReflectanceMaker::residual(const std::array<double, 3>& target, double most,
                                  const Vector& at, Vector& value, Matrix* slope) const {
    value.fill(0);
    if (slope != nullptr) {
        for (Vector& row : *slope) {
            row.fill(0);
        }
    }
    for (std::size_t k = 0; k < 3; ++k) {
        value[length + k] = -target[k];
    }
    for (std::size_t i = 0; i < length; ++i) {
        const double tanh = std::tanh(at[i]);
        const double first = most * (1 - tanh * tanh) / 2; // derivatives of the reflectance
        const double second = -2 * tanh * first;
        double pull = 0;
        for (std::size_t k = 0; k < 3; ++k) {
            pull += m_weights[i][k] * at[length + k];
        }
        value[i] = first * pull;
        for (const std::size_t other : {i - 1, i + 1}) {
            if (other < length) {
                value[i] += at[i] - at[other];
            }
        }
        for (std::size_t k = 0; k < 3; ++k) {
            value[length + k] += m_weights[i][k] * reflectanceOf(at[i], most);
        }
        if (slope == nullptr) {
            continue;
        }
        (*slope)[i][i] = second * pull;
        for (const std::size_t other : {i - 1, i + 1}) {
            if (other < length) {
                (*slope)[i][i] += 1;
                (*slope)[i][other] = -1;
            }
        }
        for (std::size_t k = 0; k < 3; ++k) {
            (*slope)[i][length + k] = (*slope)[length + k][i] = first * m_weights[i][k];
        }
    }
    double largest = 0;
    for (const double part : value) {
        largest = std::max(largest, std::abs(part));
    }
    return largest;
}

/// Newton's method. A full step can diverge for saturated and dark colours, so it is halved until
/// it improves the result.
bool ReflectanceMaker::solve(const std::array<double, 3>& target, double most,
                             Vector& solution) const {
    // Starts from a flat spectrum of the right luminance.
    const double grey = std::clamp(target[1] / most, 1e-6, 1 - 1e-6);
    solution.fill(0);
    std::fill_n(solution.begin(), length, std::atanh(2 * grey - 1));
    Vector value;
    Matrix slope;
    for (int step = 0; step < mostSteps; ++step) {
        const double error = residual(target, most, solution, value, &slope);
        if (error < exactEnough) {
            return true;
        }
        if (!std::isfinite(error) || !solveLinear(slope, value)) {
            return false;
        }
        Vector next;
        Vector there;
        double part = 1;
        do {
            if (part < shortestStep) {
                return false;
            }
            for (std::size_t i = 0; i < unknowns; ++i) {
                next[i] = solution[i] - part * value[i];
            }
            part /= 2;
        } while (!(residual(target, most, next, there, nullptr) < error));
        solution = next;
    }
    return false;
}

bool ReflectanceMaker::make(const colour::Xyz& xyz, std::vector<double>& reflectance) const {
    const std::array<double, 3> target{xyz.X / 100, xyz.Y / 100, xyz.Z / 100};
    if (std::max({std::abs(xyz.X), std::abs(xyz.Y), std::abs(xyz.Z)}) < darkest) {
        reflectance.assign(length, 0); // a value that tanh never reaches
        return true;
    }
    Vector solution;
    for (const double most : {1.0, 1.5}) {
        if (!solve(target, most, solution)) {
            continue;
        }
        reflectance.resize(length);
        for (std::size_t i = 0; i < length; ++i) {
            reflectance[i] = std::round(reflectanceOf(solution[i], most) * 1e8) / 1e8;
        }
        return true;
    }
    return false;
}

} // namespace measuretool
