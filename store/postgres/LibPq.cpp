// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/LibPq.h"

#include "base/SharedObject.h"
#include "store/StoreEngine.h"

namespace store::postgres {

namespace {

LibPq load() {
    // Never closed, because it leaves handlers in libraries that it uses.
    const base::SharedObject library("libpq.so.5");
    LibPq functions;
    const auto find = [&](auto& function, const char* name) {
        if (!library.find(name, function)) {
            throw StoreFailure(Fault::Missing, "a store on a server needs the library libpq 14 or "
                                               "later (Debian: libpq5)");
        }
    };
#define TINTGATE_LIBPQ_FIND(name) find(functions.name, "PQ" #name);
    TINTGATE_LIBPQ_FUNCTIONS(TINTGATE_LIBPQ_FIND)
#undef TINTGATE_LIBPQ_FIND
    return functions;
}

} // namespace

const LibPq& libPq() {
    static const LibPq functions = load();
    return functions;
}

} // namespace store::postgres
