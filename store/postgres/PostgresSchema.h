// SPDX-License-Identifier: Apache-2.0
// The tables of a store in a PostgreSQL database. All are in the schema "tintgate", which the
// statements name explicitly, so that search paths don't matter.
#pragma once

#include <string>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// Checks that a connection's database contains a store usable by this program. Throws
/// StoreFailure: Missing, Newer, Older.
void checkSchema(Connection& connection);

/// Creates the tables and, if a name is given, the system ticket. All of it is one transaction.
/// Throws StoreFailure (Exists).
void makeSchema(Connection& connection, const std::string* serverName);

/// Whether there is an unfinished copy.
bool isUnfinishedCopy(Connection& connection);
void finishCopy(Connection& connection);

/// False if it was up to date.
bool upgradeSchema(Connection& connection);

} // namespace store::postgres
