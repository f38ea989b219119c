// SPDX-License-Identifier: Apache-2.0
// Converts reflectances to XYZ.
#pragma once

#include <vector>

#include "colour/DataSet.h"

namespace colour {

/// True if spectra on this axis can be converted to XYZ: steps of 1 to 20 nm covering at least 400
/// to 700 nm, the limits of ASTM E308.
bool spectraUsable(const SpectralAxis& axis);

/// Weights of one axis, computed once and used for every patch (D50, CIE 1931 2 degree observer;
/// ASTM E308). The perfect diffuser gives 96.422, 100, 82.521.
class SpectralWeights {
  public:
    /// REQUIRES: spectraUsable(axis).
    explicit SpectralWeights(const SpectralAxis& axis);

    /// XYZ, 0 to 100, of axis.length reflectances of 0 to 1.
    Xyz xyz(const double* reflectances) const;

  private:
    std::vector<Xyz> m_weights; ///< One per wavelength of the axis.
};

} // namespace colour
