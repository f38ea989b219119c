// SPDX-License-Identifier: Apache-2.0
// The library's status for each failure of a colour file.
#pragma once

#include "colour/Failure.h"

namespace analysis {

/// A code of docs/exit-codes.csv, 0 for None. Each failure has its own code.
int statusOf(colour::Failure failure);

} // namespace analysis
