// SPDX-License-Identifier: Apache-2.0
// Failures of this program.
#pragma once

#include "CompanionStatuses.h"
#include "base/Failure.h"

namespace report {

using Status = TintgateReportStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends the program. The text is a sentence for people, without a full stop.
using Failure = base::Failure<Status>;

} // namespace report
