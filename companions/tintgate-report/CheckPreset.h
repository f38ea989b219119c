// SPDX-License-Identifier: Apache-2.0
// Tolerance presets, checked for whoever writes one.
#pragma once

#include <string>

namespace report {

/// One line about a sound preset: its file, number, name and number of criteria. Throws Failure
/// (Missing or Broken) with the line, the element and the exit code that Tintgate gives for the
/// fault.
std::string presetSummary(const std::string& path);

/// Where the presets are that were installed with this program; empty if it is not installed.
std::string installedPresets();

} // namespace report
