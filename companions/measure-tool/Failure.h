// SPDX-License-Identifier: Apache-2.0
// Failures of the measuring tool.
#pragma once

#include <stdexcept>
#include <string>

#include "CompanionStatuses.h"
#include "colour/Failure.h"

namespace measuretool {

using Status = NerovaMeasureStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends the run. The text is a sentence without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

/// Describes a problem with a file, as the end of a sentence that begins with the file's path.
const char* wordsFor(colour::Failure failure);

/// Throws Failure (`status`, or OutOfMemory) unless the file at `path` was usable.
void expectUsable(colour::Failure failure, Status status, const std::string& path);

} // namespace measuretool
