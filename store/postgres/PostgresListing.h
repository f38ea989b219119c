// SPDX-License-Identifier: Apache-2.0
// Some keys of all tickets of a type, from a PostgreSQL server in one go.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// Sends the statement that asks for the keys of these names, as far as each takes at most
/// largestBytes. The names are needed until then.
void askForKeys(Connection& connection, int type, const std::vector<std::string>& names,
                std::size_t largestBytes);

/// What it gave, as StoreEngine::keysOfAll tells.
void showKeys(const Result& rows, const std::vector<std::string>& names,
              const StoreEngine::ShowKey& show);

} // namespace store::postgres
