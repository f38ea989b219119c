// SPDX-License-Identifier: Apache-2.0
// What keeps something from being done, for people: never a bare number.
#pragma once

#include <string>

#include "CompanionStatuses.h"
#include "base/Failure.h"

namespace check {

using Status = TintgateCheckStatus; ///< Listed in docs/companion-statuses.csv.

/// Sentences without a full stop. `cause` and `remedy` may be empty, except that a problem with a
/// file always has a remedy.
struct Problem {
    int code = 0; ///< Of docs/exit-codes.csv; 0 if it is none of these.
    std::string what;
    std::string cause;
    std::string remedy;
};

/// The problem that docs/exit-codes.csv describes under `code`.
Problem problemOf(int code);

/// The same of the file at `path`, with what can be learned from the file itself: an empty one, a
/// spreadsheet, a preset in the place of a measurement.
Problem problemOfFile(int code, const std::string& path);

/// Ends the run.
class Failure : public base::Failure<Status> {
  public:
    Failure(Status status, Problem problem)
        : base::Failure<Status>(status, problem.what), problem(std::move(problem)) {}

    const Problem problem;
};

} // namespace check
