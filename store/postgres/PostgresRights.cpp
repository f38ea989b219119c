// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/PostgresRights.h"

namespace store::postgres {

namespace {

/// By table. A table that is not listed, whoever made it, gives nothing to either; one that this
/// store does not have is passed over.
struct TableRights {
    const char* table;
    const char* client;
    const char* reports;
};
constexpr TableRights tableRights[] = {
    {"store", "SELECT", "SELECT"},
    {"tickets", "SELECT, INSERT, DELETE, UPDATE (changes)", "SELECT"},
    {"keys", "SELECT, INSERT, UPDATE, DELETE", "SELECT"},
    {"highest_ids", "SELECT, INSERT, UPDATE", nullptr},
    {"job_blocks", "SELECT, INSERT, UPDATE", "SELECT"},
    {"users", "SELECT", nullptr}, // A login compares the hash at the client.
    // What a delivery replaces is kept, so that clients remove nothing.
    {"files", "SELECT, INSERT, UPDATE", "SELECT"},
    {"versions", "SELECT, INSERT", "SELECT"},
    {"contents", "SELECT, INSERT, UPDATE (size)", "SELECT"},
    {"pieces", "SELECT, INSERT", "SELECT"},
    // Refusals are counted.
    {"log", "INSERT, SELECT (time, event)", nullptr},
};

constexpr Statement roleState = {
    "SELECT pg_has_role(oid, (SELECT nspowner FROM pg_namespace WHERE nspname = 'tintgate'),"
    " 'USAGE') FROM pg_roles WHERE rolname = convert_from($1, 'UTF8')"};
constexpr Statement hasTable = {
    "SELECT to_regclass('tintgate.' || convert_from($1, 'UTF8')) IS NOT NULL"};

std::string quoted(const std::string& name) {
    std::string text = "\"";
    for (const char byte : name) {
        text += byte == '"' ? "\"\"" : std::string(1, byte);
    }
    return text + "\"";
}

} // namespace

void grantRights(Connection& connection, const std::string& role, Rights rights) {
    const Result state = connection.run(roleState, role);
    if (state.rows() == 0) {
        throw StoreFailure(Fault::Other, "the server has no role " + role);
    }
    if (state.number(0, 0) != 0) {
        throw StoreFailure(Fault::Other, "the role " + role +
                                             " owns the store, or all the server, "
                                             "and has all rights");
    }
    const std::string to = quoted(role);
    std::string statements = "REVOKE ALL ON ALL TABLES IN SCHEMA tintgate FROM " + to +
                             "; REVOKE ALL ON SCHEMA tintgate FROM " + to +
                             "; GRANT USAGE ON SCHEMA tintgate TO " + to;
    for (const auto& row : tableRights) {
        const char* const given = rights == Rights::Client ? row.client : row.reports;
        if (given != nullptr &&
            connection.run(hasTable, std::string_view(row.table)).number(0, 0) != 0) {
            statements +=
                std::string("; GRANT ") + given + " ON tintgate." + row.table + " TO " + to;
        }
    }
    connection.script(statements); // Without a transaction around them they are one.
}

} // namespace store::postgres
