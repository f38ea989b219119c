// SPDX-License-Identifier: Apache-2.0
// Values of a job's keys that are there and can be read, and still are not what a run needs.
#pragma once

#include <vector>

#include "companions/diagnosis/Diagnosis.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "job/JobRecords.h"
#include "store/StoreEngine.h"

namespace diagnosis {

/// A run as far as it was examined.
struct Examined {
    const ReadOnlyServer& server;
    store::StoreEngine& engine;
    const KZJobDataStruct& job; ///< As the load has left it.
    bool measures;
    bool remeasure; ///< Asked for by the client.
};

std::vector<Finding> judgeValues(const Examined& run);

} // namespace diagnosis
