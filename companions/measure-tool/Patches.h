// SPDX-License-Identifier: Apache-2.0
// Which measured patch is which of the patches asked for.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "colour/DataSet.h"

namespace measuretool {

/// For each patch of the chart, the row of `measured` that is the same patch. Throws Failure
/// (OtherPatches) unless both are the same patches, all of them and no others. The failure names a
/// patch that is missing, and the row that is there in its place or belongs to no patch.
///
/// If both sides have device values, these decide: row by row in the order at hand, with half a
/// percent for rounding, or else in any order to a hundredth of a percent. If one side has none,
/// ids or names decide; numbers may have zeros in front. Of patches that are alike, the first goes
/// with the first.
///
/// Ids that are the numbers 1 to N fit every strip of N patches. Alone they prove the right strip
/// only with `bareIds`.
std::vector<std::size_t> matchPatches(const colour::DataSet& chart, const colour::DataSet& measured,
                                      bool bareIds);

/// The device values of a patch as text: "40 27 27 0". Empty if there are none.
std::string deviceText(const colour::DataSet& set, std::size_t patch);

} // namespace measuretool
