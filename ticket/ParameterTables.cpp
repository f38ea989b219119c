// SPDX-License-Identifier: Apache-2.0
#include "ticket/ParameterTables.h"

#include <cstring>

namespace {

template<class Record>
bool allOk(const Record* record) {
    if (record == nullptr) {
        return false;
    }
    while (record->key != nullptr && record->ok()) {
        ++record;
    }
    return record->key == nullptr;
}

template<class Record>
bool anyOk(const Record* record) {
    if (record == nullptr) {
        return false;
    }
    while (record->key != nullptr && !record->ok()) {
        ++record;
    }
    return record->key != nullptr;
}

template<class Record>
Record* newTable(unsigned long count, const char* key, PARAM_TYPE type, int firstPosition) {
    if (count > ticket::maxElements) {
        return nullptr;
    }
    auto* table = static_cast<Record*>(std::calloc(count + 1, sizeof(Record)));
    if (table == nullptr) {
        return nullptr;
    }
    for (unsigned long i = 0; i < count; ++i) {
        table[i].key = key;
        table[i].type = type;
        table[i].position = i == 0 ? firstPosition : static_cast<int>(i);
    }
    return table;
}

} // namespace

bool AllMultiParameterOk(const GETMULTIPAR* table) {
    return allOk(table);
}
bool AllMultiParameterOk(const SETMULTIPAR* table) {
    return allOk(table);
}

bool AnyMultiParameterOk(const GETMULTIPAR* table) {
    return anyOk(table);
}
bool AnyMultiParameterOk(const SETMULTIPAR* table) {
    return anyOk(table);
}

void MultiParameterResultCpy(SETMULTIPAR* to, const SETMULTIPAR* from) {
    if (to == nullptr || from == nullptr) {
        return;
    }
    for (; to->key != nullptr && from->key != nullptr; ++to, ++from) {
        to->result = from->ok() ? 1 : 0;
    }
}

SETMULTIPAR* MultiParameterDup(const SETMULTIPAR* table) {
    if (table == nullptr) {
        return nullptr;
    }
    const SETMULTIPAR* terminator = table;
    while (terminator->key != nullptr) {
        ++terminator;
    }
    const std::size_t size = static_cast<std::size_t>(terminator - table + 1) * sizeof(SETMULTIPAR);
    void* copy = std::malloc(size);
    if (copy != nullptr) {
        std::memcpy(copy, table, size);
    }
    return static_cast<SETMULTIPAR*>(copy);
}

GETMULTIPAR* NewGetMultipar(unsigned long count, const char* key, PARAM_TYPE type) {
    return newTable<GETMULTIPAR>(count, key, type, 0);
}

SETMULTIPAR* NewSetMultipar(unsigned long count, const char* key, PARAM_TYPE type) {
    return newTable<SETMULTIPAR>(count, key, type, POSITION_WHOLE);
}
