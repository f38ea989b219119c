// SPDX-License-Identifier: Apache-2.0
// Identifies which measured patch belongs to which requested patch.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "colour/DataSet.h"

namespace measuretool {

/// For each patch of the chart, returns the row of `measured` with the same patch. Throws Failure
/// (OtherPatches) unless both contain the same patches, all of them and no others. The failure
/// names a missing patch, and the row that replaces it or belongs to no patch.
///
/// If both sides have device values, these decide: row by row in the present order, with half a
/// percent for rounding, or else in any order, to a hundredth of a percent. If one side has none,
/// ids or names decide; numbers may have leading zeros. Identical patches are paired in order.
///
/// Ids that are the numbers 1 to N fit every strip of N patches. With `bareIds`, they are
/// sufficient to identify the strip.
std::vector<std::size_t> matchPatches(const colour::DataSet& chart, const colour::DataSet& measured,
                                      bool bareIds);

/// The device values of a patch as text: "40 27 27 0". Empty if there are none.
std::string deviceText(const colour::DataSet& set, std::size_t patch);

} // namespace measuretool
