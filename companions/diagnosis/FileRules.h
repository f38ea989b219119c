// SPDX-License-Identifier: Apache-2.0
// Consequences of files of a job that can't be downloaded, or whose names conflict in the job's
// folder.
#pragma once

#include <vector>

#include "companions/diagnosis/Diagnosis.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "job/JobRecords.h"
#include "jobkeys/StripKeys.h"

namespace diagnosis {

/// Evaluates all files that a load has requested.
std::vector<Finding> judgeFiles(const ReadOnlyServer& server, const KZJobDataStruct& job,
                                bool measures);

} // namespace diagnosis
