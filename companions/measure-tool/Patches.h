// Which measured patch is which of the patches asked for.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "colour/DataSet.h"

namespace measuring {

/// For each patch of the chart, the row of `measured` that is the same patch. Throws Failure
/// (OtherPatches), with the first one that is wrong, unless both are the same patches, all of them
/// and no others.
///
/// Where both sides have device values these decide, row by row in the order at hand or else in any
/// order; then a difference of half a percent is a rounding. Without, ids or names do. Of patches
/// that are alike the first goes with the first.
std::vector<std::size_t> matchPatches(const colour::DataSet& chart,
                                      const colour::DataSet& measured);

/// The device values of a patch as text: "40 27 27 0".
std::string deviceText(const colour::DataSet& set, std::size_t patch);

} // namespace measuring
