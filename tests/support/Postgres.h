// SPDX-License-Identifier: Apache-2.0
// PostgreSQL servers for tests.
#pragma once

#include <memory>
#include <string>

#include "ScratchFolder.h"

struct pg_conn;

namespace support {

/// A connection for what a test does behind a store's back. Throws std::runtime_error.
class BarePostgres {
  public:
    /// To a connection service.
    explicit BarePostgres(const std::string& service);

    /// Runs SQL; the first value of the last statement's result, or "".
    std::string run(const std::string& statements) const;
    pg_conn* get() const { return m_connection.get(); }

  private:
    std::unique_ptr<pg_conn, void (*)(pg_conn*)> m_connection;
};

/// An empty database on the server that the tests share: ctest starts it, and for a program run by
/// hand scripts/with-postgres.sh. While this lives, PGSERVICEFILE leads to it by the service
/// "room".
class PostgresRoom {
  public:
    PostgresRoom();
    ~PostgresRoom();
    PostgresRoom(const PostgresRoom&) = delete;
    PostgresRoom& operator=(const PostgresRoom&) = delete;

    /// Adds a service with these lines in place of the room's, which it has otherwise.
    void addService(const std::string& name, const std::string& lines) const;

  private:
    const ScratchFolder m_folder;
    std::string m_lines;
};

/// A server of a test's own, to be stopped. While this lives, PGSERVICEFILE leads to it by the
/// service "tintgate".
class PostgresServer {
  public:
    PostgresServer();
    ~PostgresServer();
    PostgresServer(const PostgresServer&) = delete;
    PostgresServer& operator=(const PostgresServer&) = delete;

    void stop(const std::string& mode) const;
    void startAgain() const;

  private:
    void control(const std::string& word, const std::string& more = {}) const;

    std::string m_folder;
    std::string m_former; ///< PGSERVICEFILE.
};

} // namespace support
