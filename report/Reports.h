// SPDX-License-Identifier: Apache-2.0
// Finds the reports on this machine.
#pragma once

#include <string>
#include <vector>

#include "report/Page.h"

namespace report {

/// Reports in the folders of jobs (JobID_N/report-*.html) below `folder`, latest first, with paths
/// relative to it. Skips links and files that are not our reports.
std::vector<Listed> reportsBelow(const std::string& folder);

} // namespace report
