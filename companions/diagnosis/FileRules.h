// SPDX-License-Identifier: Apache-2.0
// What follows if a file of a job does not come, or if its name is one that the job's folder can't
// hold beside the others.
#pragma once

#include <vector>

#include "companions/diagnosis/Diagnosis.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "job/JobRecords.h"
#include "jobkeys/StripKeys.h"

namespace diagnosis {

/// Judges all files that a load has requested.
std::vector<Finding> judgeFiles(const ReadOnlyServer& server, const KZJobDataStruct& job,
                                bool measures);

} // namespace diagnosis
