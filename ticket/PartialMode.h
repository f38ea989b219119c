// SPDX-License-Identifier: Apache-2.0
// Which keys of a ticket are of interest: exact keys, and prefixes with a trailing `*` (C159).
#pragma once

#include <memory>
#include <set>
#include <string>

#include "ticket/StringPrefixSet.h"

/// A filter of keys. Exact keys and prefixes are independent: adding `ab*` leaves an exact `abc` in
/// place. Case-sensitive.
class PARTIAL_MODE {
  public:
    PARTIAL_MODE() = default;
    /// Starts empty, then calls set(table).
    explicit PARTIAL_MODE(const char* const* table);

    /// Adds the keys of a null-terminated table. A null table clears the mode. If a table begins
    /// with the empty string, its other keys are removed from the mode instead.
    void set(const char* const* table);

    /// Adds or removes the keys. An empty set clears the mode in both cases: callers use it as a
    /// reset (C124).
    void set(const std::set<std::string>& keys, bool remove);

    void insert(std::string key);
    /// Prefixes are erased as in STRINGPREFIXSET::erase.
    void erase(std::string key);
    void clear();

    /// True if the key ends in `*`, which is then removed. A lone `*` becomes the empty prefix,
    /// which matches every key.
    static bool wildcard(std::string& key);

    /// True if the mode restricts anything.
    bool partial() const { return !m_exact.empty() || !m_prefixes.empty(); }

    /// True if the key is one of the exact keys or starts with one of the prefixes.
    bool multi_contains(const std::string& key) const;

    std::set<std::string> m_exact;
    STRINGPREFIXSET m_prefixes; ///< Without their `*`.
};

/// A mode as a null-terminated table in ascending byte order, to pass to a plug-in. An empty mode
/// gives null, which plug-ins treat as no restriction.
///
/// It is a snapshot of the mode. The table lives as long as this object.
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
