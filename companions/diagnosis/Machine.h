// SPDX-License-Identifier: Apache-2.0
// Missing parts of the suite on this machine.
#pragma once

#include <string>
#include <vector>

#include "companions/diagnosis/Diagnosis.h"

namespace diagnosis {

/// Findings about the installation. They are not causes, because the client may run on another
/// machine. `temporaryFolder` is the folder that the user's runs use, empty if there is none. The
/// measuring tool is checked only if the job is measured.
std::vector<Finding> judgeMachine(const std::string& temporaryFolder, bool measures);

} // namespace diagnosis
