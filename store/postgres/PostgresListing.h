// SPDX-License-Identifier: Apache-2.0
// Reads some keys of all tickets of a type from a PostgreSQL server at once.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// Sends the query for the keys of these names that each take at most largestBytes. The names are
/// not used after the call.
void askForKeys(Connection& connection, int type, const std::vector<std::string>& names,
                std::size_t largestBytes);

/// Evaluates its result as described for StoreEngine::keysOfAll.
void showKeys(const Result& rows, const std::vector<std::string>& names,
              const StoreEngine::ShowKey& show);

} // namespace store::postgres
