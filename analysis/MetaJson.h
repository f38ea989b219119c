// SPDX-License-Identifier: Apache-2.0
// What is known of a job beside its colours, for the viewer; docs/meta.schema.json describes it.
#pragma once

#include <string>

#include "job/JobRecords.h"

namespace analysis {

/// ASCII JSON with a line end: the job's texts, numbers and paths, never its password. Reads no
/// value array of the job: they may be freed by the time this is asked for.
std::wstring metaJson(const KZJobDataStruct& job);

} // namespace analysis
