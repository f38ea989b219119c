// SPDX-License-Identifier: Apache-2.0
// Lab values of a profile for the device values of a chart.
#pragma once

#include <string>

namespace analysis {

/// Reads process colours from the CGATS text `reference`, evaluates `profile` at them and writes
/// both with the ids to `output`. Paths are bytes as the file system has them.
/// An output that is an input, or that holds something else than CGATS text, is refused before
/// anything is read. A reference with a patch of a further ink gives exitNoDeviceValues, since the
/// profile has no colour for it. Gives 0 or a code of docs/exit-codes.csv.
int writeLab(const std::string& reference, const std::string& profile, const std::string& output);

} // namespace analysis
