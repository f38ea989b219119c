// SPDX-License-Identifier: Apache-2.0
// Checks tolerance presets for their authors.
#pragma once

#include <string>

namespace report {

/// Summarises a valid preset in one line: file, number, name and number of criteria. Throws Failure
/// (Missing or Broken) with the line, the element and Tintgate's exit code for the fault.
std::string presetSummary(const std::string& path);

/// The folder of the presets installed with this program. Empty if it is not installed.
std::string installedPresets();

} // namespace report
