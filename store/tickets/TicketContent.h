// SPDX-License-Identifier: Apache-2.0
// What a ticket holds, with the rules by which it is read and changed.
#pragma once

#include <map>
#include <memory>
#include <set>
#include <string>
#include <string_view>

#include "store/tickets/TicketElements.h"
#include "ticket/TicketRecords.h"

namespace store {

/// Which keys a transfer takes.
class KeyFilter {
  public:
    /// From a table ended by null, where a trailing * makes a prefix. A null or empty table stands
    /// for all keys.
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

/// Keys in the order of strcmp, each with its elements. A copy is cheap: it shares the elements,
/// and a change gives a key elements of its own.
class TicketContent {
  public:
    /// No key is there with a null pointer, except while a table is applied.
    using Keys = std::map<std::string, std::shared_ptr<Elements>, std::less<>>;

    const Keys& keys() const { return m_keys; }
    bool empty() const { return m_keys.empty(); }

    /// Null for a key that isn't there.
    std::shared_ptr<const Elements> find(std::string_view key) const;

    /// The same keys with the same elements, bit by bit.
    bool equals(const TicketContent& other) const;

    /// Puts a key as it is in another place of keeping.
    void put(std::string key, std::shared_ptr<Elements> elements);

    /// Carries out a table's records in their order and sets each one's result. A record that is
    /// refused (see setElement; further a key that is empty or ends in *) leaves the others alone.
    ///
    /// The table may point to keys and values of this very ticket. When memory runs out all is as
    /// it was, no result is set, and the exception passes. A null table does nothing.
    void apply(SETMULTIPAR* table);

    /// The keys that the filter takes.
    TicketContent select(const KeyFilter& filter) const;

    /// Each key of the source takes the place of the whole key here; with replace, all others go.
    void transfer(const TicketContent& source, bool replace);

    /// Shows each element, positions counted from 0, as long as the callback gives true. The
    /// content must not change meanwhile.
    void walk(SCollect callback, void* context) const;

  private:
    class Application;

    Keys m_keys;
};

} // namespace store
