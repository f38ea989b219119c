// SPDX-License-Identifier: Apache-2.0
// Data of a job other than its colours, for the viewer. docs/meta.schema.json describes it.
#pragma once

#include <string>

#include "job/JobRecords.h"

namespace analysis {

/// ASCII JSON with a line end: the job's texts, numbers and paths, never its password. Reads none
/// of the job's value arrays, because they may have been freed already.
std::wstring metaJson(const KZJobDataStruct& job);

} // namespace analysis
