// SPDX-License-Identifier: Apache-2.0
// Finds the parts of a job's result that the server does not have.
#pragma once

#include <string>
#include <vector>

#include "report/Meta.h"
#include "report/languages/Texts.h"
#include "store/WriteFailures.h"

namespace viewer {

/// Returns a paragraph for the job's page. Empty if the server accepted all writes of the run.
/// These are newer than its sample file, in the job's folder, and older than its meta file.
std::string missingWrites(const std::vector<store::WriteFailure>& failures,
                          const std::string& folder, const report::Meta& meta,
                          const languages::Texts& say);

} // namespace viewer
