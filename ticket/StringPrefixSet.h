// SPDX-License-Identifier: Apache-2.0
// A set of key prefixes of which none begins with another.
#pragma once

#include <set>
#include <string>

/// An ordered set in which strings count as the same as soon as one begins with the other, so that
/// it holds one prefix, normally the shortest, of each family. The empty string is of every family.
class STRINGPREFIXSET {
  public:
    /// Compares as many characters as the shorter string has, byte by byte.
    struct LESS {
        bool operator()(const std::string& a, const std::string& b) const;
    };

    using const_iterator = std::set<std::string, LESS>::const_iterator;

    const_iterator begin() const { return m_prefixes.begin(); }
    const_iterator end() const { return m_prefixes.end(); }
    bool empty() const { return m_prefixes.empty(); }
    void clear() { m_prefixes.clear(); }

    /// The prefix that `text` begins with, or end(): of a stored `ab`, `abc` finds it and `a` does
    /// not.
    const_iterator find(const std::string& text) const;

    /// Stores a prefix, unless a shorter one covers it.
    ///
    /// Of several longer prefixes the first alone gives way, and then the others keep the new one
    /// out (C122). `ab` to a set of `abc` and `abd` leaves `abd`.
    void insert(const std::string& prefix);

    /// Removes what find() finds, so that erasing `abc` removes a stored `ab` (C123).
    /// The number removed.
    std::size_t erase(const std::string& prefix);

  private:
    std::set<std::string, LESS> m_prefixes;
};
