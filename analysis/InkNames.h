// SPDX-License-Identifier: Apache-2.0
// What the inks of a comparison are called.
#pragma once

#include <string>
#include <vector>

#include "analysis/Comparison.h"

namespace analysis {

/// Names of the device channels of `comparison.devices`, in their order; empty if it is null.
///
/// An ink after C, M, Y and K that its file only numbers has the name that another file of the
/// comparison with as many channels gives it, as "SPOT_Gold". Otherwise it has that of `inks`
/// (PresetOptions::inks), otherwise "Channel 5", counted from C. Names have no part in pairing.
std::vector<std::string> channelNames(const Comparison& comparison,
                                      const std::vector<std::string>& inks);

} // namespace analysis
