// SPDX-License-Identifier: Apache-2.0
// A table of parameters under construction, which owns everything that it points to (C162).
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "ticket/ParameterCaches.h"
#include "ticket/ParameterRecords.h"
#include "ticket/PartialMode.h"
#include "ticket/TicketRecords.h"

/// Records in the order they were added, with keys and values owned by the list. Equal keys have
/// one address.
///
/// A list must be used by one thread at a time.
class SETMULTIPAR_LIST {
  public:
    /// A deep list copies every value that a ticket shows it. Any other list copies keys, integers
    /// and binaries only, and must not outlive the ticket's values.
    explicit SETMULTIPAR_LIST(bool deep) : m_deep(deep) {}
    SETMULTIPAR_LIST(const SETMULTIPAR_LIST&) = delete;
    SETMULTIPAR_LIST& operator=(const SETMULTIPAR_LIST&) = delete;
    ~SETMULTIPAR_LIST() = default;

    /// Empties the list. Whether it is deep does not change.
    void Clear();
    unsigned long Size() const { return m_size; }

    /// The records with a terminator, or null for an empty list; valid until the next change. In a
    /// sorted table, records with the same key keep their order. The list itself stays sorted, and
    /// later records are appended to it.
    SETMULTIPAR* Table(bool sort);

    /// True if any record with that key, even a deletion, was added since the last Clear.
    bool ParameterExists(const char* key) const { return m_keys.find(key); }

    /// Adds a record, even if the key already has one (C129). Always true.
    ///
    /// Copies key and value, except for PARAM_POINTER and types without values, which keep the
    /// caller's pointer. A NaN or infinite double becomes MathLib::NOT_A_DOUBLE_NUMBER. A record
    /// with a null key ends the table; sorting moves it to the end.
    bool xSetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    /// Same for an array of numbers, at positions 0, 1, 2, ..., each PARAM_INT or each
    /// PARAM_DOUBLE. It takes half the time for measured arrays. Any other type adds nothing and
    /// returns false. A count of 0 or less adds nothing and returns true.
    bool xSetNumbers(const char* key, PARAM_TYPE type, const void* values, int count);

    /// Adds a record shown by a walk. Position 0 becomes -1, for scalars and vectors alike (C130).
    /// Values are copied only as far as the list is deep (C132). Always true.
    bool ySetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    bool DelParameter(const char* key, int position);
    /// Appends a text to the key's elements.
    bool AddParameter(const char* key, const std::string& value);

    /// Replaces the key's elements by these texts. V is std::vector<std::string>. Always true.
    template<class V>
    bool SetVectorParameter(const char* key, const V& texts);
    /// Same, with backslashes converted to forward slashes.
    bool SetFilenameVectorParameter(const char* key, const std::vector<std::string>& names);

    /// Adds the values of a ticket whose keys pass the filter. All pass if there are no keys or if
    /// the mode restricts nothing. None pass if the table begins with the empty string. A null
    /// ticket adds nothing.
    void Merge(const STICKET_ACCESS* access, const char* const* keys);
    void Merge(const STICKET_ACCESS* access, const PARTIAL_MODE& mode);
    /// Adds the values whose keys the predicate accepts, whatever their type. Each call is made on
    /// a copy of the predicate.
    void MergeIf(const STICKET_ACCESS* access, std::function<bool(const char*)> predicate);

    /// Adds one value of a walk to the list passed as context. Skips types that carry no value.
    /// Always true, so that the walk continues.
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
    bool m_sorted = false; ///< True if m_list was sorted since the table was last dropped.
    bool m_deep;
    std::vector<SETMULTIPAR> m_list;
    std::unique_ptr<SETMULTIPAR[]> m_table; ///< Null until requested.
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

/// The context of a walk that adds the keys of a mode to a list. Owns neither of them.
class PARTIAL_COLLECT_ACTION {
  public:
    PARTIAL_COLLECT_ACTION(SETMULTIPAR_LIST* list, const PARTIAL_MODE& mode)
        : m_list(list), m_mode(&mode) {}

    /// Adds the value if the mode contains the key. Always true.
    bool SetParameter(const char* key, PARAM_TYPE type, const void* value, int position);

    /// Like SETMULTIPAR_LIST::CollectAction, with the action as context.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);

  private:
    SETMULTIPAR_LIST* m_list;
    const PARTIAL_MODE* m_mode;
};

// The same list for callers that use an opaque pointer. A null list has size 0 and no table, and
// rejects every record.

/// Creates a list that is not deep.
void* MultiParListCreate();
/// Destroys the list and sets the caller's pointer to null. Either may be null.
void MultiParListDestroy(void** list);
unsigned long MultiParListSize(const void* list);
/// Sorted if bit 0 is set.
SETMULTIPAR* MultiParListTable(void* list, int sort);
bool MultiParListSetParameter(void* list, const char* key, PARAM_TYPE type, const void* value,
                              int position);
bool MultiParListSetNumbers(void* list, const char* key, PARAM_TYPE type, const void* values,
                            int count);
