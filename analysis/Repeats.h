// SPDX-License-Identifier: Apache-2.0
// Patches that were measured more than once.
#pragma once

#include "analysis/Comparison.h"

namespace analysis {

/// Fills groupOf and spread of a comparison that has its patches and their Lab values.
///
/// Patches with equal device values are one group. If no file has device values, the patches of one
/// row of the selection are. A row of the measurement that is compared with several rows of the
/// target is one reading. Values of a profile are calculated, so they are not readings.
void findRepeats(Comparison& comparison);

/// Makes one patch of each group, in the order of their first patches: the means of its measured
/// and of its target values, taken in XYZ over different rows. Labels and device values are those
/// of the first patch. REQUIRES: findRepeats was called.
void averageRepeats(Comparison& comparison);

} // namespace analysis
