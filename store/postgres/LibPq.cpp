#include "store/postgres/LibPq.h"

#include <dlfcn.h>

#include "store/StoreEngine.h"

namespace store::postgres {

namespace {

LibPq load() {
    // Never closed: it leaves handlers of its own in libraries below it.
    void* const library = dlopen("libpq.so.5", RTLD_NOW | RTLD_LOCAL);
    LibPq functions;
    const auto find = [&](auto& function, const char* name) {
        void* const symbol = library == nullptr ? nullptr : dlsym(library, name);
        if (symbol == nullptr) {
            throw StoreFailure(Fault::Missing, "a store on a server needs the library libpq 14 or "
                                               "later (Debian: libpq5)");
        }
        function = reinterpret_cast<std::remove_reference_t<decltype(function)>>(symbol);
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
