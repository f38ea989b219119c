// SPDX-License-Identifier: Apache-2.0
// Storage of a store's tickets, users and files. This is the only interface to the databases. The
// effect of a table on a ticket is defined above it, in TicketContent.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <iosfwd>
#include <limits>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/Failure.h"
#include "store/JobOverview.h"
#include "store/tickets/TicketContent.h"

namespace store {

/// Why a store refused an operation.
enum class Fault {
    Missing,  ///< No store at this address, or none that this user can read.
    Newer,    ///< The store has a newer, unknown format.
    Older,    ///< The store has an older format; see bringStoreUpToDate.
    ReadOnly, ///< The store, or part of it, is not writable.
    Full,     ///< A disk, quota or limit is exhausted.
    Busy,     ///< Others locked the store longer than longestWait.
    Damaged,  ///< The stored data is invalid.
    BadPath,  ///< A server path that is outside the store or not a
              ///< file.
    NoFile,   ///< No such file or version.
    Exists,   ///< There is one already.
    Lost,     ///< The server does not answer: see alive. It is unknown whether it
              ///< performed the current operation; it did so completely or not at all.
    Other,    ///< See the text.
};

/// A failure of a store. Whatever was under way is undone, but see Lost. The text is one for
/// people.
using StoreFailure = base::Failure<Fault>;

/// How long a change waits for the changes of others before it fails with Fault::Busy.
inline constexpr int longestWaitMilliseconds = 10'000;

/// Maximum length of users' names and passwords in bytes.
inline constexpr std::size_t longestCredential = 127;

struct User {
    std::string name; ///< Bytes, as in the session record.
    std::string passwordHash;
    bool disabled = false;
};

/// Times are in seconds since 1970. Paths are server paths without a leading slash.
struct FileEntry {
    std::string path;
    std::uint64_t size = 0;
    std::int64_t time = 0;
};

/// A previous content of a replaced file.
struct FileVersion {
    int number = 0; ///< From 1, in order of replacement; never reused for a path.
    std::uint64_t size = 0;
    std::int64_t time = 0; ///< Time when this content was written.
};

/// Which older versions of a file are removed: the oldest ones, as far as both members allow it. A
/// version that stays keeps all younger ones, so that a gap in the numbers is always a loss.
struct Pruning {
    int keepNewest = 0;
    /// In seconds since 1970: contents that were written at this time or later stay.
    std::int64_t writtenBefore = std::numeric_limits<std::int64_t>::max();
};

/// How many of a file's versions, by number, are removed.
std::size_t countPruned(const std::vector<FileVersion>& versions, const Pruning& which);

/// What a store's log is kept for.
enum class Event { Login, Refusal, LostWrite, Administration };

/// As people and scripts read it, such as "lost write".
std::string_view eventName(Event event);

struct LogEntry {
    std::int64_t time = 0; ///< Seconds since 1970.
    Event event = Event::Login;
    std::string who;    ///< The store's user; empty for none, and for a name that is no user's.
    std::string origin; ///< Account and machine that it came from; see thisOrigin.
    std::string what;   ///< What was done, or why not. Never a password.
};

/// The number of this process's account and the machine's name, such as 1000@press-2.
std::string thisOrigin();

/// What verify found in a sound store.
struct Verified {
    std::int64_t tickets = 0;
    std::int64_t files = 0;
    std::int64_t versions = 0;
    std::uint64_t bytes = 0; ///< Of files and versions.
};

/// What a change of a ticket is about to touch.
struct Scope {
    /// The ticket is emptied first, and `keys` is ignored.
    bool everything = false;
    /// Making the change twice has the same effect as once: no appended elements, and none deleted
    /// by position.
    bool repeatable = false;
    /// If the ticket is missing, it is created in the same transaction.
    bool make = false;
    /// By key name: whether the old value is needed. Other keys are not changed.
    std::map<std::string, bool, std::less<>> keys = {};
};

/// An open store. All functions may throw StoreFailure and std::bad_alloc. Use one thread at a
/// time.
///
/// Types and ids must be valid (TICKET_Valid). Keys and names are bytes and compared as bytes. Each
/// operation is one transaction and sees what others, in this process or another, have committed.
class StoreEngine {
  public:
    virtual ~StoreEngine() = default;

    /// False if the connection to a server is permanently lost. A lost connection is restored here
    /// and by each operation; a read-only or repeatable operation then restarts. After a total of
    /// 30 seconds of waiting for the server, the loss is permanent.
    virtual bool alive() = 0;

    /// The same for all that are open on the same store, whatever address led to it, and different
    /// for any other store.
    virtual std::string place() = 0;

    /// A number that differs from the last one if anybody has committed anything since. It may
    /// differ without that. Meant to be asked before each read. Where only a server knows, it is
    /// asked if what overview fetched may still be as it was; accepting an answer of this age
    /// avoids that. Commits of this object itself are noticed at any age.
    virtual std::uint64_t commits(std::chrono::milliseconds age) = 0;

    // Tickets.

    /// All tickets of a type, ascending.
    virtual std::vector<int> ids(int type) = 0;
    virtual bool exists(int type, int id) = 0;
    /// Creates an empty ticket with this id. False if there is one already.
    virtual bool create(int type, int id) = 0;
    /// Creates an empty ticket with the next id after the highest that the type ever had or, if
    /// these are used up, with the lowest free id. Returns the id, or -1.
    virtual int createNext(int type) = 0;
    virtual bool remove(int type, int id) = 0;
    /// The same, but only if the ticket's keys are still the known ones.
    virtual bool removeUnchanged(int type, int id, const TicketContent& known) = 0;

    /// One key; null if there is no such key or ticket. Reading the same key again only checks that
    /// it has not changed.
    virtual std::shared_ptr<const Elements> key(int type, int id, std::string_view name) = 0;
    /// The keys that the filter accepts, at one moment; null if there is no such ticket.
    virtual std::shared_ptr<const TicketContent> content(int type, int id,
                                                         const KeyFilter& filter) = 0;

    /// Called with one key of one ticket; `name` is an index in the list of names. Elements are
    /// null if the key is larger than requested.
    using ShowKey =
        std::function<void(int id, std::size_t name, std::shared_ptr<const Elements> elements)>;
    /// Reads some keys of all tickets of a type, at one moment, by ascending id. Keys that take
    /// more than largestBytes in the store are not read. Equal elements may share one object.
    virtual void keysOfAll(int type, const std::vector<std::string>& names,
                           std::size_t largestBytes, const ShowKey& show) = 0;

    /// The overview of all jobs, at one moment.
    virtual void overview(JobOverview& jobs) = 0;

    /// One transaction. It locks the ticket, fetches the keys that the scope needs, lets `work`
    /// change them, and writes the differences. `work` must not touch keys outside the scope.
    /// Returns false if there is no such ticket; unless something is needed, this is checked only
    /// after `work` was called. An exception of `work` undoes the change. If the scope is
    /// repeatable, `work` may be called again on the same ticket.
    virtual bool change(int type, int id, const Scope& scope,
                        const std::function<void(TicketContent&)>& work) = 0;

    // Users.

    virtual std::vector<User> users() = 0; ///< By name.
    virtual std::optional<User> user(std::string_view name) = 0;
    /// Adds the user, or replaces the one with this name.
    virtual void putUser(const User& user) = 0;
    /// False, without a change, if there is a user of this name.
    virtual bool addUser(const User& user) = 0;
    virtual bool removeUser(std::string_view name) = 0;

    // Files. A server path may start with slashes; it is always relative to the store's files.
    // Refused with Fault::BadPath: parts that are "..", start with ".tintgate-" or have more than
    // 255 bytes; NUL; a slash at the end; more than 2,048 bytes; no part at all; and any symbolic
    // link on the way, wherever it leads.

    /// Writes a whole file from the stream: readers see the old content or all of the new one. The
    /// replaced content is kept as a version. Creates missing folders.
    virtual void putFile(std::string_view path, std::istream& from) = 0;
    /// Copies one version of a file to the stream.
    virtual void getFile(std::string_view path, std::ostream& to) = 0;
    virtual std::vector<FileEntry> files() = 0; ///< By path.
    /// Nothing if there is no such file.
    virtual std::optional<FileEntry> fileAt(std::string_view path) = 0;

    virtual std::vector<FileVersion> versions(std::string_view path) = 0; ///< By number.
    virtual void getVersion(std::string_view path, int number, std::ostream& to) = 0;
    /// Restores a version. The replaced content is kept as a version too.
    virtual void restoreVersion(std::string_view path, int number) = 0;
    /// Removes versions of a file. The number removed.
    virtual int pruneVersions(std::string_view path, const Pruning& which) = 0;
    /// Removes a file with its versions and the numbers that they had: a later file of this path
    /// starts anew. Nothing of it is left but the folders that it was in. With a number, only if
    /// highestVersion still gives it, so that nothing was delivered since. False, and nothing is
    /// changed, if not or if there is neither a file nor a version. If it is cut off, the file is
    /// still there, maybe without versions, and can be removed again.
    virtual bool removeFile(std::string_view path, std::optional<int> highestVersion = {}) = 0;
    /// Removes leftovers of interrupted deliveries. Returns the number of files removed.
    virtual int removeLeftovers() = 0;

    // The log. It is best effort: a store that can't be written has none, and nothing fails for it.
    // It keeps about the last 10,000 entries.

    /// Notes an event. A login is noted without waiting for a server: with the session's next
    /// change, or at its end.
    virtual void log(const LogEntry& entry) noexcept = 0;
    virtual std::vector<LogEntry> logEntries() = 0; ///< The oldest first.
    /// How many refusals the log has from this time on.
    virtual int refusalsSince(std::int64_t time) noexcept = 0;

    /// Shown a fault: the ticket, file or part of the store that has it, and what is wrong.
    using ShowFault = std::function<void(const std::string& where, const std::string& what)>;
    /// Reads everything and changes nothing: whether the database is sound, each key can be
    /// decoded, the overview of jobs agrees with the keys, each file and version has its content
    /// and each content its file, and no version is missing between others. Others may be at work.
    virtual Verified verify(const ShowFault& show) = 0;

    /// Told how much of the work is done.
    using ShowProgress = std::function<void(std::size_t done, std::size_t total)>;
    /// Copies the whole store as it is at one moment to a new folder, which is a store then. Others
    /// may be at work: they wait while the names of the files are read, and no longer. Throws
    /// StoreFailure: Exists if something is there, but a folder in which a backup was cut off is
    /// used again; Busy if files were removed meanwhile; Other for a store on a server, which has
    /// its own means.
    virtual void backUp(const std::string& folder, const ShowProgress& progress) = 0;

    // What a copy needs on top of these.

    /// By type, the highest id that it ever had, if above 0.
    virtual std::map<int, int> highestIds() = 0;
    /// Makes createNext continue after this id or a higher one.
    virtual void raiseHighestId(int type, int id) = 0;
    /// Stores a content with its number and time, without keeping what it replaces. Number 0 is the
    /// current file, which must come first. The size is ignored.
    virtual void placeVersion(std::string_view path, const FileVersion& version,
                              std::istream& from) = 0;
    /// The highest number that a version of this file ever had, even if pruned, or 0.
    virtual int highestVersion(std::string_view path) = 0;
    /// The next version of this existing file gets a higher number than this.
    virtual void raiseHighestVersion(std::string_view path, int number) = 0;
    /// Turns the result of openCopy into a store. Before this, nothing need be on the disk.
    virtual void finishCopy() = 0;
};

// A store's address consists of bytes. If it starts with a slash, it is the path of a folder on a
// local disk. Otherwise it is a connection service of a PostgreSQL server (pg_service.conf), with a
// store in the schema "tintgate" of its database.

/// The purpose of opening a store.
enum class Access {
    ReadAndWrite, ///< Refused (ReadOnly, Full) if the store is not writable.
    Read,         ///< Accepts a store on a full or read-only disk. Writing
                  ///< is still tried, and may fail.
};

std::unique_ptr<StoreEngine> openStore(const std::string& address,
                                       Access access = Access::ReadAndWrite);

/// Creates a new store with the system ticket, in a new or empty folder or in a database. A folder
/// and its contents are accessible only for owner and group, as the umask allows.
void makeStore(const std::string& address, const std::string& serverName);

/// Creates an empty store like makeStore, or opens an unfinished copy. Until finishCopy, nobody can
/// open it in any other way, and nobody else can copy to it.
std::unique_ptr<StoreEngine> openCopy(const std::string& address);

/// What a role of a database server is given.
enum class Rights {
    Client, ///< What the tool needs: tickets and files, but no users and no administration.
    Reports ///< To read jobs and files.
};

/// Gives a role these rights and takes all others that it has on the store. Throws StoreFailure
/// (Other) for a store in a folder, which has permissions instead, and for a role that is not there
/// or owns the store.
void grantRights(const std::string& address, const std::string& role, Rights rights);

/// Brings a store of an earlier format up to date. False when it was.
bool bringStoreUpToDate(const std::string& address);

} // namespace store
