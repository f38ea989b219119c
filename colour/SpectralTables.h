// SPDX-License-Identifier: Apache-2.0
// CIE data from which XYZ is computed.
#pragma once

#include "colour/DataSet.h"

namespace colour {

inline constexpr int observerFirst = 360; ///< nm
inline constexpr int observerLast = 830;  ///< nm
inline constexpr int observerLength = observerLast - observerFirst + 1;

/// Colour-matching functions of the CIE 1931 observer (2 degrees), every nm from observerFirst.
extern const Xyz observer1931[observerLength];

inline constexpr int illuminantFirst = 300; ///< nm
inline constexpr int illuminantStep = 5;    ///< nm
inline constexpr int illuminantLength = 107;

/// Relative power of illuminant D50, 100 at 560 nm.
extern const double illuminantD50[illuminantLength];

} // namespace colour
