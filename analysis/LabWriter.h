// SPDX-License-Identifier: Apache-2.0
// Writes the Lab values of a profile for the device values of a chart.
#pragma once

#include <string>

namespace analysis {

/// Reads process colours from the CGATS text `reference`, evaluates `profile` for them and writes
/// both with the ids to `output`. Paths are bytes of the file system. An output that is an input,
/// or that contains anything but CGATS text, is refused before anything is read. A reference with a
/// patch of another ink returns exitNoDeviceValues, because the profile has no colour for it.
/// Returns 0 or a code of docs/exit-codes.csv.
int writeLab(const std::string& reference, const std::string& profile, const std::string& output);

} // namespace analysis
