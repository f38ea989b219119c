// SPDX-License-Identifier: Apache-2.0
// "tintgate-report average": several measurements of one chart become one.
#pragma once

#include <string>
#include <vector>

namespace report {

struct AverageOptions {
    std::vector<std::string> measurements; ///< Two at least.
    std::string output;                    ///< Where the mean goes, as CGATS text.
    std::string spread; ///< Where the spread of each patch goes, as CSV; or empty.
};

/// Writes the mean, and gives a summary of how far the measurements lie apart. Throws Failure
/// (Unreadable, Broken, NotOneChart, NotWritten); nothing is written then, but for the mean if only
/// the spread can't be.
std::string averageFiles(const AverageOptions& options);

} // namespace report
