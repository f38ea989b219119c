// SPDX-License-Identifier: Apache-2.0
#include "ticket/ParameterList.h"

#include <algorithm>
#include <utility>

#include "text/MathLib.h"
#include "ticket/ParameterTables.h"
#include "ticket/TicketAccess.h"
#include "ticket/TicketFilenames.h"

namespace {

SETMULTIPAR makeRecord(const char* key, PARAM_TYPE type, const void* value, int position) {
    return {.key = key, .type = type, .value = value, .position = position};
}

/// Copies the value into the cache and returns the address of the copy.
template<class T, class Cache>
const void* own(Cache& cache, const void* value) {
    auto* typed = static_cast<const T*>(value);
    return cache(typed);
}

} // namespace

void SETMULTIPAR_LIST::Clear() {
    DropTable();
    m_list.clear();
    m_size = 0;
    m_keys.clear();
    m_ints.clear();
    m_uints.clear();
    m_int64s.clear();
    m_uint64s.clear();
    m_doubles.clear();
    m_strings.clear();
    m_binaries.clear();
}

void SETMULTIPAR_LIST::DropTable() {
    m_table.reset();
    m_sorted = false;
}

SETMULTIPAR* SETMULTIPAR_LIST::Table(bool sort) {
    if (sort && !m_sorted) {
        DropTable();
    }
    if (!m_table && m_size != 0) {
        if (sort) {
            std::stable_sort(m_list.begin(), m_list.end());
            m_sorted = true;
        }
        m_table = std::make_unique<SETMULTIPAR[]>(m_size + 1);
        std::copy(m_list.begin(), m_list.end(), m_table.get());
    }
    return m_table.get();
}

void SETMULTIPAR_LIST::Append(const SETMULTIPAR& record) {
    ++m_size;
    m_list.push_back(record);
    DropTable();
}

/// NaNs and infinities can't be stored in the cache, so they share one constant (C131).
const void* SETMULTIPAR_LIST::OwnDouble(const void* value) {
    if (value != nullptr && MathLib::IsNotANumber(*static_cast<const double*>(value))) {
        return &MathLib::NOT_A_DOUBLE_NUMBER;
    }
    return own<double>(m_doubles, value);
}

bool SETMULTIPAR_LIST::xSetParameter(const char* key, PARAM_TYPE type, const void* value,
                                     int position) {
    SETMULTIPAR record = makeRecord(m_keys[key], type, value, position);
    switch (type) {
    case PARAM_INT:
        record.value = own<int>(m_ints, value);
        break;
    case PARAM_DOUBLE:
        record.value = OwnDouble(value);
        break;
    case PARAM_STRING:
        record.value = own<char>(m_strings, value);
        break;
    case PARAM_BINARY:
        record.value = own<BIN_STRING>(m_binaries, value);
        break;
    case PARAM_INT64:
        record.value = own<long long>(m_int64s, value);
        break;
    case PARAM_UINT:
        record.value = own<unsigned int>(m_uints, value);
        break;
    case PARAM_UINT64:
        record.value = own<unsigned long long>(m_uint64s, value);
        break;
    case PARAM_DELETE:
    case PARAM_POINTER:
    case PARAM_COUNT:
        break;
    }
    Append(record);
    return true;
}

bool SETMULTIPAR_LIST::xSetNumbers(const char* key, PARAM_TYPE type, const void* values,
                                   int count) {
    if (type != PARAM_INT && type != PARAM_DOUBLE) {
        return false;
    }
    if (count <= 0) {
        return true; // The key does not count as set either.
    }
    const auto more = static_cast<std::size_t>(count);
    if (m_list.size() + more > m_list.capacity()) {
        m_list.reserve(std::max(m_list.size() + more, 2 * m_list.capacity()));
    }
    const char* const ownKey = m_keys[key];
    const auto add = [&](const auto* numbers, auto& cache, auto own) {
        cache.reserve(more);
        for (int i = 0; i < count; ++i) {
            m_list.push_back(makeRecord(ownKey, type, own(numbers + i), i));
        }
    };
    if (type == PARAM_INT) {
        add(static_cast<const int*>(values), m_ints,
            [&](const void* value) { return own<int>(m_ints, value); });
    } else {
        add(static_cast<const double*>(values), m_doubles,
            [&](const void* value) { return OwnDouble(value); });
    }
    m_size += more;
    DropTable();
    return true;
}

bool SETMULTIPAR_LIST::ySetParameter(const char* key, PARAM_TYPE type, const void* value,
                                     int position) {
    // Position 0 of a walk starts a key. In a table, POSITION_WHOLE replaces the key.
    const int folded = position == 0 ? POSITION_WHOLE : position;
    if (m_deep) {
        return xSetParameter(key, type, value, folded);
    }
    SETMULTIPAR record = makeRecord(m_keys[key], type, value, folded);
    if (type == PARAM_INT) {
        record.value = own<int>(m_ints, value);
    } else if (type == PARAM_BINARY) {
        record.value = own<BIN_STRING>(m_binaries, value);
    }
    Append(record);
    return true;
}

bool SETMULTIPAR_LIST::DelParameter(const char* key, int position) {
    return xSetParameter(key, PARAM_DELETE, nullptr, position);
}

bool SETMULTIPAR_LIST::AddParameter(const char* key, const std::string& value) {
    return xSetParameter(key, PARAM_STRING, value.c_str(), POSITION_APPEND);
}

template<>
bool SETMULTIPAR_LIST::SetVectorParameter(const char* key, const std::vector<std::string>& texts) {
    DelParameter(key, POSITION_WHOLE);
    for (const std::string& text : texts) {
        AddParameter(key, text);
    }
    return true;
}

bool SETMULTIPAR_LIST::SetFilenameVectorParameter(const char* key,
                                                  const std::vector<std::string>& names) {
    std::vector<std::string> slashed;
    FilenamesToTicket(slashed, names);
    return SetVectorParameter(key, slashed);
}

void SETMULTIPAR_LIST::Merge(const STICKET_ACCESS* access, const char* const* keys) {
    if (access == nullptr) {
        return;
    }
    if (keys != nullptr && *keys != nullptr) {
        // Uses the filter even if it is empty: an empty filter lets nothing pass.
        MergeFiltered(*access, PARTIAL_MODE(keys));
    } else {
        ticket::walk(*access, CollectAction, this);
    }
}

void SETMULTIPAR_LIST::Merge(const STICKET_ACCESS* access, const PARTIAL_MODE& mode) {
    if (access == nullptr) {
        return;
    }
    if (mode.partial()) {
        MergeFiltered(*access, mode);
    } else {
        ticket::walk(*access, CollectAction, this);
    }
}

void SETMULTIPAR_LIST::MergeFiltered(const STICKET_ACCESS& access, const PARTIAL_MODE& mode) {
    PARTIAL_COLLECT_ACTION action(this, mode);
    ticket::walk(access, PARTIAL_COLLECT_ACTION::CollectAction, &action);
}

void SETMULTIPAR_LIST::MergeIf(const STICKET_ACCESS* access,
                               std::function<bool(const char*)> predicate) {
    if (access == nullptr || !predicate) {
        return;
    }
    m_filter = std::move(predicate);
    ticket::walk(*access, FilterAction, this);
}

bool SETMULTIPAR_LIST::CollectAction(void* context, const char* key, PARAM_TYPE type,
                                     const void* value, int position) {
    if (ticket::isValueType(type)) {
        static_cast<SETMULTIPAR_LIST*>(context)->ySetParameter(key, type, value, position);
    }
    return true;
}

bool SETMULTIPAR_LIST::FilterAction(void* context, const char* key, PARAM_TYPE type,
                                    const void* value, int position) {
    auto* list = static_cast<SETMULTIPAR_LIST*>(context);
    // Calls a copy (C133), so that the predicate starts in its original state each time.
    auto filter = list->m_filter;
    if (filter(key)) {
        list->ySetParameter(key, type, value, position);
    }
    return true;
}

bool PARTIAL_COLLECT_ACTION::SetParameter(const char* key, PARAM_TYPE type, const void* value,
                                          int position) {
    if (key != nullptr && m_mode->multi_contains(key)) {
        m_list->ySetParameter(key, type, value, position);
    }
    return true;
}

bool PARTIAL_COLLECT_ACTION::CollectAction(void* context, const char* key, PARAM_TYPE type,
                                           const void* value, int position) {
    if (ticket::isValueType(type)) {
        static_cast<PARTIAL_COLLECT_ACTION*>(context)->SetParameter(key, type, value, position);
    }
    return true;
}

void* MultiParListCreate() {
    return new SETMULTIPAR_LIST(false);
}

void MultiParListDestroy(void** list) {
    if (list != nullptr) {
        delete static_cast<SETMULTIPAR_LIST*>(std::exchange(*list, nullptr));
    }
}

unsigned long MultiParListSize(const void* list) {
    return list == nullptr ? 0 : static_cast<const SETMULTIPAR_LIST*>(list)->Size();
}

SETMULTIPAR* MultiParListTable(void* list, int sort) {
    return list == nullptr ? nullptr
                           : static_cast<SETMULTIPAR_LIST*>(list)->Table(ticket::bit0(sort));
}

bool MultiParListSetParameter(void* list, const char* key, PARAM_TYPE type, const void* value,
                              int position) {
    return list != nullptr &&
           static_cast<SETMULTIPAR_LIST*>(list)->xSetParameter(key, type, value, position);
}

bool MultiParListSetNumbers(void* list, const char* key, PARAM_TYPE type, const void* values,
                            int count) {
    return list != nullptr &&
           static_cast<SETMULTIPAR_LIST*>(list)->xSetNumbers(key, type, values, count);
}
