// SPDX-License-Identifier: Apache-2.0
// A set of key prefixes, none of which begins with another.
#pragma once

#include <set>
#include <string>

/// An ordered set in which two strings count as equal if one begins with the other. So it contains
/// one prefix of each family, normally the shortest. The empty string belongs to every family.
class STRINGPREFIXSET {
  public:
    /// Compares only as many characters as the shorter string has, byte by byte.
    struct LESS {
        bool operator()(const std::string& a, const std::string& b) const;
    };

    using const_iterator = std::set<std::string, LESS>::const_iterator;

    const_iterator begin() const { return m_prefixes.begin(); }
    const_iterator end() const { return m_prefixes.end(); }
    bool empty() const { return m_prefixes.empty(); }
    void clear() { m_prefixes.clear(); }

    /// Returns the stored prefix that `text` begins with, or end(). If `ab` is stored, `abc` finds
    /// it and `a` does not.
    const_iterator find(const std::string& text) const;

    /// Stores a prefix, unless a shorter one covers it.
    ///
    /// If several longer prefixes are stored, only the first is removed, and the others keep the
    /// new prefix out (C122). Adding `ab` to `abc` and `abd` leaves `abd`.
    void insert(const std::string& prefix);

    /// Removes what find() finds: erasing `abc` removes a stored `ab` (C123). Returns the number of
    /// removed prefixes.
    std::size_t erase(const std::string& prefix);

  private:
    std::set<std::string, LESS> m_prefixes;
};
