// SPDX-License-Identifier: Apache-2.0
// Failures of the measuring tool.
#pragma once

#include <string>

#include "CompanionStatuses.h"
#include "base/Failure.h"
#include "colour/Failure.h"

namespace measuretool {

using Status = NerovaMeasureStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends the run. The text is a sentence without a full stop.
using Failure = base::Failure<Status>;

/// Describes a problem with a file, as the end of a sentence that begins with the file's path.
const char* wordsFor(colour::Failure failure);

/// Throws Failure (`status`, or OutOfMemory) unless the file at `path` was usable.
void expectUsable(colour::Failure failure, Status status, const std::string& path);

} // namespace measuretool
