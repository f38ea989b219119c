// SPDX-License-Identifier: Apache-2.0
// Which status of the library a failure of a colour file is.
#pragma once

#include "colour/Failure.h"

namespace analysis {

/// A code of docs/exit-codes.csv; 0 for None. Each failure has a code of its own.
int statusOf(colour::Failure failure);

} // namespace analysis
