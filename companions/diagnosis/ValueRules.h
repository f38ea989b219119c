// SPDX-License-Identifier: Apache-2.0
// Values of a job's keys that can be read but are not what a run needs.
#pragma once

#include <vector>

#include "companions/diagnosis/Diagnosis.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "job/JobRecords.h"
#include "store/StoreEngine.h"

namespace diagnosis {

/// The examined part of a run.
struct Examined {
    const ReadOnlyServer& server;
    store::StoreEngine& engine;
    const KZJobDataStruct& job; ///< As filled by the load.
    bool measures;
    bool remeasure; ///< Requested by the client.
};

std::vector<Finding> judgeValues(const Examined& run);

} // namespace diagnosis
