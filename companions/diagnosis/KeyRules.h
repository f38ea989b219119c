// SPDX-License-Identifier: Apache-2.0
// Consequences of keys of a job that are missing or can't be read.
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

/// The integer that a read returned, or nothing if it returned none. Null means no read.
std::optional<int> numberIn(const AskedKey* asked);

/// Describes why a key could not be read, as a clause such as "is missing" or "is stored as a
/// double, but an int is read". Empty if it was read. With emptyCounts, an empty text is one too.
std::string problemOf(const AskedKey& asked, bool emptyCounts);

/// Evaluates all keys that were read. `similar` returns the name of a key of the same ticket that
/// resembles the missing one, or an empty text.
std::vector<Finding> judgeKeys(const std::vector<AskedKey>& keys, int job, Strip strip,
                               const std::function<std::string(const AskedKey&)>& similar);

} // namespace diagnosis
