// SPDX-License-Identifier: Apache-2.0
// The tables of a store in a PostgreSQL database. All stand in the schema "tintgate", which the
// statements name, so that nobody's search path counts.
#pragma once

#include <string>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// Whether a connection's database holds a store that this program may work on. Throws
/// StoreFailure: Missing, Newer, Older.
void checkSchema(Connection& connection);

/// Makes the tables, with one ticket, the system's, where a name is given. All of it is one
/// transaction. Throws StoreFailure (Exists).
void makeSchema(Connection& connection, const std::string* serverName);

/// Whether there is a copy that was begun and not finished.
bool isUnfinishedCopy(Connection& connection);
void finishCopy(Connection& connection);

/// False when it was up to date.
bool upgradeSchema(Connection& connection);

} // namespace store::postgres
