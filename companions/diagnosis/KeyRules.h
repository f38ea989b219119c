// SPDX-License-Identifier: Apache-2.0
// What follows if a key of a job is missing or not readable.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "companions/diagnosis/Diagnosis.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "jobkeys/StripKeys.h"
#include "jobkeys/Tickets.h"

namespace diagnosis {

using jobkeys::jobType;
using jobkeys::presetType;
using jobkeys::Strip;
using jobkeys::systemType;

/// "system", "job/7", "preset/1", "12/3".
std::string ticketName(int type, int id);

/// "job/7 Input/SubType".
std::string keyName(const AskedKey& asked);

/// The first read of a key, or null.
const AskedKey* findKey(const std::vector<AskedKey>& keys, int type, int id,
                        const std::string& key);

/// The whole number that a read has given. Nothing if it gave none; null is no read.
std::optional<int> numberIn(const AskedKey* asked);

/// What keeps a key from being read, as a clause such as "is missing" or "is stored as a double,
/// but an int is read". Empty if it was read. An empty text counts if emptyCounts is true.
std::string problemOf(const AskedKey& asked, bool emptyCounts);

/// Judges all keys that were asked. `similar` gives the name of a key of the same ticket that looks
/// like the missing one, or an empty text.
std::vector<Finding> judgeKeys(const std::vector<AskedKey>& keys, int job, Strip strip,
                               const std::function<std::string(const AskedKey&)>& similar);

} // namespace diagnosis
