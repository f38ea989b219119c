// SPDX-License-Identifier: Apache-2.0
// What the suite lacks on this machine.
#pragma once

#include <string>
#include <vector>

#include "companions/diagnosis/Diagnosis.h"

namespace diagnosis {

/// Findings about the installation. The client may run on another machine, so they are no causes.
/// The temporary folder is that of the user's runs, empty if there is none; the measuring tool
/// matters only for a job that is measured.
std::vector<Finding> judgeMachine(const std::string& temporaryFolder, bool measures);

} // namespace diagnosis
