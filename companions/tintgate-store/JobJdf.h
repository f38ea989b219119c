// SPDX-License-Identifier: Apache-2.0
// The JDF of a job in its store: preparation for updates, and repair of damaged ones.
#pragma once

#include <string>
#include <vector>

#include "store/StoreEngine.h"

namespace admin {

/// Server paths of the job's JDF. A job that is printed elsewhere may name two: one for its first
/// measurement and one for later ones. Only existing files; throws Failure (NotThere), which
/// describes what is missing, if there is none.
std::vector<std::string> jdfPathsOf(store::StoreEngine& store, int job);

/// Whether the name ends in ".jdf", ignoring case.
bool isJdfName(const std::string& path);

/// The number of updates for which a delivered JDF is prepared: the integer "System/Jdf/Updates" of
/// the system ticket. 0 if it is missing or not above 0.
int updatesAtDelivery(store::StoreEngine& store);

/// Prepares the file (see JdfText.h) and keeps the old one as a version. Returns the changes, for
/// people; empty, and no version is kept, if it was prepared already. Throws Failure and changes
/// nothing: JdfNotSound, JdfTooLarge, and Busy if another process wrote the file meanwhile.
std::vector<std::string> readyJdf(store::StoreEngine& store, const std::string& path, int updates);

struct Rebuilt {
    int base = 0;         ///< Number of the version used as base; 0 is the current file.
    int measurements = 0; ///< Number in the resulting file.
    bool changed = false;
};

/// Merges the measurements of all versions and of the current file into the oldest intact one of
/// them, prepared for `updates` updates. Equal measurements count once. If `from` is above 0,
/// versions with lower numbers are ignored. Throws like readyJdf. Without `from`, also throws
/// JdfAmbiguous and changes nothing if intact versions differ in more than updates change, i.e. if
/// they belong to different deliveries.
Rebuilt rebuildJdf(store::StoreEngine& store, const std::string& path, int from, int updates);

} // namespace admin
