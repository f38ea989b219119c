// SPDX-License-Identifier: Apache-2.0
// Computes a reflectance for given XYZ values.
#pragma once

#include <array>
#include <vector>

#include "colour/DataSet.h"

namespace measuretool {

/// Many reflectances have the same XYZ. This computes the smoothest one between 0 and 1: "least
/// hyperbolic tangent slope squared", Scott A. Burns, "Numerical methods for smoothest reflectance
/// reconstruction", Color Research and Application 45 (2020).
class ReflectanceMaker {
  public:
    static constexpr colour::SpectralAxis axis{380, 10, 36};

    ReflectanceMaker();

    /// Computes a reflectance with this XYZ under D50 for the 2 degree observer, to eight decimals.
    /// Papers with brighteners may reflect more light than they receive, so it tries a maximum of
    /// up to 1.5 if 1 fails. Returns false and leaves the reflectance unchanged if there is none.
    bool make(const colour::Xyz& xyz, std::vector<double>& reflectance) const;

  private:
    static constexpr std::size_t length = 36;
    static constexpr std::size_t unknowns =
        length + 3; ///< Plus one multiplier each for X, Y and Z.

    using Vector = std::array<double, unknowns>;
    using Matrix = std::array<Vector, unknowns>;

    bool solve(const std::array<double, 3>& target, double most, Vector& solution) const;
    double residual(const std::array<double, 3>& target, double most, const Vector& at,
                    Vector& value, Matrix* slope) const;

    std::array<std::array<double, 3>, length>
        m_weights; ///< XYZ of each wavelength's light, 0 to 1.
};

} // namespace measuretool
