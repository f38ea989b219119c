// SPDX-License-Identifier: Apache-2.0
// A store in one folder on a local disk:
//
//   tickets.db      tickets and users, a SQLite database in WAL mode (with tickets.db-wal and -shm
//                   next to it while it is open)
//   files/          see ServerFiles.h
//   log.txt         see LineFile.h; log.txt.old is the one before it
//
// Key names and values are blobs, which SQLite compares as bytes. A key is one row with a value in
// the form of KeyBytes.h. There is also the overview of JobOverview.h. PRAGMA user_version is the
// format.
#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <set>
#include <utility>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/statvfs.h>

#include "base/Descriptor.h"
#include "store/Engines.h"
#include "store/JobOverview.h"
#include "store/KeyBytes.h"
#include "store/LineFile.h"
#include "store/sqlite/Permissions.h"
#include "store/sqlite/ServerFiles.h"
#include "store/sqlite/Sqlite.h"
#include "store/sqlite/SqliteBackup.h"
#include "store/sqlite/WalWatch.h"

namespace store {

namespace {

using sqlite::Database;
using sqlite::Opening;
using sqlite::ReadTransaction;
using sqlite::Statement;
using sqlite::Transaction;

constexpr std::int64_t applicationId = 0x54474154;    // "TGAT", displayable by file(1).
constexpr std::int64_t unfinishedCopyId = 0x54474143; // "TGAC"
/// 1: tickets, keys, users. 2: the overview of jobs.
constexpr std::int64_t format = 2;

constexpr const char* overviewTable = R"(
    CREATE TABLE job_blocks (
        number  INTEGER PRIMARY KEY,  -- as JobOverview.h describes
        content BLOB NOT NULL
    ) STRICT;
)";

constexpr const char* tables = R"(
    CREATE TABLE tickets (
        number  INTEGER PRIMARY KEY,
        type    INTEGER NOT NULL,
        id      INTEGER NOT NULL,
        changes INTEGER NOT NULL DEFAULT 0,  -- written first by each change: the ticket's lock
        UNIQUE (type, id)
    ) STRICT;
    CREATE TABLE keys (
        ticket INTEGER NOT NULL REFERENCES tickets (number) ON DELETE CASCADE,
        name   BLOB NOT NULL,
        value  BLOB NOT NULL,
        UNIQUE (ticket, name)
    ) STRICT;
    CREATE TABLE highest_ids (type INTEGER PRIMARY KEY, id INTEGER NOT NULL) STRICT;
    CREATE TABLE users (
        name     BLOB PRIMARY KEY,
        hash     BLOB NOT NULL,
        disabled INTEGER NOT NULL
    ) STRICT, WITHOUT ROWID;
)";

std::string databasePath(const std::string& folder) {
    return folder + "/tickets.db";
}

/// The folder's resolved path. It starts with a slash, because SQLite would treat a name that
/// starts with "file:" as a URI.
std::string realPath(const std::string& address) {
    if (address.empty() || address.find('\0') != std::string::npos) {
        throw StoreFailure(Fault::Missing, "no store has an empty name");
    }
    const std::unique_ptr<char, void (*)(void*)> path(realpath(address.c_str(), nullptr), free);
    if (path == nullptr) {
        throw StoreFailure(Fault::Missing, address + ": " + std::strerror(errno));
    }
    return path.get();
}

/// Checks that a database is of this kind. This is its first access, which opens its log.
void checkKind(Database& database, const std::string& folder, std::int64_t kind) {
    const std::int64_t found = database.number("PRAGMA application_id");
    if (found != kind) {
        throw StoreFailure(Fault::Missing,
                           found == unfinishedCopyId
                               ? folder + " is a copy of a store that was not finished"
                               : databasePath(folder) + " is not the database of a store");
    }
    // The file's content is data and must never be executed.
    database.run("PRAGMA trusted_schema = OFF");
}

/// The database in a store's folder, in any format, if it is of this kind.
Database openDatabase(const std::string& folder, std::int64_t kind = applicationId) {
    const std::string path = databasePath(folder);
    struct stat status;
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode)) {
        throw StoreFailure(Fault::Missing, folder + " holds no store");
    }
    Database database(path, Opening::Existing);
    if (sqlite3_db_readonly(database.get(), "main") == 1) {
        throw StoreFailure(Fault::ReadOnly, path + " can't be written");
    }
    checkKind(database, folder, kind);
    return database;
}

bool isMountedForReading(const std::string& folder) {
    struct statvfs mount;
    return statvfs(folder.c_str(), &mount) == 0 && (mount.f_flag & ST_RDONLY) != 0;
}

/// A store's opened database, and whether others may use it at the same time.
struct OpenedDatabase {
    Database database;
    bool shared;
};

/// For reading, also opens a database without the shared index of its log, because a full disk has
/// no room for the index and a read-only folder does not allow it.
OpenedDatabase openDatabase(const std::string& folder, Access access, std::int64_t kind) {
    const std::string path = databasePath(folder);
    try {
        return {openDatabase(folder, kind), true};
    } catch (const StoreFailure& failure) {
        if (access != Access::Read) {
            throw;
        }
        if (failure.status == Fault::Full) {
            Database database(path, Opening::Existing);
            database.run("PRAGMA locking_mode = EXCLUSIVE"); // The index is then in memory.
            checkKind(database, folder, kind);
            return {std::move(database), false};
        }
        if (!isMountedForReading(folder)) {
            throw;
        }
    }
    struct stat log;
    const bool hasLog = stat((path + "-wal").c_str(), &log) == 0 && log.st_size != 0;
    Database database(path, hasLog ? Opening::Existing : Opening::Unchanging);
    try {
        checkKind(database, folder, kind);
    } catch (const StoreFailure&) {
        if (!hasLog) {
            throw;
        }
        throw StoreFailure(Fault::ReadOnly,
                           path + " was not closed, and can't be read without writing: copy the "
                                  "folder to a disk that can be written");
    }
    return {std::move(database), false};
}

void checkFormat(Database& database) {
    store::checkFormat(database.number("PRAGMA user_version"), format);
}

void setKind(Database& database, std::int64_t kind) {
    database.run(("PRAGMA application_id = " + std::to_string(kind)).c_str());
}

constexpr const char* databaseName = "the database";

constexpr std::size_t logParts = 4; ///< Event, who, origin and what.

/// Shows each block of the overview as the keys of its jobs say it must be, by number.
void showBlocks(Database& database,
                const std::function<void(int number, const std::string&)>& show) {
    Statement jobs(database, "SELECT id, number FROM tickets WHERE type = ? ORDER BY id");
    Statement key(database, "SELECT value FROM keys WHERE ticket = ? AND name = ?");
    // As anything that is no single number: readers then look at the key itself.
    const Elements empty;
    const std::string unreadable = slotOf(&empty);
    int number = -1;
    std::string block;
    auto run = jobs.run(jobType);
    while (run.step()) {
        const int id = static_cast<int>(run.number(0));
        if (blockOf(id) != number) {
            if (number >= 0) {
                show(number, block);
            }
            number = blockOf(id);
            block.assign(blockBytes, '\0');
        }
        block[entryOffset(id)] = 1;
        for (std::size_t i = 0; i < overviewKeys.size(); ++i) {
            auto value = key.run(run.number(1), overviewKeys[i]);
            if (value.step()) {
                // A damaged key is left to those who read it.
                const auto elements = elementsFromBytes(value.bytes(0));
                block.replace(slotOffset(id, i), slotBytes,
                              elements == nullptr ? unreadable : slotOf(elements.get()));
            }
        }
    }
    if (number >= 0) {
        show(number, block);
    }
}

void verifyOverview(Database& database, const StoreEngine::ShowFault& show) {
    Statement blocks(database, "SELECT number, content FROM job_blocks ORDER BY number");
    std::map<std::int64_t, std::string> known;
    auto run = blocks.run();
    while (run.step()) {
        known.emplace(run.number(0), run.text(1));
    }
    showBlocks(database, [&](int number, const std::string& block) {
        const auto found = known.find(number);
        if (found == known.end() || found->second != block) {
            showOverview(number, show);
        }
        known.erase(number);
    });
    for (const auto& [number, block] : known) { // Those of deleted jobs alone are all zero.
        if (block != std::string(blockBytes, '\0')) {
            showOverview(number, show);
        }
    }
}

/// Within a transaction that reads. How many tickets there are.
std::int64_t verifyTickets(Database& database, const StoreEngine::ShowFault& show) {
    Statement integrity(database, "PRAGMA integrity_check");
    auto whole = integrity.run();
    while (whole.step()) {
        if (const std::string words = whole.text(0); words != "ok") {
            show(databaseName, words);
        }
    }
    if (database.number("SELECT count(*) FROM keys WHERE ticket NOT IN"
                        " (SELECT number FROM tickets)") != 0) {
        show(databaseName, "it has keys of tickets that are not there");
    }
    if (database.number("SELECT count(*) FROM (SELECT type, max(id) AS highest FROM tickets"
                        " GROUP BY type) AS used LEFT JOIN highest_ids USING (type)"
                        " WHERE highest > coalesce(id, 0)") != 0) {
        show(databaseName, "it gives the number of a ticket a second time");
    }
    Statement keys(database, "SELECT type, id, name, value FROM tickets JOIN keys"
                             " ON ticket = number");
    auto run = keys.run();
    while (run.step()) {
        if (elementsFromBytes(run.bytes(3)) == nullptr) {
            showDamagedKey(static_cast<int>(run.number(0)), static_cast<int>(run.number(1)),
                           run.bytes(2), show);
        }
    }
    verifyOverview(database, show);
    return database.number("SELECT count(*) FROM tickets");
}

/// The first bytes behind all that start with a prefix; empty where nothing is behind them.
std::string endOfPrefix(std::string prefix) {
    while (!prefix.empty() && prefix.back() == '\xFF') {
        prefix.pop_back();
    }
    if (!prefix.empty()) {
        prefix.back() = static_cast<char>(static_cast<unsigned char>(prefix.back()) + 1);
    }
    return prefix;
}

class SqliteEngine : public StoreEngine {
  public:
    explicit SqliteEngine(const std::string& folder, Access access = Access::ReadAndWrite,
                          std::int64_t kind = applicationId)
        : SqliteEngine(openDatabase(folder, access, kind), folder) {}

    bool alive() override { return true; }

    std::string place() override {
        struct stat status;
        if (stat(databasePath(m_folder).c_str(), &status) != 0) {
            throw StoreFailure(Fault::Missing, m_folder + ": " + std::strerror(errno));
        }
        return "file " + std::to_string(status.st_dev) + " " + std::to_string(status.st_ino);
    }

    std::uint64_t commits(std::chrono::milliseconds) override { return m_watch.commits(); }

    std::vector<int> ids(int type) override {
        std::vector<int> ids;
        auto run = m_ids.run(type);
        while (run.step()) {
            ids.push_back(static_cast<int>(run.number(0)));
        }
        return ids;
    }

    bool exists(int type, int id) override { return m_number.run(type, id).step(); }

    bool create(int type, int id) override {
        if (exists(type, id)) {
            return false; // Does not wait for writers.
        }
        Transaction transaction(m_database);
        if (!insert(type, id)) {
            return false;
        }
        transaction.commit();
        return true;
    }

    int createNext(int type) override {
        Transaction transaction(m_database);
        int id = 1;
        {
            auto run = m_highest.run(type);
            if (run.step()) {
                id = static_cast<int>(run.number(0)) + 1;
            }
        }
        if (id > highestTicketId) {
            id = lowestFree(ids(type));
        }
        if (id > highestTicketId || !insert(type, id)) {
            return -1;
        }
        transaction.commit();
        return id;
    }

    bool remove(int type, int id) override {
        if (!exists(type, id)) {
            return false;
        }
        Transaction transaction(m_database);
        const bool removed = removeTicket(type, id);
        transaction.commit();
        return removed;
    }

    bool removeUnchanged(int type, int id, const TicketContent& known) override {
        Transaction transaction(m_database);
        TicketContent stored;
        if (!take(m_content.run(type, id), stored) || !haveSameKeys(stored, known)) {
            return false;
        }
        removeTicket(type, id);
        transaction.commit();
        return true;
    }

    std::shared_ptr<const Elements> key(int type, int id, std::string_view name) override {
        auto run = m_key.run(type, id, name);
        return run.step() ? decoded(run.bytes(0)) : nullptr;
    }

    std::shared_ptr<const TicketContent> content(int type, int id,
                                                 const KeyFilter& filter) override {
        // Reading some keys must not cost reading all others. The result is from one moment: a
        // single statement, or several in a transaction.
        auto content = std::make_shared<TicketContent>();
        if (filter.all()) {
            return take(m_content.run(type, id), *content) ? content : nullptr;
        }
        if (filter.exact().size() == 1 && filter.prefixes().empty()) {
            return take(m_oneKey.run(type, id, *filter.exact().begin()), *content) ? content
                                                                                   : nullptr;
        }
        const ReadTransaction transaction(m_database);
        std::int64_t ticket = 0;
        {
            auto run = m_number.run(type, id);
            if (!run.step()) {
                return nullptr;
            }
            ticket = run.number(0);
        }
        for (const auto& name : filter.exact()) {
            take(m_namedKey.run(ticket, name), *content);
        }
        for (const auto& prefix : filter.prefixes()) {
            const std::string end = endOfPrefix(prefix);
            take(end.empty() ? m_keysFrom.run(ticket, prefix)
                             : m_keysBetween.run(ticket, prefix, end),
                 *content);
        }
        return content;
    }

    void keysOfAll(int type, const std::vector<std::string>& names, std::size_t largestBytes,
                   const ShowKey& show) override {
        std::string list;
        for (std::size_t i = 0; i < names.size(); ++i) {
            list += (i == 0 ? "?" : ", ?") + std::to_string(i + 3);
        }
        Statement statement(m_database,
                            ("SELECT t.id, k.name, CASE WHEN length(k.value) <= ?2 THEN k.value END"
                             " FROM tickets t CROSS JOIN keys k ON k.ticket = t.number"
                             " WHERE t.type = ?1 AND k.name IN (" +
                             list + ") ORDER BY t.id")
                                .c_str());
        auto run = statement.runList(type, static_cast<std::int64_t>(largestBytes), names);
        // These keys have few different values.
        std::map<std::string, std::shared_ptr<const Elements>, std::less<>> known;
        while (run.step()) {
            const auto name = std::find(names.begin(), names.end(), run.bytes(1));
            if (name == names.end()) { // Index and table disagree.
                throw StoreFailure(Fault::Damaged, "the store's keys can't be read");
            }
            std::shared_ptr<const Elements> elements;
            if (!run.isNull(2)) {
                const std::string_view bytes = run.bytes(2);
                auto same = known.find(bytes);
                if (same == known.end()) {
                    same = known.emplace(bytes, decoded(bytes)).first;
                }
                elements = same->second;
            }
            show(static_cast<int>(run.number(0)), static_cast<std::size_t>(name - names.begin()),
                 std::move(elements));
        }
    }

    void overview(JobOverview& jobs) override {
        jobs.clear();
        auto run = m_blocks.run();
        while (run.step()) {
            // Any other number is refused as damage.
            jobs.add(static_cast<int>(std::clamp<std::int64_t>(run.number(0), -1, INT_MAX)),
                     run.bytes(1));
        }
    }

    bool change(int type, int id, const Scope& scope,
                const std::function<void(TicketContent&)>& work) override {
        Transaction transaction(m_database);
        if (scope.make) {
            insert(type, id);
        }
        std::int64_t ticket = 0;
        {
            auto run = m_lock.run(type, id);
            if (!run.step()) {
                return false;
            }
            ticket = run.number(0);
            run.finish();
        }
        TicketContent content;
        for (const auto& [name, needed] : scope.keys) {
            if (needed && !scope.everything) {
                auto run = m_keyOf.run(ticket, name);
                if (run.step()) {
                    content.put(name, decoded(run.bytes(0)));
                }
            }
        }
        const TicketContent before = content; // Shares the elements: a change creates others.
        work(content);
        const bool written = write(ticket, scope, before, content);
        if (written && type == jobType) {
            writeOverview(id, scope, content);
        }
        if (written || scope.make) {
            transaction.commit();
        }
        return true;
    }

    std::vector<User> users() override {
        std::vector<User> users;
        auto run = m_users.run();
        while (run.step()) {
            users.push_back({run.text(0), run.text(1), run.number(2) != 0});
        }
        return users;
    }

    std::optional<User> user(std::string_view name) override {
        auto run = m_user.run(name);
        if (!run.step()) {
            return std::nullopt;
        }
        return User{run.text(0), run.text(1), run.number(2) != 0};
    }

    void putUser(const User& user) override {
        Transaction transaction(m_database);
        m_putUser.run(user.name, user.passwordHash, user.disabled ? 1 : 0).finish();
        transaction.commit();
    }

    bool addUser(const User& user) override {
        Transaction transaction(m_database);
        m_addUser.run(user.name, user.passwordHash, user.disabled ? 1 : 0).finish();
        const bool added = sqlite3_changes(m_database.get()) != 0;
        transaction.commit();
        return added;
    }

    bool removeUser(std::string_view name) override {
        Transaction transaction(m_database);
        m_removeUser.run(name).finish();
        const bool removed = sqlite3_changes(m_database.get()) != 0;
        transaction.commit();
        return removed;
    }

    void putFile(std::string_view path, std::istream& from) override { m_files.put(path, from); }
    void getFile(std::string_view path, std::ostream& to) override { m_files.get(path, to); }
    std::vector<FileEntry> files() override { return m_files.list(); }
    std::optional<FileEntry> fileAt(std::string_view path) override { return m_files.at(path); }
    std::vector<FileVersion> versions(std::string_view path) override {
        return m_files.versions(path);
    }
    void getVersion(std::string_view path, int number, std::ostream& to) override {
        m_files.getVersion(path, number, to);
    }
    void restoreVersion(std::string_view path, int number) override {
        m_files.restoreVersion(path, number);
    }
    int pruneVersions(std::string_view path, const Pruning& which) override {
        return m_files.pruneVersions(path, which);
    }
    bool removeFile(std::string_view path, std::optional<int> highestVersion) override {
        return m_files.remove(path, highestVersion);
    }
    int removeLeftovers() override { return m_files.removeLeftovers(); }

    void log(const LogEntry& entry) noexcept override {
        try {
            m_log.append(lineText(entry.time, {eventName(entry.event), entry.who, entry.origin,
                                               entry.what.substr(0, longestLogged)}),
                         [&](int file) {
                             const base::Descriptor folder(
                                 open(m_folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
                             Permissions::of(folder.get()).giveTo(file);
                         });
        } catch (...) { // Best effort.
        }
    }
    std::vector<LogEntry> logEntries() override {
        auto lines = m_log.formerLines(logParts);
        for (auto& line : m_log.lines(logParts)) {
            lines.push_back(std::move(line));
        }
        std::vector<LogEntry> entries;
        for (auto& line : lines) {
            if (const auto event = eventNamed(line.parts[0])) {
                entries.push_back({line.time, *event, std::move(line.parts[1]),
                                   std::move(line.parts[2]), std::move(line.parts[3])});
            }
        }
        return entries;
    }
    int refusalsSince(std::int64_t time) noexcept override {
        try {
            constexpr std::size_t recent = 1 << 15; // Some hundred lines.
            const auto lines = m_log.lines(logParts, recent);
            return static_cast<int>(
                std::count_if(lines.begin(), lines.end(), [&](const Line& line) {
                    return line.time >= time && line.parts[0] == eventName(Event::Refusal);
                }));
        } catch (...) {
            return 0;
        }
    }

    Verified verify(const ShowFault& show) override {
        Verified found;
        try {
            const ReadTransaction transaction(m_database);
            found.tickets = verifyTickets(m_database, show);
        } catch (const StoreFailure& failure) {
            if (failure.status != Fault::Damaged) {
                throw;
            }
            show(databaseName, failure.what());
        }
        m_files.verify(found, show);
        return found;
    }

    void backUp(const std::string& folder, const ShowProgress& progress) override {
        sqlite::backUp(m_database, m_files, m_folder, folder, progress);
    }

    std::map<int, int> highestIds() override {
        Statement statement(m_database, "SELECT type, id FROM highest_ids WHERE id > 0");
        auto run = statement.run();
        std::map<int, int> ids;
        while (run.step()) {
            ids.emplace(run.number(0), run.number(1));
        }
        return ids;
    }
    void raiseHighestId(int type, int id) override {
        Transaction transaction(m_database);
        m_raiseHighest.run(type, id).finish();
        transaction.commit();
    }
    void placeVersion(std::string_view path, const FileVersion& version,
                      std::istream& from) override {
        m_files.placeVersion(path, version, from);
    }
    int highestVersion(std::string_view path) override { return m_files.highestVersion(path); }
    void raiseHighestVersion(std::string_view path, int number) override {
        m_files.raiseHighestVersion(path, number);
    }
    void finishCopy() override { setKind(m_database, applicationId); }

  protected:
    Database& database() { return m_database; }
    ServerFiles& serverFiles() { return m_files; }

  private:
    SqliteEngine(OpenedDatabase opened, const std::string& folder)
        : m_database(std::move(opened.database)), m_ready(m_database), m_files(folder, false),
          m_watch(m_database, opened.shared), m_folder(folder), m_log(folder + "/log.txt", true) {}

    /// Checks the connection before a statement is prepared.
    struct Ready {
        explicit Ready(Database& database) {
            checkFormat(database);
            database.run("PRAGMA synchronous = FULL; PRAGMA foreign_keys = ON");
        }
    };

    /// Adds rows of name and value to a content. A ticket without keys may have one row of nulls.
    /// False if there are no rows.
    static bool take(Statement::Run run, TicketContent& content) {
        bool found = false;
        while (run.step()) {
            found = true;
            if (!run.isNull(0)) {
                content.put(run.text(0), decoded(run.bytes(1)));
            }
        }
        return found;
    }

    bool insert(int type, int id) {
        m_insert.run(type, id).finish();
        if (sqlite3_changes(m_database.get()) == 0) {
            return false;
        }
        m_raiseHighest.run(type, id).finish();
        if (type == jobType) {
            writeEntry(id, {{entryOffset(id), std::string(1, '\1')}});
        }
        return true;
    }

    bool removeTicket(int type, int id) {
        m_remove.run(type, id).finish();
        const bool removed = sqlite3_changes(m_database.get()) != 0;
        if (removed && type == jobType) {
            writeEntry(id, {{entryOffset(id), std::string(entryBytes, '\0')}});
        }
        return removed;
    }

    /// Bytes by their position in a block.
    using Places = std::vector<std::pair<std::size_t, std::string>>;

    /// Writes parts of a job's entry in the overview.
    void writeEntry(int id, const Places& places) {
        std::string block(blockBytes, '\0');
        {
            auto run = m_block.run(blockOf(id));
            if (run.step()) {
                block = run.text(0);
            }
        }
        if (block.size() != blockBytes) {
            throw StoreFailure(Fault::Damaged, "the store's overview of jobs can't be read");
        }
        bool differs = false;
        for (const auto& [offset, bytes] : places) {
            differs = differs || block.compare(offset, bytes.size(), bytes) != 0;
            block.replace(offset, bytes.size(), bytes);
        }
        if (differs) {
            m_putBlock.run(blockOf(id), block).finish();
        }
    }

    /// Updates the overview after a change.
    void writeOverview(int id, const Scope& scope, const TicketContent& after) {
        Places places;
        for (std::size_t key = 0; key < overviewKeys.size(); ++key) {
            if (scope.everything || scope.keys.contains(overviewKeys[key])) {
                places.emplace_back(slotOffset(id, key),
                                    slotOf(after.find(overviewKeys[key]).get()));
            }
        }
        if (!places.empty()) {
            writeEntry(id, places);
        }
    }

    /// False if there was nothing to write.
    bool write(std::int64_t ticket, const Scope& scope, const TicketContent& before,
               const TicketContent& after) {
        if (scope.everything) {
            m_empty.run(ticket).finish();
            for (const auto& [name, elements] : after.keys()) {
                put(ticket, name, *elements);
            }
            return true;
        }
        bool written = false;
        for (const auto& [name, needed] : scope.keys) {
            const auto elements = after.find(name);
            if (needed && elements == before.find(name)) {
                continue;
            }
            if (elements != nullptr) {
                put(ticket, name, *elements);
            } else {
                m_delete.run(ticket, name).finish();
            }
            written = true;
        }
        return written;
    }

    void put(std::int64_t ticket, const std::string& name, const Elements& elements) {
        const std::string bytes = keyBytes(elements);
        m_put.run(ticket, name, bytes).finish();
    }

    Database m_database;
    Ready m_ready;
    ServerFiles m_files;
    WalWatch m_watch;
    const std::string m_folder;
    const LineFile m_log;

    Statement m_ids{m_database, "SELECT id FROM tickets WHERE type = ? ORDER BY id"};
    Statement m_number{m_database, "SELECT number FROM tickets WHERE type = ? AND id = ?"};
    Statement m_insert{m_database, "INSERT OR IGNORE INTO tickets (type, id) VALUES (?, ?)"};
    Statement m_highest{m_database, "SELECT id FROM highest_ids WHERE type = ?"};
    Statement m_raiseHighest{m_database,
                             "INSERT INTO highest_ids (type, id) VALUES (?, ?) ON CONFLICT (type)"
                             " DO UPDATE SET id = max(id, excluded.id)"};
    Statement m_remove{m_database, "DELETE FROM tickets WHERE type = ? AND id = ?"};
    Statement m_lock{m_database,
                     "UPDATE tickets SET changes = changes + 1 WHERE type = ? AND id = ?"
                     " RETURNING number"};
    Statement m_key{m_database, "SELECT k.value FROM tickets t JOIN keys k ON k.ticket = t.number"
                                " WHERE t.type = ? AND t.id = ? AND k.name = ?"};
    Statement m_content{m_database, "SELECT k.name, k.value FROM tickets t"
                                    " LEFT JOIN keys k ON k.ticket = t.number"
                                    " WHERE t.type = ? AND t.id = ? ORDER BY k.name"};
    Statement m_oneKey{m_database, "SELECT k.name, k.value FROM tickets t"
                                   " LEFT JOIN keys k ON k.ticket = t.number AND k.name = ?3"
                                   " WHERE t.type = ?1 AND t.id = ?2"};
    Statement m_namedKey{m_database, "SELECT name, value FROM keys WHERE ticket = ? AND name = ?"};
    Statement m_keysFrom{m_database, "SELECT name, value FROM keys WHERE ticket = ? AND name >= ?"};
    Statement m_keysBetween{m_database, "SELECT name, value FROM keys"
                                        " WHERE ticket = ? AND name >= ? AND name < ?"};
    Statement m_keyOf{m_database, "SELECT value FROM keys WHERE ticket = ? AND name = ?"};
    Statement m_blocks{m_database, "SELECT number, content FROM job_blocks ORDER BY number"};
    Statement m_block{m_database, "SELECT content FROM job_blocks WHERE number = ?"};
    Statement m_putBlock{m_database,
                         "INSERT OR REPLACE INTO job_blocks (number, content) VALUES (?, ?)"};
    Statement m_put{m_database, "INSERT INTO keys (ticket, name, value) VALUES (?, ?, ?)"
                                " ON CONFLICT (ticket, name) DO UPDATE SET value = excluded.value"};
    Statement m_delete{m_database, "DELETE FROM keys WHERE ticket = ? AND name = ?"};
    Statement m_empty{m_database, "DELETE FROM keys WHERE ticket = ?"};
    Statement m_users{m_database, "SELECT name, hash, disabled FROM users ORDER BY name"};
    Statement m_user{m_database, "SELECT name, hash, disabled FROM users WHERE name = ?"};
    Statement m_putUser{m_database,
                        "INSERT OR REPLACE INTO users (name, hash, disabled) VALUES (?, ?, ?)"};
    Statement m_addUser{m_database,
                        "INSERT OR IGNORE INTO users (name, hash, disabled) VALUES (?, ?, ?)"};
    Statement m_removeUser{m_database, "DELETE FROM users WHERE name = ?"};
};

void makeSystemTicket(Database& database, const std::string& serverName) {
    database.run("INSERT INTO tickets (type, id) VALUES (0, 0)");
    Statement insert(database, "INSERT INTO keys (ticket, name, value)"
                               " SELECT number, ?, ? FROM tickets WHERE type = 0 AND id = 0");
    for (const auto& [name, value] : systemKeys(serverName)) {
        insert.run(name, value).finish();
    }
}

/// Whether a folder is empty or contains at most the files of an unfinished store. For the content
/// of such a database, see makeSqlite.
bool isFree(const std::string& folder) {
    namespace fs = std::filesystem;
    // The journal exists while the log is being enabled.
    const std::set<std::string> begun = {"files", "tickets.db", "tickets.db-journal",
                                         "tickets.db-wal", "tickets.db-shm"};
    std::error_code failure;
    for (const auto& entry : fs::directory_iterator(folder, failure)) {
        if (begun.count(entry.path().filename()) == 0) {
            return false;
        }
    }
    const bool hasFiles = fs::exists(folder + "/files", failure);
    return !failure && (!hasFiles || fs::is_empty(folder + "/files", failure)) && !failure;
}

void makeFolder(const std::string& address) {
    if (address.empty() || address.find('\0') != std::string::npos) {
        throw StoreFailure(Fault::BadPath, "a store needs a path");
    }
    if (mkdir(address.c_str(), 0770) == 0) {
        return;
    }
    const int error = errno;
    if (error == EEXIST && isFree(address)) {
        return;
    }
    throw StoreFailure(error == EEXIST ? Fault::Exists : Fault::ReadOnly,
                       address + ": " + std::strerror(error));
}

/// Without a server's name, the store is empty.
void makeSqlite(const std::string& address, const std::string* serverName, std::int64_t kind) {
    makeFolder(address);
    const std::string folder = realPath(address);
    const ServerFiles files(folder, true);
    Database database(databasePath(folder), Opening::New);
    // Log and index take the database's permissions. Password hashes are nobody else's.
    const base::Descriptor opened(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    Permissions::of(opened.get()).giveTo(databasePath(folder));
    database.run("PRAGMA journal_mode = WAL; PRAGMA synchronous = FULL");
    Transaction transaction(database);
    if (database.number("SELECT count(*) FROM sqlite_schema") != 0) {
        throw StoreFailure(Fault::Exists, folder + " holds a store");
    }
    database.run(tables);
    database.run(overviewTable);
    if (serverName != nullptr) {
        makeSystemTicket(database, *serverName);
    }
    database.run(("PRAGMA user_version = " + std::to_string(format)).c_str());
    // A database without it is not a store, so an unfinished one is not.
    setKind(database, kind);
    transaction.commit();
}

std::unique_ptr<StoreEngine> openSqlite(const std::string& address, Access access) {
    return std::make_unique<SqliteEngine>(realPath(address), access);
}

void makeSqliteStore(const std::string& address, const std::string& serverName) {
    makeSqlite(address, &serverName, applicationId);
}

/// The engine of a copy locks its folder. Before it is a store, nothing in it needs to be on the
/// disk.
class SqliteCopy : public SqliteEngine {
  public:
    explicit SqliteCopy(const std::string& folder)
        : SqliteEngine(folder, Access::ReadAndWrite, unfinishedCopyId),
          m_folder(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
        if (flock(m_folder.get(), LOCK_EX | LOCK_NB) != 0) {
            throw StoreFailure(Fault::Busy, "somebody else is copying to " + folder);
        }
        database().run("PRAGMA synchronous = NORMAL");
        serverFiles().writeLater();
    }

    void finishCopy() override {
        serverFiles().finishCopy();
        database().run("PRAGMA synchronous = FULL"); // Includes the existing content of the log.
        SqliteEngine::finishCopy();
    }

  private:
    base::Descriptor m_folder;
};

std::unique_ptr<StoreEngine> openSqliteCopy(const std::string& address) {
    try {
        return std::make_unique<SqliteCopy>(realPath(address));
    } catch (const StoreFailure& failure) {
        if (failure.status != Fault::Missing) {
            throw;
        }
    }
    makeSqlite(address, nullptr, unfinishedCopyId);
    return std::make_unique<SqliteCopy>(realPath(address));
}

/// Creates the overview of existing jobs.
void fillOverview(Database& database) {
    Statement put(database, "INSERT INTO job_blocks (number, content) VALUES (?, ?)");
    showBlocks(database,
               [&](int number, const std::string& block) { put.run(number, block).finish(); });
}

bool upgradeSqlite(const std::string& address) {
    Database database = openDatabase(realPath(address));
    if (database.number("PRAGMA user_version") >= format) {
        checkFormat(database);
        return false;
    }
    database.run("PRAGMA synchronous = FULL");
    Transaction transaction(database);
    // If two upgrades run at once, the second finds nothing to do. Format 1 is the first that was
    // ever published: add a step here for each later one.
    const std::int64_t found = database.number("PRAGMA user_version");
    if (found >= format) {
        return false;
    }
    if (found != 1) {
        throw StoreFailure(Fault::Damaged, "no way is known from this format to the present one");
    }
    database.run(overviewTable);
    fillOverview(database);
    database.run(("PRAGMA user_version = " + std::to_string(format)).c_str());
    transaction.commit();
    return true;
}

[[noreturn]] void grantSqlite(const std::string&, const std::string&, Rights) {
    throw StoreFailure(Fault::Other, "a folder has no roles: who may use it is said by its group "
                                     "and permissions");
}

} // namespace

constinit const EngineKind sqliteKind = {openSqlite, makeSqliteStore, openSqliteCopy, upgradeSqlite,
                                         grantSqlite};

} // namespace store
