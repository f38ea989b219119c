// SPDX-License-Identifier: Apache-2.0
// Whether everything in a store on a PostgreSQL server is whole.
#pragma once

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// See StoreEngine::verify. All of it is of one moment, in a transaction that can't write.
Verified verifyStore(Connection& connection, const StoreEngine::ShowFault& show);

} // namespace store::postgres
