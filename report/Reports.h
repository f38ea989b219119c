// SPDX-License-Identifier: Apache-2.0
// The reports that lie on this machine.
#pragma once

#include <string>
#include <vector>

#include "report/Page.h"

namespace report {

/// Reports in the folders of jobs (JobID_N/report-*.html) below `folder`, the latest first, with
/// paths relative to it. Links and what is no report of ours are passed over.
std::vector<Listed> reportsBelow(const std::string& folder);

} // namespace report
