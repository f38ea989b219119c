// SPDX-License-Identifier: Apache-2.0
// What the server does not have of a job's result.
#pragma once

#include <string>
#include <vector>

#include "report/Meta.h"
#include "store/WriteFailures.h"

namespace viewer {

/// A paragraph for the job's page; empty if the server took all that the run wrote. The writes of a
/// run are between its sample file, in the job's folder, and its meta file.
std::string missingWrites(const std::vector<store::WriteFailure>& failures,
                          const std::string& folder, const report::Meta& meta);

} // namespace viewer
