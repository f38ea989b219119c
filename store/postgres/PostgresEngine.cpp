// SPDX-License-Identifier: Apache-2.0
// A store in the database of a PostgreSQL server; PostgresSchema.cpp has its tables.
//
// A key is stored as the bytes described in KeyBytes.h. A change is one transaction: it locks the
// ticket's row, fetches what it needs, writes, and commits. That is one round trip if no old value
// is needed, otherwise two.
#include <algorithm>
#include <chrono>
#include <map>
#include <utility>

#include "store/Engines.h"
#include "store/JobOverview.h"
#include "store/KeyBytes.h"
#include "store/postgres/Postgres.h"
#include "store/postgres/PostgresFiles.h"
#include "store/postgres/PostgresListing.h"
#include "store/postgres/PostgresRights.h"
#include "store/postgres/PostgresSchema.h"
#include "store/postgres/PostgresVerify.h"

namespace store {

namespace {

using postgres::ArrayReader;
using postgres::Connection;
using postgres::Result;
using postgres::Statement;
using postgres::Transaction;

constexpr Statement idsOf = {
    "SELECT ARRAY (SELECT id FROM tintgate.tickets WHERE type = $1 ORDER BY id)"};
constexpr Statement isThere = {
    "SELECT EXISTS (SELECT FROM tintgate.tickets WHERE type = $1 AND id = $2)"};

// Locks the row of the highest id before creating a ticket. All creations use this order of locks,
// so there are no deadlocks.
constexpr Statement createTicket = {
    "WITH raised AS (INSERT INTO tintgate.highest_ids AS highest (type, id) VALUES ($1, $2)"
    " ON CONFLICT (type) DO UPDATE SET id = greatest(highest.id, excluded.id) RETURNING type)"
    " INSERT INTO tintgate.tickets (type, id) SELECT type, $2 FROM raised ON CONFLICT DO NOTHING"};
constexpr Statement raiseHighest = {
    "INSERT INTO tintgate.highest_ids AS highest (type, id) VALUES ($1, $2)"
    " ON CONFLICT (type) DO UPDATE SET id = greatest(highest.id, excluded.id)"
    " RETURNING id"};
constexpr Statement allHighest = {"SELECT type, id FROM tintgate.highest_ids WHERE id > 0"};
constexpr Statement removeTicket = {"DELETE FROM tintgate.tickets WHERE type = $1 AND id = $2"};

// The overview of jobs: see JobOverview.h. A ticket's row is locked before its block, and a
// transaction touches only one ticket, so there are no deadlocks.
constexpr Statement allBlocks = {"SELECT number, content FROM tintgate.job_blocks"};
constexpr Statement addEntry = {
    "INSERT INTO tintgate.job_blocks AS block (number, content) SELECT $3, $4"
    " FROM tintgate.tickets WHERE type = $1 AND id = $2"
    " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid"
    " ON CONFLICT (number) DO UPDATE SET content = overlay(block.content PLACING $5 FROM $6)"};
constexpr Statement putEntry = {
    "UPDATE tintgate.job_blocks SET content = overlay(content PLACING $4 FROM $5) WHERE number = $3"
    " AND EXISTS (SELECT FROM tintgate.tickets WHERE type = $1 AND id = $2"
    " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid)"};
constexpr Statement removeJob = {
    "WITH gone AS (DELETE FROM tintgate.tickets WHERE type = $1 AND id = $2 RETURNING id),"
    " emptied AS (UPDATE tintgate.job_blocks"
    " SET content = overlay(content PLACING $4 FROM $5) FROM gone WHERE job_blocks.number = $3)"
    " SELECT count(*) FROM gone"};

// Omits a value that the caller has: one with the same ticket number and change.
constexpr Statement oneKey = {
    "SELECT number, change, CASE WHEN (number, change) <> ($4::bigint, $5::bigint) THEN value END"
    " FROM tintgate.tickets JOIN tintgate.keys ON ticket = number"
    " WHERE type = $1 AND id = $2 AND hash = sha256($3)"};
constexpr Statement allKeys = {
    "SELECT name, value FROM tintgate.tickets LEFT JOIN tintgate.keys ON ticket = number"
    " WHERE type = $1 AND id = $2"};
constexpr Statement exactKeys = {
    "SELECT name, value FROM tintgate.tickets LEFT JOIN tintgate.keys ON ticket = number AND"
    " hash = ANY (ARRAY (SELECT sha256(exact) FROM unnest($3::bytea[]) AS exact))"
    " WHERE type = $1 AND id = $2"};
// Names have no index, because they may have any length. So a prefix requires a walk of the ticket.
constexpr Statement someKeys = {
    "SELECT name, value FROM tintgate.tickets LEFT JOIN tintgate.keys ON ticket = number AND"
    " (hash = ANY (ARRAY (SELECT sha256(exact) FROM unnest($3::bytea[]) AS exact)) OR"
    " EXISTS (SELECT FROM unnest($4::bytea[]) AS prefix"
    " WHERE substring(name FOR length(prefix)) = prefix))"
    " WHERE type = $1 AND id = $2"};
/// The transactions that have ended. As long as this is the same, nobody has committed anything.
constexpr Statement snapshot = {"SELECT pg_current_snapshot()::text"};

constexpr Statement placeOf = {
    "SELECT 'database ' || system_identifier || ' ' || oid FROM pg_control_system(), pg_database"
    " WHERE datname = current_database()"};

constexpr Statement lockTicket = {
    "UPDATE tintgate.tickets SET changes = changes + 1 WHERE type = $1 AND id = $2"
    " RETURNING number"};
constexpr Statement neededKeys = {
    "SELECT name, value FROM tintgate.tickets JOIN tintgate.keys ON ticket = number"
    " WHERE type = $1 AND id = $2"
    " AND hash = ANY (ARRAY (SELECT sha256(name) FROM unnest($3::bytea[]) AS name))"};

// These are sent before it is known whether there was a ticket to lock. They affect a ticket only
// if this transaction has touched it, so they ignore one that is created in between.
constexpr Statement putOneKey = {
    "INSERT INTO tintgate.keys (ticket, name, value, change) SELECT number, $3, $4, changes"
    " FROM tintgate.tickets WHERE type = $1 AND id = $2"
    " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid"
    " ON CONFLICT (ticket, hash) DO UPDATE SET value = excluded.value, change = excluded.change"};
constexpr Statement putKeys = {
    "INSERT INTO tintgate.keys (ticket, name, value, change)"
    " SELECT number, name, value, changes FROM tintgate.tickets,"
    " unnest($3::bytea[], $4::bytea[]) AS new (name, value) WHERE type = $1 AND id = $2"
    " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid"
    " ON CONFLICT (ticket, hash) DO UPDATE SET value = excluded.value, change = excluded.change"};
constexpr Statement deleteKeys = {
    "DELETE FROM tintgate.keys USING tintgate.tickets"
    " WHERE ticket = number AND type = $1 AND id = $2"
    " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid"
    " AND hash = ANY (ARRAY (SELECT sha256(name) FROM unnest($3::bytea[]) AS name))"};
constexpr Statement emptyTicket = {"DELETE FROM tintgate.keys USING tintgate.tickets"
                                   " WHERE ticket = number AND type = $1 AND id = $2"
                                   " AND tickets.xmin = pg_current_xact_id_if_assigned()::xid"};

constexpr Statement allUsers = {"SELECT name, hash, disabled FROM tintgate.users ORDER BY name"};
constexpr Statement oneUser = {"SELECT name, hash, disabled FROM tintgate.users WHERE name = $1"};
constexpr Statement putOneUser = {
    "INSERT INTO tintgate.users (name, hash, disabled) VALUES ($1, $2, $3)"
    " ON CONFLICT (name) DO UPDATE SET hash = excluded.hash, disabled = excluded.disabled"};
constexpr Statement addOneUser = {
    "INSERT INTO tintgate.users (name, hash, disabled) VALUES ($1, $2, $3) ON CONFLICT DO NOTHING"};
constexpr Statement removeOneUser = {"DELETE FROM tintgate.users WHERE name = $1"};

constexpr Statement hasLog = {"SELECT to_regclass('tintgate.log') IS NOT NULL"};
constexpr Statement addLogged = {
    "INSERT INTO tintgate.log (time, event, who, origin, what) VALUES ($1, $2, $3, $4, $5)"};
constexpr Statement allLogged = {
    "SELECT time, event, who, origin, what FROM tintgate.log ORDER BY number"};
constexpr Statement countRefusals = {
    "SELECT count(*) FROM tintgate.log WHERE event = $1 AND time >= $2"};
constexpr std::size_t longestName = 200; ///< As the log's table has it.

/// Held by the one who copies to the store. "TGAT" as a number.
constexpr Statement lockCopy = {"SELECT pg_try_advisory_lock(1413955924)"};
/// Before it is a store, nothing in it needs to be on the disk.
constexpr Statement writeLater = {"SELECT set_config('synchronous_commit', 'off', false)"};
constexpr Statement writeThrough = {"SELECT set_config('synchronous_commit', 'on', false)"};

using Names = std::vector<std::string_view>;

User userIn(const Result& rows, int row) {
    return {rows.text(row, 0), rows.text(row, 1), rows.number(row, 2) != 0};
}

class PostgresEngine : public StoreEngine {
  public:
    explicit PostgresEngine(Connection connection) : m_connection(std::move(connection)) {}
    ~PostgresEngine() override { writeLog(); }

    bool alive() override { return m_connection.isThere(); }

    std::string place() override {
        return m_connection.repeating([&] { return m_connection.run(placeOf).text(0, 0); });
    }

    std::uint64_t commits(std::chrono::milliseconds age) override {
        const auto now = std::chrono::steady_clock::now();
        const bool asks = now - m_asked >= age;
        if (m_snapshot.empty() || (asks && !isStillCurrent())) {
            noteChange();
        } else if (asks) {
            m_asked = now;
        }
        return m_commits;
    }

    std::vector<int> ids(int type) override {
        return m_connection.repeating([&] {
            forgetFormerServer();
            // Clients ask for their number and then for the ids.
            if (type == m_ids.type && m_connection.run(snapshot).bytes(0, 0) == m_ids.snapshot) {
                return m_ids.ids;
            }
            // Reads the snapshot first: a commit between the two only causes another fetch.
            m_connection.send(snapshot);
            m_connection.send(idsOf, type);
            const auto results = m_connection.finish();
            std::vector<int> ids;
            for (ArrayReader array(results[1].bytes(0, 0)); array.left() != 0;) {
                ids.push_back(static_cast<int>(postgres::numberOf(array.next())));
            }
            m_ids = {type, results[0].text(0, 0), ids};
            return ids;
        });
    }

    bool exists(int type, int id) override {
        return m_connection.repeating(
            [&] { return m_connection.run(isThere, type, id).number(0, 0) != 0; });
    }

    bool create(int type, int id) override {
        return m_connection.once([&] {
            if (exists(type, id)) {
                return false; // Does not wait for others.
            }
            noteChange();
            sendCreate(type, id);
            return m_connection.finish()[0].changed() != 0;
        });
    }

    int createNext(int type) override {
        return m_connection.once([&] {
            noteChange();
            Transaction transaction(m_connection);
            m_connection.send(raiseHighest, type, 0);
            const auto results = transaction.finish();
            int id = static_cast<int>(results[0].number(0, 0)) + 1;
            if (id > highestTicketId) {
                id = lowestFree(ids(type));
            }
            if (id > highestTicketId) {
                return -1;
            }
            sendCreate(type, id);
            return transaction.commit()[0].changed() != 0 ? id : -1;
        });
    }

    bool remove(int type, int id) override {
        return m_connection.once([&] {
            noteChange();
            sendRemove(type, id);
            return isRemoved(type, m_connection.finish()[0]);
        });
    }

    bool removeUnchanged(int type, int id, const TicketContent& known) override {
        return m_connection.once([&] {
            noteChange();
            Transaction transaction(m_connection);
            m_connection.send(lockTicket, type, id);
            m_connection.send(allKeys, type, id);
            const auto results = transaction.finish();
            if (results[0].rows() == 0 || !haveSameKeys(contentOf(results[1]), known)) {
                return false;
            }
            sendRemove(type, id);
            return isRemoved(type, transaction.commit()[0]);
        });
    }

    std::shared_ptr<const Elements> key(int type, int id, std::string_view name) override {
        return m_connection.repeating([&]() -> std::shared_ptr<const Elements> {
            forgetFormerServer();
            const bool again = type == m_last.type && id == m_last.id && name == m_last.name;
            const Result row =
                m_connection.run(oneKey, type, id, name, std::int64_t{again ? m_last.ticket : 0},
                                 std::int64_t{again ? m_last.change : 0});
            if (row.rows() == 0) {
                m_last = {};
                return nullptr;
            }
            if (!row.isNull(0, 2)) {
                m_last = {};
                auto elements = decoded(row.bytes(0, 2));
                m_last = {type,    id, std::string(name), row.number(0, 0), row.number(0, 1),
                          elements};
            }
            return m_last.elements;
        });
    }

    std::shared_ptr<const TicketContent> content(int type, int id,
                                                 const KeyFilter& filter) override {
        return m_connection.repeating([&]() -> std::shared_ptr<const TicketContent> {
            const Names exact(filter.exact().begin(), filter.exact().end());
            const Names prefixes(filter.prefixes().begin(), filter.prefixes().end());
            const Result rows = filter.all() ? m_connection.run(allKeys, type, id)
                                : prefixes.empty()
                                    ? m_connection.run(exactKeys, type, id, exact)
                                    : m_connection.run(someKeys, type, id, exact, prefixes);
            if (rows.rows() == 0) {
                return nullptr;
            }
            return std::make_shared<TicketContent>(contentOf(rows));
        });
    }

    void keysOfAll(int type, const std::vector<std::string>& names, std::size_t largestBytes,
                   const ShowKey& show) override {
        m_connection.repeating([&] {
            postgres::askForKeys(m_connection, type, names, largestBytes);
            postgres::showKeys(m_connection.finish()[0], names, show);
        });
    }

    void overview(JobOverview& jobs) override {
        m_connection.repeating([&] {
            forgetFormerServer();
            // The snapshot first: what is committed between the two only has it all fetched again.
            m_asked = std::chrono::steady_clock::now();
            m_connection.send(snapshot);
            m_connection.send(allBlocks);
            const auto results = m_connection.finish();
            // Sorted here: for so many bytes, the server would sort on its disk.
            std::vector<std::pair<int, int>> blocks;
            for (int row = 0; row < results[1].rows(); ++row) {
                blocks.emplace_back(static_cast<int>(results[1].number(row, 0)), row);
            }
            std::sort(blocks.begin(), blocks.end());
            jobs.clear();
            for (const auto& [number, row] : blocks) {
                jobs.add(number, results[1].bytes(row, 1));
            }
            m_snapshot = results[0].text(0, 0);
        });
    }

    bool change(int type, int id, const Scope& scope,
                const std::function<void(TicketContent&)>& work) override {
        writeLog();
        const auto once = [&] { return changeOnce(type, id, scope, work); };
        return scope.repeatable ? m_connection.repeating(once) : m_connection.once(once);
    }

    std::vector<User> users() override {
        return m_connection.repeating([&] {
            const Result rows = m_connection.run(allUsers);
            std::vector<User> users;
            for (int row = 0; row < rows.rows(); ++row) {
                users.push_back(userIn(rows, row));
            }
            return users;
        });
    }

    std::optional<User> user(std::string_view name) override {
        return m_connection.repeating([&] {
            const Result rows = m_connection.run(oneUser, name);
            return rows.rows() == 0 ? std::nullopt : std::optional(userIn(rows, 0));
        });
    }

    void putUser(const User& user) override {
        m_connection.repeating([&] {
            noteChange();
            m_connection.run(putOneUser, user.name, user.passwordHash, user.disabled);
        });
    }

    bool addUser(const User& user) override {
        return m_connection.once([&] {
            noteChange();
            return m_connection.run(addOneUser, user.name, user.passwordHash, user.disabled)
                       .changed() != 0;
        });
    }

    bool removeUser(std::string_view name) override {
        return m_connection.once([&] {
            noteChange();
            return m_connection.run(removeOneUser, name).changed() != 0;
        });
    }

    void putFile(std::string_view path, std::istream& from) override {
        writeLog();
        m_connection.once([&] {
            noteChange();
            m_files.put(path, from);
        });
    }
    void getFile(std::string_view path, std::ostream& to) override { m_files.get(path, to); }
    std::vector<FileEntry> files() override {
        return m_connection.repeating([&] { return m_files.list(); });
    }
    std::optional<FileEntry> fileAt(std::string_view path) override {
        return m_connection.repeating([&] { return m_files.at(path); });
    }
    std::vector<FileVersion> versions(std::string_view path) override {
        return m_connection.repeating([&] { return m_files.versions(path); });
    }
    void getVersion(std::string_view path, int number, std::ostream& to) override {
        m_files.getVersion(path, number, to);
    }
    void restoreVersion(std::string_view path, int number) override {
        m_connection.once([&] {
            noteChange();
            m_files.restoreVersion(path, number);
        });
    }
    int pruneVersions(std::string_view path, const Pruning& which) override {
        return m_connection.once([&] {
            noteChange();
            return m_files.pruneVersions(path, which);
        });
    }
    bool removeFile(std::string_view path, std::optional<int> highestVersion) override {
        return m_connection.once([&] {
            noteChange();
            return m_files.remove(path, highestVersion);
        });
    }
    int removeLeftovers() override { return 0; } // The server undoes interrupted ones.

    void log(const LogEntry& entry) noexcept override {
        try {
            m_toLog.push_back(entry);
            if (entry.event != Event::Login) {
                writeLog();
            }
        } catch (...) { // Best effort.
        }
    }
    std::vector<LogEntry> logEntries() override {
        return m_connection.repeating([&] {
            std::vector<LogEntry> entries;
            if (m_connection.run(hasLog).number(0, 0) == 0) {
                return entries;
            }
            const Result rows = m_connection.run(allLogged);
            for (int row = 0; row < rows.rows(); ++row) {
                if (const auto event = eventNamed(rows.bytes(row, 1))) {
                    entries.push_back({rows.number(row, 0), *event, rows.text(row, 2),
                                       rows.text(row, 3), rows.text(row, 4)});
                }
            }
            return entries;
        });
    }
    int refusalsSince(std::int64_t time) noexcept override {
        try {
            return static_cast<int>(
                m_connection.run(countRefusals, eventName(Event::Refusal), time).number(0, 0));
        } catch (...) {
            return 0;
        }
    }

    Verified verify(const ShowFault& show) override {
        // Not again after a loss: faults would be shown twice.
        return m_connection.once([&] { return postgres::verifyStore(m_connection, show); });
    }

    void backUp(const std::string&, const ShowProgress&) override {
        throw StoreFailure(Fault::Other, "a store on a server is backed up by the server's own "
                                         "means, such as pg_dump");
    }

    std::map<int, int> highestIds() override {
        return m_connection.repeating([&] {
            const Result rows = m_connection.run(allHighest);
            std::map<int, int> ids;
            for (int row = 0; row < rows.rows(); ++row) {
                ids.emplace(rows.number(row, 0), rows.number(row, 1));
            }
            return ids;
        });
    }
    void raiseHighestId(int type, int id) override {
        m_connection.repeating([&] { m_connection.run(raiseHighest, type, id); });
    }
    void placeVersion(std::string_view path, const FileVersion& version,
                      std::istream& from) override {
        m_connection.once([&] { m_files.placeVersion(path, version, from); });
    }
    int highestVersion(std::string_view path) override {
        return m_connection.repeating([&] { return m_files.highestVersion(path); });
    }
    void raiseHighestVersion(std::string_view path, int number) override {
        m_connection.repeating([&] { m_files.raiseHighestVersion(path, number); });
    }
    void finishCopy() override {
        m_connection.once([&] {
            m_connection.run(writeThrough); // Waits for everything before it.
            postgres::finishCopy(m_connection);
        });
    }

  private:
    /// The key fetched last.
    struct Fetched {
        int type = -1;
        int id = -1;
        std::string name;
        std::int64_t ticket = 0;
        std::int64_t change = 0;
        std::shared_ptr<const Elements> elements;
    };

    /// The ids fetched last.
    struct Ids {
        int type = -1;
        std::string snapshot; ///< From the time of the fetch or before.
        std::vector<int> ids;
    };

    /// Writes what is to be logged. A store without a log, or one that this role may not add to, is
    /// asked once.
    void writeLog() noexcept {
        try {
            const auto entries = std::exchange(m_toLog, {});
            for (const auto& entry : entries) {
                if (m_logs && !m_connection.lost()) {
                    m_connection.run(addLogged, entry.time, eventName(entry.event),
                                     entry.who.substr(0, longestName),
                                     entry.origin.substr(0, longestName),
                                     entry.what.substr(0, longestLogged));
                }
            }
        } catch (...) {
            m_logs = false;
        }
    }

    bool changeOnce(int type, int id, const Scope& scope,
                    const std::function<void(TicketContent&)>& work) {
        noteChange();
        Transaction transaction(m_connection);
        if (scope.make) {
            sendCreate(type, id);
            transaction.finish();
        }
        m_connection.send(lockTicket, type, id);
        TicketContent content;
        Names needed;
        for (const auto& [name, isNeeded] : scope.keys) {
            if (isNeeded && !scope.everything) {
                needed.push_back(name);
            }
        }
        if (!needed.empty()) {
            m_connection.send(neededKeys, type, id, needed);
            const auto results = transaction.finish();
            if (results[0].rows() == 0) {
                return false;
            }
            content = contentOf(results[1]);
        }
        const TicketContent before = content; // Shares the elements: a change creates others.
        work(content);
        const bool writes = write(type, id, scope, before, content) || scope.make;
        if (!needed.empty()) {
            if (writes) {
                transaction.commit();
            }
            return true;
        }
        const auto locked = writes ? transaction.commit() : transaction.finish();
        return locked[0].rows() != 0;
    }

    /// Whether nobody has committed since the last overview.
    bool isStillCurrent() {
        return m_connection.repeating([&] {
            forgetFormerServer();
            return m_connection.run(snapshot).bytes(0, 0) == m_snapshot;
        });
    }

    /// After a loss, the server may be another one with another state.
    void forgetFormerServer() {
        if (m_connection.generation() != m_generation) {
            m_generation = m_connection.generation();
            m_last = {};
            m_ids = {};
            noteChange();
        }
    }

    void noteChange() {
        m_snapshot.clear();
        ++m_commits;
    }

    /// Converts to the server's byte positions.
    static int position(std::size_t offset) { return static_cast<int>(offset) + 1; }

    /// Sends the creation of a ticket. The first result shows whether there is a new one.
    void sendCreate(int type, int id) {
        m_connection.send(createTicket, type, id);
        if (type == jobType) {
            std::string block(blockBytes, '\0');
            block[entryOffset(id)] = 1;
            m_connection.send(addEntry, type, id, blockOf(id), block,
                              block.substr(entryOffset(id), entryBytes), position(entryOffset(id)));
        }
    }

    /// Sends what removes a ticket.
    void sendRemove(int type, int id) {
        if (type == jobType) {
            m_connection.send(removeJob, type, id, blockOf(id), std::string(entryBytes, '\0'),
                              position(entryOffset(id)));
        } else {
            m_connection.send(removeTicket, type, id);
        }
    }
    static bool isRemoved(int type, const Result& result) {
        return (type == jobType ? result.number(0, 0) : result.changed()) != 0;
    }

    /// Sends the effect of a change on the overview.
    void writeOverview(int id, const Scope& scope, const TicketContent& before,
                       const TicketContent& after) {
        std::string entry(1, '\1');
        for (std::size_t i = 0; i < overviewKeys.size(); ++i) {
            const auto elements = after.find(overviewKeys[i]);
            const std::string slot = slotOf(elements.get());
            entry += slot;
            if (scope.everything) {
                continue;
            }
            const auto touched = scope.keys.find(overviewKeys[i]);
            if (touched != scope.keys.end() &&
                !(touched->second && elements == before.find(overviewKeys[i]))) {
                m_connection.send(putEntry, jobType, id, blockOf(id), slot,
                                  position(slotOffset(id, i)));
            }
        }
        if (scope.everything) {
            m_connection.send(putEntry, jobType, id, blockOf(id), entry, position(entryOffset(id)));
        }
    }

    /// A content from rows of name and value. A ticket without keys may have one row of nulls.
    static TicketContent contentOf(const Result& rows) {
        TicketContent content;
        for (int row = 0; row < rows.rows(); ++row) {
            if (!rows.isNull(row, 0)) {
                content.put(rows.text(row, 0), decoded(rows.bytes(row, 1)));
            }
        }
        return content;
    }

    /// Sends what turns the ticket's keys into those of after. False if there is nothing to write.
    bool write(int type, int id, const Scope& scope, const TicketContent& before,
               const TicketContent& after) {
        Names put;
        Names deleted;
        std::vector<std::string> bytes;
        const auto putKey = [&](const std::string& name, const Elements& elements) {
            put.push_back(name);
            bytes.push_back(keyBytes(elements));
        };
        if (scope.everything) {
            m_connection.send(emptyTicket, type, id);
            for (const auto& [name, elements] : after.keys()) {
                putKey(name, *elements);
            }
        } else {
            for (const auto& [name, needed] : scope.keys) {
                const auto elements = after.find(name);
                if (needed && elements == before.find(name)) {
                    continue;
                }
                if (elements != nullptr) {
                    putKey(name, *elements);
                } else {
                    deleted.push_back(name);
                }
            }
        }
        if (!deleted.empty()) {
            m_connection.send(deleteKeys, type, id, deleted);
        }
        if (put.size() == 1) { // The usual case: a server-side list costs more than its elements.
            m_connection.send(putOneKey, type, id, put[0], bytes[0]);
        } else if (!put.empty()) {
            m_connection.send(putKeys, type, id, put, Names(bytes.begin(), bytes.end()));
        }
        if (type == jobType) {
            writeOverview(id, scope, before, after);
        }
        return scope.everything || !deleted.empty() || !put.empty();
    }

    Connection m_connection;
    postgres::Files m_files{m_connection};
    Fetched m_last;
    unsigned m_generation = 0;
    std::uint64_t m_commits = 0;
    std::string m_snapshot; ///< Of the last overview; empty once somebody has committed since.
    std::chrono::steady_clock::time_point m_asked; ///< When that was still the server's.
    Ids m_ids;
    std::vector<LogEntry> m_toLog;
    bool m_logs = true;
};

std::unique_ptr<StoreEngine> openPostgres(const std::string& service, Access) {
    Connection connection(service, postgres::longestAbsence, postgres::checkSchema);
    postgres::checkSchema(connection);
    return std::make_unique<PostgresEngine>(std::move(connection));
}

void makePostgres(const std::string& service, const std::string& serverName) {
    Connection connection(service);
    postgres::makeSchema(connection, &serverName);
}

std::unique_ptr<StoreEngine> openPostgresCopy(const std::string& service) {
    Connection connection(service);
    if (connection.pooled()) {
        throw StoreFailure(Fault::Other, "a copy needs a session of the server for itself: name a "
                                         "service that does not lead through a pooler");
    }
    if (!postgres::isUnfinishedCopy(connection)) {
        postgres::makeSchema(connection, nullptr);
    }
    if (connection.run(lockCopy).number(0, 0) == 0) {
        throw StoreFailure(Fault::Busy, "somebody else is copying to this store");
    }
    connection.run(writeLater);
    connection.stayWithThisServer();
    return std::make_unique<PostgresEngine>(std::move(connection));
}

bool upgradePostgres(const std::string& service) {
    Connection connection(service);
    return postgres::upgradeSchema(connection);
}

void grantPostgres(const std::string& service, const std::string& role, Rights rights) {
    Connection connection(service);
    postgres::checkSchema(connection);
    postgres::grantRights(connection, role, rights);
}

} // namespace

constinit const EngineKind postgresKind = {openPostgres, makePostgres, openPostgresCopy,
                                           upgradePostgres, grantPostgres};

} // namespace store
