// SPDX-License-Identifier: Apache-2.0
// A folder whose measurements are verified as they arrive.
#pragma once

#include <functional>
#include <string>

#include "companions/tintgate-check/Aim.h"
#include "companions/tintgate-check/Verification.h"

namespace check {

struct WatchWanted {
    std::string folder;
    std::string out; ///< Where results go; empty: next to the measurements.
    bool page = false;
    bool poll = false;
    double interval = 2; ///< Seconds.
    unsigned threads = 1;
    bool json = false;
    std::vector<std::string> inputs; ///< Never written to.
    LabelWanted labels = {};
};

/// Verifies what is in the folder and what arrives there, until SIGTERM or SIGINT.
///
/// The name of a result contains the SHA-256 of its measurement, NAME.SHA256.json. Each content is
/// verified once, whatever its names, as long as its result is there; so a restart goes on where
/// the last run ended, however that was. A measurement that can't be used leaves
/// NAME.SHA256.error.json and is reported once. A result that can't be written is tried again.
///
/// `start` is called once nothing is in the way. `emit` gets each outcome, and returns false to end
/// the watch. Throws Failure (NotDone) if the folder is not there, is gone, or can't be watched, or
/// if another watch has the same results.
void watch(const Aim& aim, const WatchWanted& wanted, const std::function<void()>& start,
           const std::function<bool(const Outcome&)>& emit);

} // namespace check
