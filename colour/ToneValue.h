// SPDX-License-Identifier: Apache-2.0
// How much of the paper an ink seems to cover: tone values in percent, 0 for paper, 100 for the
// solid. Each function gives nothing if paper and solid are alike.
#pragma once

#include <optional>

#include "colour/DataSet.h"

namespace colour {

enum class ProcessInk { Cyan, Magenta, Yellow, Black };

/// Murray and Davies, by what comes back through the ink's filter: (Rp - Rt) / (Rp - Rs), which is
/// (1 - 10^-(Dt - Dp)) / (1 - 10^-(Ds - Dp)).
std::optional<double> toneValue(double paper, double solid, double tint);

/// Replaces the reflectance through the ink's filter if only colours are known: X - 0.55 Z for
/// cyan, Y for magenta and black, Z for yellow (the practice of ISO/TS 10128). Tone values of these
/// differ from those of densities by up to 0.8.
double colorimetricReflectance(ProcessInk ink, const Xyz& xyz);

/// Spot colour tone value of ISO 20654: the distance of the tint from the paper as a share of that
/// of the solid, in 116 f(X / Xn) - 16 and the same of Y and Z. Of a print with linear tone values
/// it is the nominal tint.
std::optional<double> spotToneValue(const Lab& paper, const Lab& solid, const Lab& tint);

/// Curves of ISO 12647-2:2013.
enum class ToneCurve { A, B, C };

/// Tone value increase in percent of a curve at a nominal tint of 0 to 100. It is 0 at the ends.
double toneIncrease(ToneCurve curve, double nominal);

} // namespace colour
