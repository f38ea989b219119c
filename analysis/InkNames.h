// SPDX-License-Identifier: Apache-2.0
// The names of a comparison's inks.
#pragma once

#include <string>
#include <vector>

#include "analysis/Comparison.h"

namespace analysis {

/// Names of the device channels of `comparison.devices`, in order. Empty if it is null.
///
/// If the file only numbers an ink after C, M, Y and K, its name comes from another file of the
/// comparison with as many channels, as "SPOT_Gold", otherwise from `inks` (PresetOptions::inks).
/// Otherwise it is "Channel 5", counted from C. Names don't affect pairing.
std::vector<std::string> channelNames(const Comparison& comparison,
                                      const std::vector<std::string>& inks);

} // namespace analysis
