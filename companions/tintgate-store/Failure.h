// SPDX-License-Identifier: Apache-2.0
// Failures of commands of tintgate-store.
#pragma once

#include "CompanionStatuses.h"
#include "base/Failure.h"
#include "store/StoreEngine.h"

namespace admin {

using Status = TintgateStoreStatus; ///< Listed in docs/companion-statuses.csv.

/// Ends a command. The text is a sentence for people, without a full stop.
using Failure = base::Failure<Status>;

constexpr Status statusOf(store::Fault fault) {
    switch (fault) {
    case store::Fault::Missing:
        return Status::NoStore;
    case store::Fault::Newer:
        return Status::Newer;
    case store::Fault::Older:
        return Status::Older;
    case store::Fault::ReadOnly:
        return Status::ReadOnly;
    case store::Fault::Full:
        return Status::Full;
    case store::Fault::Busy:
        return Status::Busy;
    case store::Fault::Damaged:
        return Status::Damaged;
    case store::Fault::BadPath:
        return Status::BadPath;
    case store::Fault::NoFile:
        return Status::NotThere;
    case store::Fault::Exists:
        return Status::Exists;
    case store::Fault::Lost:
        return Status::Lost;
    case store::Fault::Other:
        break;
    }
    return Status::Other;
}

} // namespace admin
