// SPDX-License-Identifier: Apache-2.0
// Colour differences, with the names and notation of the literature.
#pragma once

#include "colour/DataSet.h"

namespace colour {

/// Numbered like measurementDataRecord::deltaEType; any other number means Cie76.
enum class Formula {
    Cie76 = 0,
    Cmc11 = 2,
    Cie94 = 3,
    Ciede2000 = 4,
    Cmc21 = 5,
};

/// The formula of a deltaEType or deltaEMode.
Formula formulaFromNumber(int number);

/// "CIE76", "CIECMC", "CIE94", "CIE2000", "CIECMC_2_1".
const char* formulaName(Formula formula);

/// Difference of measured from target. CIE94 and CMC are not symmetric: the target is the
/// reference.
double difference(Formula formula, const Lab& target, const Lab& measured);

/// ISO/CIE 11664-4.
double deltaE76(const Lab& target, const Lab& measured);
/// CIE 116-1995 with kL = 1, K1 = 0.045, K2 = 0.015 (graphic arts).
double deltaE94(const Lab& target, const Lab& measured);
/// ISO/CIE 11664-6 with all factors 1.
double deltaE2000(const Lab& target, const Lab& measured);
/// BS 6923, with the weights l:c; 2:1 for acceptability, 1:1 for perceptibility.
double deltaECmc(const Lab& target, const Lab& measured, double lightness, double chroma);

/// CIELAB hue difference delta H*ab, as a magnitude: sqrt(dE^2 - dL^2 - dC^2).
double deltaH(const Lab& target, const Lab& measured);

/// Chromaticness difference delta Ch of greys: sqrt(da^2 + db^2).
double deltaCh(const Lab& target, const Lab& measured);

/// Both for the white of the ICC profile connection space, 96.42, 100, 82.49.
Lab labFromXyz(const Xyz& xyz);
Xyz xyzFromLab(const Lab& lab);

} // namespace colour
