// SPDX-License-Identifier: Apache-2.0
// A table of parameters in the making, which owns all that it points to (C162).
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "ticket/ParameterCaches.h"
#include "ticket/ParameterRecords.h"
#include "ticket/PartialMode.h"
#include "ticket/TicketRecords.h"

/// Records in order of arrival, with keys and values of the list's own. Equal keys have one
/// address.
///
/// A list belongs to one thread at a time.
class SETMULTIPAR_LIST {
  public:
    /// A deep list copies every value that a ticket shows it. One that is not deep copies keys,
    /// integers and binaries only, and must not outlive the values of that ticket.
    explicit SETMULTIPAR_LIST(bool deep) : m_deep(deep) {}
    SETMULTIPAR_LIST(const SETMULTIPAR_LIST&) = delete;
    SETMULTIPAR_LIST& operator=(const SETMULTIPAR_LIST&) = delete;
    ~SETMULTIPAR_LIST() = default;

    /// Empties the list; it stays as deep as it was.
    void Clear();
    unsigned long Size() const { return m_size; }

    /// The records with a terminator, or null for an empty list; good until the next change.
    /// Sorted, records of one key keep their order of arrival. The list itself stays sorted, and
    /// what comes later is appended to that.
    SETMULTIPAR* Table(bool sort);

    /// True if a record with that key was ever added since the last Clear, a deletion included.
    bool ParameterExists(const char* key) const { return m_keys.find(key); }

    /// Adds a record, also where the key has one already (C129). Always true.
    ///
    /// Key and value are copied, but a value of PARAM_POINTER or of a type without values stays the
    /// caller's pointer. A double that is no finite number becomes MathLib::NOT_A_DOUBLE_NUMBER. A
    /// record with a null key ends the table there; sorted, it comes last.
    bool xSetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    /// The same for a number at each position from 0 on, each PARAM_INT or each PARAM_DOUBLE: a
    /// measured array, for which it is faster by half. False for another type, which adds nothing;
    /// a count of 0 or less adds nothing either, and is true.
    bool xSetNumbers(const char* key, PARAM_TYPE type, const void* values, int count);

    /// Adds a record as a walk shows it: position 0 becomes -1 (C130), for a scalar as for a
    /// vector, and values are copied as deep as the list is (C132). Always true.
    bool ySetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    bool DelParameter(const char* key, int position);
    /// Appends a text to the key.
    bool AddParameter(const char* key, const std::string& value);

    /// Replaces the key by these texts. V is std::vector<std::string>. Always true.
    template<class V>
    bool SetVectorParameter(const char* key, const V& texts);
    /// The same, with forward slashes.
    bool SetFilenameVectorParameter(const char* key, const std::vector<std::string>& names);

    /// Adds a ticket's values: those of the keys that a filter lets through, or all where there are
    /// no keys or the mode restricts nothing. A table that begins with the empty string lets
    /// nothing through. Nothing happens for a null ticket.
    void Merge(const STICKET_ACCESS* access, const char* const* keys);
    void Merge(const STICKET_ACCESS* access, const PARTIAL_MODE& mode);
    /// Adds what the predicate accepts, whatever type the walk gives it. Each call is made on a
    /// copy of the predicate.
    void MergeIf(const STICKET_ACCESS* access, std::function<bool(const char*)> predicate);

    /// Adds one value of a walk to the list that is the context. Always true, so that the walk goes
    /// on; types that carry no value are passed over.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);

    STRINGCACHE m_keys;
    VALCACHE<int> m_ints;
    VALCACHE<unsigned int> m_uints;
    VALCACHE<long long> m_int64s;
    VALCACHE<unsigned long long> m_uint64s;
    VALCACHE<double> m_doubles;
    STRINGCACHE m_strings;
    BIN_STRING_CACHE m_binaries;
    unsigned long m_size = 0;
    bool m_sorted = false; ///< Since the table was last dropped.
    bool m_deep;
    std::vector<SETMULTIPAR> m_list;
    std::unique_ptr<SETMULTIPAR[]> m_table; ///< Null when there is none.
    std::function<bool(const char*)> m_filter;

  private:
    void Append(const SETMULTIPAR& record);
    void DropTable();
    void MergeFiltered(const STICKET_ACCESS& access, const PARTIAL_MODE& mode);
    const void* OwnDouble(const void* value);
    static bool FilterAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                             int position);
};

template<>
bool SETMULTIPAR_LIST::SetVectorParameter(const char* key, const std::vector<std::string>& texts);

/// The context of a walk that adds the keys of a mode to a list. Owns neither.
class PARTIAL_COLLECT_ACTION {
  public:
    PARTIAL_COLLECT_ACTION(SETMULTIPAR_LIST* list, const PARTIAL_MODE& mode)
        : m_list(list), m_mode(&mode) {}

    /// Adds the value if the mode has the key. Always true.
    bool SetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    /// As SETMULTIPAR_LIST::CollectAction; the context is the action.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);

  private:
    SETMULTIPAR_LIST* m_list;
    const PARTIAL_MODE* m_mode;
};

// The list for callers that hold an opaque pointer. A null list has size 0 and no table, and takes
// nothing.

/// A list that is not deep.
void* MultiParListCreate();
/// Destroys the list and nulls the caller's pointer. Either may be null.
void MultiParListDestroy(void** list);
unsigned long MultiParListSize(const void* list);
/// Sorted if bit 0 is set.
SETMULTIPAR* MultiParListTable(void* list, int sort);
bool MultiParListSetParameter(void* list, const char* key, PARAM_TYPE type, const void* value,
                              int position);
bool MultiParListSetNumbers(void* list, const char* key, PARAM_TYPE type, const void* values,
                            int count);
