// SPDX-License-Identifier: Apache-2.0
// The content of a ticket, and the rules for reading and changing it.
#pragma once

#include <map>
#include <memory>
#include <set>
#include <string>
#include <string_view>

#include "store/tickets/TicketElements.h"
#include "ticket/TicketRecords.h"

namespace store {

/// Marks all records of a table as not carried out.
void clearResults(SETMULTIPAR* table);

/// Which keys a transfer takes.
class KeyFilter {
  public:
    /// From a null-terminated table, in which a trailing * marks a prefix. A null or empty table
    /// means all keys.
    explicit KeyFilter(const char* const* table = nullptr);

    bool all() const { return m_all; }
    bool takes(std::string_view key) const;
    const std::set<std::string, std::less<>>& exact() const { return m_exact; }
    const std::set<std::string>& prefixes() const { return m_prefixes; } ///< Without their *.

  private:
    bool m_all;
    std::set<std::string, std::less<>> m_exact;
    std::set<std::string> m_prefixes;
};

/// Keys in strcmp order with their elements. Copies are cheap: they share the elements, and a
/// change gives a key its own elements.
class TicketContent {
  public:
    /// No pointer is null, except while a table is applied.
    using Keys = std::map<std::string, std::shared_ptr<Elements>, std::less<>>;

    const Keys& keys() const { return m_keys; }
    bool empty() const { return m_keys.empty(); }

    /// Null for a missing key.
    std::shared_ptr<const Elements> find(std::string_view key) const;

    /// Whether the keys and their elements are equal, bit by bit.
    bool equals(const TicketContent& other) const;

    /// Adds a key from a storage, unchanged.
    void put(std::string key, std::shared_ptr<Elements> elements);

    /// Applies a table's records in order and sets their results. A refused record (see setElement;
    /// also keys that are empty or end in *) does not affect the others.
    ///
    /// The table may point to keys and values of this ticket. If memory runs out, nothing changes,
    /// no result is set, and the exception passes through. A null table does nothing.
    void apply(SETMULTIPAR* table);

    /// The keys that the filter accepts.
    TicketContent select(const KeyFilter& filter) const;

    /// Each key of the source replaces the whole key here; `replace` removes all others.
    void transfer(const TicketContent& source, bool replace);

    /// Calls back for each element, with positions counted from 0, until the callback returns
    /// false. The content must not change meanwhile.
    void walk(SCollect callback, void* context) const;

  private:
    class Application;

    Keys m_keys;
};

} // namespace store
