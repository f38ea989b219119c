// SPDX-License-Identifier: Apache-2.0
// Reflection densities from spectra.
#pragma once

#include <vector>

#include "colour/DataSet.h"

namespace colour {

/// What a densitometer looks through: red, green and blue of ISO status E, and the visual filter.
enum class DensityFilter { Red, Green, Blue, Visual };

/// Weights of one axis and filter, made once and used for every patch.
///
/// Density is -log10(sum(R w) / sum(w)), with the spectral products of status E as w. The products
/// are tabled every 10 nm; on another axis they are interpolated in a straight line. For the curves
/// of ISO 12647-2:2013 the spectra have to be those of M1, without a polarising filter.
class DensityWeights {
  public:
    /// REQUIRES: spectraUsable(axis).
    DensityWeights(const SpectralAxis& axis, DensityFilter filter);

    /// The share of the light that comes back: 10 to the power of minus the density. A reflectance
    /// of 1 at each wavelength gives 1. Means of readings are taken of this, never of densities.
    double reflectance(const double* reflectances) const;

  private:
    std::vector<double> m_weights; ///< One for each wavelength of the axis; their sum is 1.
};

/// -log10 of a reflectance; infinite if it is 0 or below.
double densityOf(double reflectance);

} // namespace colour
