// SPDX-License-Identifier: Apache-2.0
// Which keys of a ticket are of interest: exact keys, and prefixes with a trailing `*` (C159).
#pragma once

#include <memory>
#include <set>
#include <string>

#include "ticket/StringPrefixSet.h"

/// A filter of keys. Exact keys and prefixes are independent of each other: `ab*` leaves an exact
/// `abc` where it is. Letter case counts.
class PARTIAL_MODE {
  public:
    PARTIAL_MODE() = default;
    /// Empty, then set(table).
    explicit PARTIAL_MODE(const char* const* table);

    /// Adds the keys of a table that a null ends. A null table clears the mode; one that begins
    /// with the empty string takes its further keys out of the mode instead.
    void set(const char* const* table);

    /// Adds the keys, or removes them. No keys at all clear the mode, whatever is asked: callers
    /// use it as a reset (C124).
    void set(const std::set<std::string>& keys, bool remove);

    void insert(std::string key);
    /// A prefix is erased as STRINGPREFIXSET::erase tells.
    void erase(std::string key);
    void clear();

    /// True if the key is a prefix form; takes its last `*` off. A lone `*` becomes the empty
    /// prefix, which every key begins with.
    static bool wildcard(std::string& key);

    /// True if the mode restricts anything.
    bool partial() const { return !m_exact.empty() || !m_prefixes.empty(); }

    /// True if the key is one of the exact keys or begins with one of the prefixes.
    bool multi_contains(const std::string& key) const;

    std::set<std::string> m_exact;
    STRINGPREFIXSET m_prefixes; ///< Without their `*`.
};

/// A mode as a table ended by null, in ascending byte order, to hand to a plug-in. An empty mode
/// gives null, which plug-ins take as no restriction.
///
/// A snapshot: it does not follow the mode, and the table lives as long as this object.
class PARTIAL_TABLE {
  public:
    explicit PARTIAL_TABLE(const PARTIAL_MODE& mode);
    PARTIAL_TABLE(const PARTIAL_TABLE&) = delete;
    PARTIAL_TABLE& operator=(const PARTIAL_TABLE&) = delete;
    ~PARTIAL_TABLE() = default;

    operator const char* const*() const { return m_table.get(); }

  private:
    std::set<std::string> m_keys;
    std::unique_ptr<const char*[]> m_table; ///< Points into m_keys.
};
