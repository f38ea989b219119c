// SPDX-License-Identifier: Apache-2.0
// All of one store put into another one.
#pragma once

#include <string>

#include "store/StoreEngine.h"

namespace admin {

/// Copies everything to a store that openCopy opened, and finishes it. What an earlier copy, which
/// was broken off, brought along is written once more. Returns what was copied, for people.
std::string copyStore(store::StoreEngine& from, store::StoreEngine& to);

} // namespace admin
