// SPDX-License-Identifier: Apache-2.0
// Failures of this program.
#pragma once

#include <stdexcept>
#include <string>

#include "CompanionStatuses.h"

namespace report {

using Status = TintgateReportStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends the program. The text is a sentence for people, without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

} // namespace report
