// SPDX-License-Identifier: Apache-2.0
// Aims for another paper than the target's: correction for the substrate, and comparison relative
// to paper.
#pragma once

#include "analysis/Comparison.h"

namespace analysis {

/// A paper difference in CIEDE2000 above which a correction of the aims is outside its method.
inline constexpr double largestCorrected = 5;

/// Fills `papers`, and adjusts the Lab values of a comparison as `aims` asks.
///
/// Corrected (SCCA; CGATS TR 016, ISO 13655): each of X, Y, Z of the target becomes
/// X + (Xm - Xt) (X - Xmin) / (Xt - Xmin), so that its paper Xt becomes the measured paper Xm, and
/// the darkest colour stays. Xmin is that of the target's patch 100/100/100/100, wherever in the
/// target it is; without one, the smallest X, Y and Z of the target, each by itself. What the
/// standards take is not known to us; the choice moves a solid by less than 0.2.
///
/// Relative (as in ICC.1): X becomes X Xn / Xpaper on both sides, each by its own paper, so that
/// paper is 100, 0, 0.
///
/// Without a paper patch nothing is adjusted. Gives 0 or the code of a profile that can't be
/// evaluated. REQUIRES: patches and Lab values.
int adjustAims(PaperAims aims, Comparison& comparison);

} // namespace analysis
