// SPDX-License-Identifier: Apache-2.0
// How a run of the measuring tool ends.
#pragma once

#include <stdexcept>
#include <string>

#include "CompanionStatuses.h"
#include "colour/Failure.h"

namespace measuretool {

using Status = NerovaMeasureStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends the run. The text is a sentence for people, without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

/// What is wrong with a file, as the end of a sentence that begins with its path.
const char* wordsFor(colour::Failure failure);

/// Throws Failure (`status`, or OutOfMemory) unless the file at `path` could be used.
void expectUsable(colour::Failure failure, Status status, const std::string& path);

} // namespace measuretool
