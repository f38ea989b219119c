// SPDX-License-Identifier: Apache-2.0
// Memory that crosses a boundary which allocates with malloc and frees with free.
#pragma once

#include <cstdlib>
#include <memory>

namespace base {

struct Free {
    void operator()(void* memory) const { std::free(memory); }
};

/// Owns a block from malloc, calloc or a C library that asks its callers to free what it returns.
template<class T>
using Malloced = std::unique_ptr<T, Free>;

} // namespace base
