// SPDX-License-Identifier: Apache-2.0
// The JDF of a job in its store: before its updates, and after those that went wrong.
#pragma once

#include <string>
#include <vector>

#include "store/StoreEngine.h"

namespace admin {

/// Server paths of the job's JDF. A job that is printed elsewhere may name two: the one of its
/// first measurement and the one of those that follow. Only files that are there; throws Failure
/// (NotThere), which tells what is missing, where there is none.
std::vector<std::string> jdfPathsOf(store::StoreEngine& store, int job);

/// Whether the name ends in ".jdf", in any case.
bool isJdfName(const std::string& path);

/// For how many updates a delivered JDF is prepared: the integer "System/Jdf/Updates" of the system
/// ticket; 0 where it is missing or not above 0.
int updatesAtDelivery(store::StoreEngine& store);

/// Prepares the file (see JdfText.h); what it was is kept as a version. What was changed, for
/// people; nothing, and no version, where it was prepared. Throws Failure with nothing changed:
/// JdfNotSound, JdfTooLarge, and Busy where somebody else wrote the file meanwhile.
std::vector<std::string> readyJdf(store::StoreEngine& store, const std::string& path, int updates);

struct Rebuilt {
    int base = 0;         ///< Number of the version that was taken; 0 is the file as it is.
    int measurements = 0; ///< In the file now.
    bool changed = false;
};

/// Puts the measurements of all versions, and of the file as it is, into the oldest of them that is
/// sound, prepared for so many updates. Equal measurements are one. With from above 0, versions of
/// lower numbers do not count. Throws as readyJdf does; and without from also JdfAmbiguous, with
/// nothing changed, if sound versions differ in more than updates change: they are of different
/// deliveries.
Rebuilt rebuildJdf(store::StoreEngine& store, const std::string& path, int from, int updates);

} // namespace admin
