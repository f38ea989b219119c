// SPDX-License-Identifier: Apache-2.0
// Creates and copies tables of parameter records and evaluates their results (C158).
#pragma once

#include "ticket/ParameterRecords.h"

/// True if every record of the table was carried out. True for an empty table, false for null.
bool AllMultiParameterOk(const GETMULTIPAR* table);
bool AllMultiParameterOk(const SETMULTIPAR* table);

/// True if at least one record was carried out. False for an empty table or null.
bool AnyMultiParameterOk(const GETMULTIPAR* table);
bool AnyMultiParameterOk(const SETMULTIPAR* table);

/// Copies the results record by record until the shorter table ends. Either may be null.
void MultiParameterResultCpy(SETMULTIPAR* to, const SETMULTIPAR* from);

/// Returns a copy that shares keys and values with its source, to be freed with free(). Returns
/// null for null and if memory runs out.
SETMULTIPAR* MultiParameterDup(const SETMULTIPAR* table);

/// A table that reads the first `count` elements of a key, at positions 0, 1, 2, ... Its value
/// pointers are null.
///
/// Free it with free(). Null if memory runs out or if a key can't have that many elements.
GETMULTIPAR* NewGetMultipar(unsigned long count, const char* key, PARAM_TYPE type);

/// A table that replaces a key by `count` elements: the first record, at position -1, replaces the
/// key; the others, at 1, 2, ..., extend it. Values and memory are as for NewGetMultipar.
SETMULTIPAR* NewSetMultipar(unsigned long count, const char* key, PARAM_TYPE type);

namespace ticket {

/// The maximum number of elements of a key. A larger count is damaged data and is not allocated.
inline constexpr unsigned long maxElements = 0x1000000;

/// True for the types of values that a ticket can store.
constexpr bool isValueType(PARAM_TYPE type) {
    return type >= PARAM_POINTER && type <= PARAM_UINT64 && type != PARAM_COUNT;
}

} // namespace ticket
