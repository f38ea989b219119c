// SPDX-License-Identifier: Apache-2.0
// Whether a SQLite database in WAL mode has had a commit.
#pragma once

#include <array>
#include <cstdint>
#include <optional>

#include "store/sqlite/Sqlite.h"

namespace store {

/// SQLite asks the same before each read: it compares the header of the shared index of the log,
/// which every commit, of any process, changes before it returns. PRAGMA data_version does it too,
/// in some microseconds and two locks. Here the header is looked at where it lies in memory,
/// through the function that SQLite's own file object has for that; where the index does not look
/// as it is documented (https://www.sqlite.org/walformat.html), the pragma is asked.
///
/// The connection outlives this object, has read from the database, and stays in WAL mode.
class WalWatch {
  public:
    /// Of a connection that has no shared index, the pragma is asked.
    WalWatch(sqlite::Database& database, bool shared);

    /// Differs from the last one after any commit.
    std::uint64_t commits();

  private:
    /// Twice the same 48 bytes of the header, of which a commit writes the first last.
    using Header = std::array<std::uint32_t, 12>;

    const volatile std::uint32_t* m_shared = nullptr; ///< Null: ask the pragma.
    Header m_seen{};
    std::uint64_t m_commits = 0;
    sqlite::Database& m_database;
    std::optional<sqlite::Statement> m_pragma;
    std::int64_t m_version = 0;
    std::int64_t m_ownChanges = 0; ///< The pragma does not count those of its own connection.
};

} // namespace store
