// SPDX-License-Identifier: Apache-2.0
// Detects commits to a SQLite database in WAL mode.
#pragma once

#include <array>
#include <cstdint>
#include <optional>

#include "store/sqlite/Sqlite.h"

namespace store {

/// SQLite checks the same before each read: it compares the header of the log's shared index, which
/// every commit of any process changes before it returns. PRAGMA data_version does this too, in
/// some microseconds and with two locks. This class reads the header in memory instead, through the
/// function of SQLite's own file object. If the index does not have the documented form
/// (https://www.sqlite.org/walformat.html), it uses the pragma.
///
/// The connection must outlive this, must have read from the database, and must stay in WAL mode.
class WalWatch {
  public:
    /// Uses the pragma for a connection without a shared index.
    WalWatch(sqlite::Database& database, bool shared);

    /// Differs from the previous value after any commit.
    std::uint64_t commits();

  private:
    /// The header's two copies of 48 bytes; a commit writes the first copy last.
    using Header = std::array<std::uint32_t, 12>;

    const volatile std::uint32_t* m_shared = nullptr; ///< Null: use the pragma.
    Header m_seen{};
    std::uint64_t m_commits = 0;
    sqlite::Database& m_database;
    std::optional<sqlite::Statement> m_pragma;
    std::int64_t m_version = 0;
    std::int64_t m_ownChanges = 0; ///< The pragma does not count its own connection's changes.
};

} // namespace store
