// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/Sqlite.h"

#include <cctype>
#include <new>

namespace store::sqlite {

namespace {

Fault faultOf(int code) {
    switch (code & 0xFF) {
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return Fault::Busy;
    case SQLITE_FULL:
        return Fault::Full;
    case SQLITE_IOERR:
        return code == SQLITE_IOERR_WRITE || code == SQLITE_IOERR_SHMSIZE ? Fault::Full
                                                                          : Fault::Other;
    case SQLITE_READONLY:
    case SQLITE_PERM:
        return Fault::ReadOnly;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
        return Fault::Damaged;
    case SQLITE_CANTOPEN:
        return Fault::Missing;
    default:
        return Fault::Other;
    }
}

} // namespace

void fail(sqlite3* database, int code) {
    if ((code & 0xFF) == SQLITE_NOMEM) {
        throw std::bad_alloc();
    }
    throw StoreFailure(faultOf(code),
                       std::string("the store's database: ") +
                           (database == nullptr ? sqlite3_errstr(code) : sqlite3_errmsg(database)));
}

namespace {

/// A file name as a URI, with all special characters escaped.
std::string uriOf(const std::string& path) {
    constexpr const char* digits = "0123456789ABCDEF";
    std::string uri = "file:";
    for (const unsigned char byte : path) {
        if (std::isalnum(byte) != 0 || byte == '/') {
            uri += static_cast<char>(byte);
        } else {
            uri += {'%', digits[byte >> 4], digits[byte & 15]};
        }
    }
    return uri;
}

} // namespace

Database::Database(const std::string& path, Opening opening) {
    sqlite3* opened = nullptr;
    const bool unchanging = opening == Opening::Unchanging;
    const std::string name = unchanging ? uriOf(path) + "?immutable=1" : path;
    const int flags =
        unchanging ? SQLITE_OPEN_READONLY | SQLITE_OPEN_URI
                   : SQLITE_OPEN_READWRITE | (opening == Opening::New ? SQLITE_OPEN_CREATE : 0);
    const int code = sqlite3_open_v2(name.c_str(), &opened,
                                     flags | SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE, nullptr);
    m_database.reset(opened);
    if (code != SQLITE_OK) {
        fail(opened, code);
    }
    sqlite3_busy_timeout(opened, longestWaitMilliseconds);
}

void Database::run(const char* statements) {
    if (const int code = sqlite3_exec(get(), statements, nullptr, nullptr, nullptr)) {
        fail(get(), code);
    }
}

std::int64_t Database::number(const char* query) {
    Statement statement(*this, query);
    auto run = statement.run();
    return run.step() ? run.number(0) : 0;
}

Statement::Statement(Database& database, const char* text) {
    sqlite3_stmt* prepared = nullptr;
    const int code =
        sqlite3_prepare_v3(database.get(), text, -1, SQLITE_PREPARE_PERSISTENT, &prepared, nullptr);
    m_statement.reset(prepared);
    if (code != SQLITE_OK) {
        fail(database.get(), code);
    }
}

Statement::Run::~Run() {
    sqlite3_reset(m_statement);
    sqlite3_clear_bindings(m_statement);
}

bool Statement::Run::step() {
    const int code = sqlite3_step(m_statement);
    if (code != SQLITE_ROW && code != SQLITE_DONE) {
        fail(sqlite3_db_handle(m_statement), code);
    }
    return code == SQLITE_ROW;
}

std::string_view Statement::Run::bytes(int column) const {
    const void* const data = sqlite3_column_blob(m_statement, column);
    const auto size = static_cast<std::size_t>(sqlite3_column_bytes(m_statement, column));
    if (data == nullptr && size != 0) {
        throw std::bad_alloc();
    }
    return {static_cast<const char*>(data), size};
}

void Statement::Run::bind(int index, std::int64_t number) {
    if (const int code = sqlite3_bind_int64(m_statement, index, number)) {
        fail(sqlite3_db_handle(m_statement), code);
    }
}

void Statement::Run::bind(int index, std::string_view bytes) {
    // The data of an empty view may be null, which would bind NULL.
    const char* const data = bytes.data() == nullptr ? "" : bytes.data();
    if (const int code =
            sqlite3_bind_blob64(m_statement, index, data, bytes.size(), SQLITE_STATIC)) {
        fail(sqlite3_db_handle(m_statement), code);
    }
}

Transaction::Transaction(Database& database) : m_database(database) {
    m_database.run("BEGIN IMMEDIATE");
}

Transaction::~Transaction() {
    if (m_open) {
        sqlite3_exec(m_database.get(), "ROLLBACK", nullptr, nullptr, nullptr);
    }
}

ReadTransaction::~ReadTransaction() {
    sqlite3_exec(m_database.get(), "COMMIT", nullptr, nullptr, nullptr);
}

void Transaction::commit() {
    m_database.run("COMMIT"); // If this fails, the destructor undoes the transaction.
    m_open = false;
}

} // namespace store::sqlite
