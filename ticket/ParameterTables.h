// SPDX-License-Identifier: Apache-2.0
// Tables of parameter records: making, copying, and asking what became of them (C158).
#pragma once

#include <cstdlib>
#include <memory>

#include "ticket/ParameterRecords.h"

/// True when every record of the table was carried out: of an empty table, true; of null, false.
bool AllMultiParameterOk(const GETMULTIPAR* table);
bool AllMultiParameterOk(const SETMULTIPAR* table);

/// True when at least one record of the table was carried out: of an empty table or null, false.
bool AnyMultiParameterOk(const GETMULTIPAR* table);
bool AnyMultiParameterOk(const SETMULTIPAR* table);

/// Copies the results, record by record, up to the end of the shorter table. Either may be null.
void MultiParameterResultCpy(SETMULTIPAR* to, const SETMULTIPAR* from);

/// A copy of the table that shares keys and values with its source. To be freed with free(). Null
/// for null and when memory is short.
SETMULTIPAR* MultiParameterDup(const SETMULTIPAR* table);

/// A table that reads the first `count` elements of a key: positions 0, 1, 2, ... and no values
/// yet.
///
/// To be freed with free(). Null when memory is short, and for more elements than a key can have.
GETMULTIPAR* NewGetMultipar(unsigned long count, const char* key, PARAM_TYPE type);

/// A table that replaces a key by `count` elements: the first record, at position -1, replaces the
/// key, and those at 1, 2, ... fill it up. No values yet. Memory as for NewGetMultipar.
SETMULTIPAR* NewSetMultipar(unsigned long count, const char* key, PARAM_TYPE type);

namespace ticket {

/// More elements than these no key has: a count beyond it is damage, and is not allocated.
inline constexpr unsigned long maxElements = 0x1000000;

/// True for the types under which a ticket keeps values.
constexpr bool isValueType(PARAM_TYPE type) {
    return type >= PARAM_POINTER && type <= PARAM_UINT64 && type != PARAM_COUNT;
}

struct Free {
    void operator()(void* block) const { std::free(block); }
};

/// Owns an array from malloc or calloc.
template<class T>
using Block = std::unique_ptr<T[], Free>;

} // namespace ticket
