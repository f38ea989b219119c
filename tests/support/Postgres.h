// SPDX-License-Identifier: Apache-2.0
// PostgreSQL servers for tests.
#pragma once

#include <memory>
#include <string>

#include "ScratchFolder.h"

struct pg_conn;

namespace support {

/// A connection that bypasses the store. Throws std::runtime_error.
class BarePostgres {
  public:
    /// Connects to a connection service.
    explicit BarePostgres(const std::string& service);

    /// Runs SQL and returns the first value of the last statement's result, or "".
    std::string run(const std::string& statements) const;
    pg_conn* get() const { return m_connection.get(); }

  private:
    std::unique_ptr<pg_conn, void (*)(pg_conn*)> m_connection;
};

/// An empty database on the server shared by the tests. ctest starts that server; for a program run
/// by hand, scripts/with-postgres.sh does. During its lifetime, the service "room" in PGSERVICEFILE
/// refers to it.
class PostgresRoom {
  public:
    PostgresRoom();
    ~PostgresRoom();
    PostgresRoom(const PostgresRoom&) = delete;
    PostgresRoom& operator=(const PostgresRoom&) = delete;

    /// Adds a service like the room's, with these lines replaced.
    void addService(const std::string& name, const std::string& lines) const;

  private:
    const ScratchFolder m_folder;
    std::string m_lines;
};

/// A private server that a test can stop. During its lifetime, the service "tintgate" in
/// PGSERVICEFILE refers to it.
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
    std::string m_former; ///< The previous PGSERVICEFILE.
};

} // namespace support
