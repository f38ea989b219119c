// SPDX-License-Identifier: Apache-2.0
// Many measurements in parallel, with their outcomes in order.
#pragma once

#include <functional>
#include <optional>

#include "companions/tintgate-check/Measurements.h"
#include "companions/tintgate-check/Verification.h"

namespace check {

/// Calls `work` for each measurement that `next` returns, in up to `threads` threads, and `emit`
/// with each outcome in the order of the measurements. `next` and `emit` are never called by two
/// threads at once. A slow measurement holds back at most a few outcomes for each thread, so memory
/// does not depend on the number of measurements. `emit` returns false to end early. Whatever the
/// functions throw ends the run and is thrown on.
void verifyAll(const std::function<std::optional<Measurement>()>& next,
               const std::function<Outcome(const Measurement&)>& work,
               const std::function<bool(Outcome&&)>& emit, unsigned threads);

/// The number of processors that this process may use.
unsigned availableProcessors();

} // namespace check
