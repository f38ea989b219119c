// SPDX-License-Identifier: Apache-2.0
// A SQLite connection and its statements, with failures as StoreFailure.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include <sqlite3.h>

#include "store/StoreEngine.h"

namespace store::sqlite {

/// Throws the failure for a result code. `database` may be null.
[[noreturn]] void fail(sqlite3* database, int code);

enum class Opening {
    Existing,
    New,
    /// A file that nobody can change: its log is ignored, and no files are created next to it.
    Unchanging,
};

class Database {
  public:
    Database(const std::string& path, Opening opening);

    sqlite3* get() const { return m_database.get(); }
    void run(const char* statements);
    /// The first column of the first row, or 0 without a row.
    std::int64_t number(const char* query);

  private:
    struct Close {
        void operator()(sqlite3* database) const { sqlite3_close(database); }
    };

    std::unique_ptr<sqlite3, Close> m_database;
};

class Statement {
  public:
    Statement(Database& database, const char* text);

    /// A running statement with its arguments, in order: numbers, or bytes, which are not copied
    /// and must stay valid. After this object is destroyed, the statement can run again.
    class Run {
      public:
        ~Run();
        Run(const Run&) = delete;
        Run& operator=(const Run&) = delete;

        /// True for a row, false at the end.
        bool step();
        /// Runs a statement without rows.
        void finish() {
            while (step()) {
            }
        }

        std::int64_t number(int column) const { return sqlite3_column_int64(m_statement, column); }
        /// Valid until the next step.
        std::string_view bytes(int column) const;
        std::string text(int column) const { return std::string(bytes(column)); }
        bool isNull(int column) const {
            return sqlite3_column_type(m_statement, column) == SQLITE_NULL;
        }

      private:
        friend class Statement;
        template<class... Arguments>
        explicit Run(sqlite3_stmt* statement, const Arguments&... arguments)
            : m_statement(statement) {
            int index = 0;
            (bind(++index, arguments), ...);
        }
        Run(sqlite3_stmt* statement, std::int64_t first, std::int64_t second,
            const std::vector<std::string>& names)
            : Run(statement, first, second) {
            for (std::size_t i = 0; i < names.size(); ++i) {
                bind(static_cast<int>(i) + 3, names[i]);
            }
        }

        void bind(int index, std::int64_t number);
        void bind(int index, std::string_view bytes);

        sqlite3_stmt* const m_statement;
    };

    template<class... Arguments>
    Run run(const Arguments&... arguments) {
        return Run(m_statement.get(), arguments...);
    }
    /// Runs with two numbers and a list of names.
    Run runList(std::int64_t first, std::int64_t second, const std::vector<std::string>& names) {
        return Run(m_statement.get(), first, second, names);
    }

  private:
    struct Finalize {
        void operator()(sqlite3_stmt* statement) const { sqlite3_finalize(statement); }
    };

    std::unique_ptr<sqlite3_stmt, Finalize> m_statement;
};

/// A writing transaction; it waits for earlier writers. Rolled back unless committed.
class Transaction {
  public:
    explicit Transaction(Database& database);
    ~Transaction();
    Transaction(const Transaction&) = delete;
    Transaction& operator=(const Transaction&) = delete;

    void commit();

  private:
    Database& m_database;
    bool m_open = true;
};

/// Makes several reading statements see one moment.
class ReadTransaction {
  public:
    explicit ReadTransaction(Database& database) : m_database(database) { m_database.run("BEGIN"); }
    ~ReadTransaction();
    ReadTransaction(const ReadTransaction&) = delete;
    ReadTransaction& operator=(const ReadTransaction&) = delete;

  private:
    Database& m_database;
};

} // namespace store::sqlite
