// SPDX-License-Identifier: Apache-2.0
#include "Postgres.h"

#include <cstdlib>
#include <fstream>
#include <stdexcept>

#include <libpq-fe.h>
#include <unistd.h>

#include "RunProgram.h"

namespace support {

namespace {

constexpr const char* serviceFile = "PGSERVICEFILE";

std::string environment(const char* name) {
    const char* const value = std::getenv(name);
    return value == nullptr ? "" : value;
}

/// The shared server's file, which a room hides.
const std::string& sharedServiceFile() {
    static const std::string file = environment(serviceFile);
    if (file.empty()) {
        throw std::runtime_error("these tests need a PostgreSQL server: run them by ctest, or by "
                                 "scripts/with-postgres.sh");
    }
    return file;
}

/// One database per process, since creating one takes a tenth of a second.
const std::string& databaseOfProcess() {
    static const std::string name = [] {
        const std::string made = "test_" + std::to_string(getpid());
        const BarePostgres server("tintgate");
        server.run("DROP DATABASE IF EXISTS " + made + " WITH (FORCE)");
        server.run("CREATE DATABASE " + made);
        return made;
    }();
    return name;
}

} // namespace

BarePostgres::BarePostgres(const std::string& service)
    : m_connection(PQconnectdb(("service=" + service).c_str()), PQfinish) {
    if (PQstatus(get()) != CONNECTION_OK) {
        throw std::runtime_error(PQerrorMessage(get()));
    }
    PQsetNoticeProcessor(
        get(), [](void*, const char*) {}, nullptr);
}

std::string BarePostgres::run(const std::string& statements) const {
    const std::unique_ptr<PGresult, void (*)(PGresult*)> result(PQexec(get(), statements.c_str()),
                                                                PQclear);
    const ExecStatusType status = PQresultStatus(result.get());
    if (status != PGRES_COMMAND_OK && status != PGRES_TUPLES_OK) {
        throw std::runtime_error(statements + ": " + PQerrorMessage(get()));
    }
    return PQntuples(result.get()) > 0 ? PQgetvalue(result.get(), 0, 0) : "";
}

PostgresRoom::PostgresRoom() {
    setenv(serviceFile, sharedServiceFile().c_str(), 1);
    const std::string database = databaseOfProcess();
    // The first of several lines for the same setting counts.
    const std::string shared = contentsOf(sharedServiceFile());
    m_lines = "dbname=" + database + shared.substr(shared.find('\n'));
    setenv(serviceFile, m_folder.write("pg_service.conf", "[room]\n" + m_lines).c_str(), 1);
    BarePostgres("room").run("DROP SCHEMA IF EXISTS tintgate CASCADE");
}

PostgresRoom::~PostgresRoom() {
    setenv(serviceFile, sharedServiceFile().c_str(), 1);
}

void PostgresRoom::addService(const std::string& name, const std::string& lines) const {
    std::ofstream(m_folder.path("pg_service.conf"), std::ios::app) << "[" << name << "]\n"
                                                                   << lines << "\n"
                                                                   << m_lines;
}

PostgresServer::PostgresServer() : m_former(environment(serviceFile)) {
    // Outside the build tree, so that the server's user has access and the path is short.
    std::string folder = "/tmp/tintgate-server-XXXXXX";
    if (mkdtemp(folder.data()) == nullptr) {
        throw std::runtime_error("no folder for a server");
    }
    m_folder = folder;
    control("start");
    setenv(serviceFile, (m_folder + "/pg_service.conf").c_str(), 1);
}

PostgresServer::~PostgresServer() {
    setenv(serviceFile, m_former.c_str(), 1);
    try {
        control("remove");
    } catch (const std::exception&) { // Leaves files in /tmp.
    }
}

void PostgresServer::stop(const std::string& mode) const {
    control("stop", mode);
}

void PostgresServer::startAgain() const {
    control("again");
}

void PostgresServer::control(const std::string& word, const std::string& more) const {
    std::vector<std::string> command = {TINTGATE_SOURCE_DIR "/scripts/with-postgres.sh", word,
                                        m_folder};
    if (!more.empty()) {
        command.push_back(more);
    }
    RunOptions options;
    options.environment["PG_OPTIONS"] = "-c fsync=off"; // Disks don't fail in these tests.
    const Outcome outcome = support::run(command, options);
    if (outcome.exitCode != 0) {
        throw std::runtime_error(word + ": " + outcome.error);
    }
}

} // namespace support
