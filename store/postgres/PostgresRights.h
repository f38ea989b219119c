// SPDX-License-Identifier: Apache-2.0
// What roles of a PostgreSQL server may do with a store.
#pragma once

#include <string>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// See grantRights of StoreEngine.h. In one transaction.
void grantRights(Connection& connection, const std::string& role, Rights rights);

} // namespace store::postgres
