// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/PostgresSchema.h"

#include <iterator>

#include "store/Engines.h"

namespace store::postgres {

namespace {

/// Each converts the previous format to the format of its number, counted from 1. They must never
/// change, because existing stores have used them.
constexpr const char* migrations[] = {
    // 1: tickets and users
    R"(
    CREATE TABLE tintgate.tickets (
        number  bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
        type    int NOT NULL,
        id      int NOT NULL,
        changes bigint NOT NULL DEFAULT 0,  -- counted up first by each change: the ticket's lock
        UNIQUE (type, id)
    ) WITH (fillfactor = 80);
    -- A name of any length is found by its hash: an index holds no more than 2,700 bytes.
    CREATE TABLE tintgate.keys (
        ticket bigint NOT NULL REFERENCES tintgate.tickets ON DELETE CASCADE,
        name   bytea NOT NULL,
        hash   bytea NOT NULL GENERATED ALWAYS AS (sha256(name)) STORED,
        value  bytea NOT NULL,
        change bigint NOT NULL,             -- the ticket's changes when this was written
        PRIMARY KEY (ticket, hash)
    ) WITH (fillfactor = 80);
    -- Measured numbers don't compress, and reading them is to cost no more than it must.
    ALTER TABLE tintgate.keys ALTER value SET STORAGE EXTERNAL;
    CREATE TABLE tintgate.highest_ids (
        type int PRIMARY KEY,
        id   int NOT NULL
    );
    CREATE TABLE tintgate.users (
        name     bytea PRIMARY KEY,
        hash     bytea NOT NULL,
        disabled boolean NOT NULL
    ))",
    // 2: files
    R"(
    -- A content never changes. It belongs to one path, and may be there under several numbers.
    CREATE TABLE tintgate.contents (
        number bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
        size   bigint NOT NULL DEFAULT 0
    );
    CREATE TABLE tintgate.pieces (
        content  bigint NOT NULL REFERENCES tintgate.contents ON DELETE CASCADE,
        position int NOT NULL,
        bytes    bytea NOT NULL,
        PRIMARY KEY (content, position)
    );
    -- Folders have rows, so that no path can be both a file and a folder.
    CREATE TABLE tintgate.files (
        path    bytea PRIMARY KEY,
        content bigint REFERENCES tintgate.contents,  -- null: a folder
        written bigint                                -- seconds since 1970
    );
    CREATE INDEX ON tintgate.files (content);
    CREATE TABLE tintgate.versions (
        path    bytea NOT NULL REFERENCES tintgate.files,
        number  int NOT NULL,
        content bigint NOT NULL REFERENCES tintgate.contents,
        written bigint NOT NULL,
        PRIMARY KEY (path, number)
    );
    CREATE INDEX ON tintgate.versions (content))",
    // 3: the overview of jobs, as JobOverview.h describes it; numbers of versions are used once
    R"(
    ALTER TABLE tintgate.files ADD last_version int NOT NULL DEFAULT 0;
    UPDATE tintgate.files SET last_version = highest FROM
        (SELECT path, max(number) AS highest FROM tintgate.versions GROUP BY path) AS known
        WHERE files.path = known.path;
    CREATE TABLE tintgate.job_blocks (
        number  int PRIMARY KEY,
        content bytea NOT NULL
    ) WITH (fillfactor = 70);
    INSERT INTO tintgate.job_blocks (number, content)
    SELECT block, string_agg(coalesce(entry, '\x0000000000000000000000000000000000000000000000000000'),
                             '' ORDER BY place)
    FROM (SELECT DISTINCT id / 64 AS block FROM tintgate.tickets WHERE type = 3) AS blocks
    CROSS JOIN generate_series(0, 63) AS place
    LEFT JOIN (
        SELECT id, '\x01'::bytea || string_agg(
            CASE WHEN value IS NULL THEN '\x0000000000'
                 -- one int, at position 0, as KeyBytes.h describes
                 WHEN length(value) = 10 AND substring(value FOR 6) = '\x010201000000'
                 THEN '\x02'::bytea || substring(value FROM 7)
                 ELSE '\xff00000000' END, '' ORDER BY slot) AS entry
        FROM tintgate.tickets
        CROSS JOIN (VALUES (1, 'Input/SubType'::bytea), (2, 'Job/Display/Status'),
                           (3, 'Remote/ShowInVerifier'), (4, 'Input/FileType'),
                           (5, 'Workflow/Verify/Active')) AS slots (slot, slot_name)
        LEFT JOIN tintgate.keys ON ticket = tickets.number AND hash = sha256(slot_name)
        WHERE type = 3 GROUP BY id
    ) AS entries ON id = block * 64 + place
    GROUP BY block)",
};
constexpr int format = std::size(migrations);

/// The log, which is no part of the format: a store works without it, and one that was made before
/// there was a log gets it from an upgrade. Whoever may add to it can't read or shorten it, which
/// the trigger does as the table's owner.
constexpr const char* logTable = R"(
    CREATE TABLE tintgate.log (
        number bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
        time   bigint NOT NULL,                                -- seconds since 1970
        event  bytea NOT NULL CHECK (length(event) <= 20),     -- as eventName gives it
        who    bytea NOT NULL CHECK (length(who) <= 200),
        origin bytea NOT NULL CHECK (length(origin) <= 200),
        what   bytea NOT NULL CHECK (length(what) <= 500)
    );
    CREATE OR REPLACE FUNCTION tintgate.shorten_log() RETURNS trigger LANGUAGE plpgsql
        SECURITY DEFINER SET search_path = pg_catalog AS $$
    BEGIN
        DELETE FROM tintgate.log WHERE number <= NEW.number - 10000;
        RETURN NULL;
    END $$;
    REVOKE ALL ON FUNCTION tintgate.shorten_log FROM PUBLIC;
    CREATE TRIGGER shorten AFTER INSERT ON tintgate.log
        FOR EACH ROW WHEN (NEW.number % 100 = 0) EXECUTE FUNCTION tintgate.shorten_log())";

constexpr const char* firstTables = R"(
    CREATE SCHEMA tintgate;
    CREATE TABLE tintgate.store (
        format  int NOT NULL,
        copying boolean NOT NULL,
        the_one boolean PRIMARY KEY DEFAULT true CHECK (the_one)
    );
    INSERT INTO tintgate.store (format, copying) VALUES (0, )";

constexpr Statement hasSchema = {
    "SELECT EXISTS (SELECT FROM pg_namespace WHERE nspname = 'tintgate')"};
constexpr Statement hasLog = {"SELECT to_regclass('tintgate.log') IS NOT NULL"};
constexpr Statement state = {"SELECT format, copying FROM tintgate.store"};
constexpr Statement lockedState = {"SELECT format FROM tintgate.store FOR UPDATE"};
constexpr Statement setFormat = {"UPDATE tintgate.store SET format = $1"};
constexpr Statement endCopy = {"UPDATE tintgate.store SET copying = false"};
constexpr Statement addTicket = {
    "INSERT INTO tintgate.tickets (type, id) VALUES (0, 0) RETURNING number"};
constexpr Statement addKey = {
    "INSERT INTO tintgate.keys (ticket, name, value, change) VALUES ($1, $2, $3, 0)"};

struct State {
    std::int64_t format;
    bool copying;
};

State stateOf(Connection& connection) {
    try {
        const Result row = connection.run(state);
        if (row.rows() == 1) {
            return {row.number(0, 0), row.number(0, 1) != 0};
        }
    } catch (const StoreFailure& failure) {
        // No such schema or table, or none that this user may read.
        if (failure.status != Fault::Damaged && failure.status != Fault::ReadOnly) {
            throw;
        }
    }
    throw StoreFailure(Fault::Missing, "the server's database holds no store");
}

void addLog(Connection& connection) {
    if (connection.run(hasLog).number(0, 0) == 0) {
        connection.script(logTable);
    }
}

void migrate(Connection& connection, std::int64_t from) {
    // Without a limit, because a person waits for it, however large the store is.
    connection.script("SET LOCAL statement_timeout = 0");
    for (std::int64_t next = from; next < format; ++next) {
        connection.script(migrations[next]);
    }
    connection.run(setFormat, format);
    addLog(connection);
}

} // namespace

void checkSchema(Connection& connection) {
    const State found = stateOf(connection);
    if (found.copying) {
        throw StoreFailure(Fault::Missing, "this is a copy of a store that was not finished");
    }
    checkFormat(found.format, format);
}

void makeSchema(Connection& connection, const std::string* serverName) {
    if (connection.run(hasSchema).number(0, 0) != 0) {
        throw StoreFailure(Fault::Exists,
                           "the server's database has a schema \"tintgate\" already");
    }
    Transaction transaction(connection);
    transaction.finish();
    connection.script(std::string(firstTables) + (serverName == nullptr ? "true)" : "false)"));
    migrate(connection, 0);
    if (serverName != nullptr) {
        const std::int64_t ticket = connection.run(addTicket).number(0, 0);
        for (const auto& [name, value] : systemKeys(*serverName)) {
            connection.run(addKey, ticket, name, value);
        }
    }
    transaction.commit();
}

bool isUnfinishedCopy(Connection& connection) {
    return connection.run(hasSchema).number(0, 0) != 0 && stateOf(connection).copying;
}

void finishCopy(Connection& connection) {
    connection.run(endCopy);
}

bool upgradeSchema(Connection& connection) {
    const State found = stateOf(connection);
    if (found.copying || found.format > format) {
        checkSchema(connection);
    }
    Transaction transaction(connection);
    transaction.finish();
    // If two upgrades run at once, the second finds nothing to do.
    const std::int64_t from = connection.run(lockedState).number(0, 0);
    if (from >= format) {
        addLog(connection);
        transaction.commit();
        return false;
    }
    migrate(connection, from);
    transaction.commit();
    return true;
}

} // namespace store::postgres
