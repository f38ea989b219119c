// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/PostgresFiles.h"

#include <algorithm>
#include <istream>
#include <limits>
#include <ostream>

#include "store/ServerPath.h"

namespace store::postgres {

namespace {

/// Bytes of a content per row: small in a client's memory, but large enough for few round trips.
constexpr std::size_t pieceSize = 1 << 18;
/// Number of pieces in flight.
constexpr int piecesAhead = 8;

constexpr Statement addContent = {"INSERT INTO tintgate.contents DEFAULT VALUES RETURNING number"};
constexpr Statement addPiece = {
    "INSERT INTO tintgate.pieces (content, position, bytes) VALUES ($1, $2, $3)"};
constexpr Statement setSize = {"UPDATE tintgate.contents SET size = $2 WHERE number = $1"};
constexpr Statement addFolders = {
    "INSERT INTO tintgate.files (path) SELECT unnest($1::bytea[]) ON CONFLICT DO NOTHING"};
constexpr Statement isFileAmong = {
    "SELECT EXISTS (SELECT FROM tintgate.files WHERE path = ANY ($1::bytea[])"
    " AND content IS NOT NULL)"};

#define TINTGATE_NOW "extract(epoch FROM clock_timestamp())::bigint"

/// Locks the file and returns its content: the new one if there was none, null for a folder. The
/// update that changes nothing is intended, because it locks the row.
constexpr Statement claimFile = {
    "INSERT INTO tintgate.files AS file (path, content, written)"
    " VALUES ($1, $2, " TINTGATE_NOW ")"
    " ON CONFLICT (path) DO UPDATE SET path = excluded.path RETURNING file.content"};
constexpr Statement keepVersion = {
    "WITH kept AS (UPDATE tintgate.files SET last_version = last_version + 1 WHERE path = $1"
    " RETURNING path, last_version, content, written)"
    " INSERT INTO tintgate.versions (path, number, content, written) SELECT * FROM kept"};
constexpr Statement raiseLastVersion = {
    "UPDATE tintgate.files SET last_version = greatest(last_version, $2) WHERE path = $1"};
constexpr Statement lastVersion = {"SELECT last_version FROM tintgate.files WHERE path = $1"};
constexpr Statement exchange = {"UPDATE tintgate.files SET content = $2, written = " TINTGATE_NOW
                                " WHERE path = $1"};
constexpr Statement exchangeAsOf = {
    "UPDATE tintgate.files SET content = $2, written = $3 WHERE path = $1"};
constexpr Statement lockFile = {"SELECT content FROM tintgate.files WHERE path = $1 FOR UPDATE"};

// Number, size and first piece. Most files have no more pieces.
constexpr Statement current = {
    "SELECT files.content, size, bytes FROM tintgate.files"
    " LEFT JOIN tintgate.contents ON contents.number = files.content"
    " LEFT JOIN tintgate.pieces ON pieces.content = files.content AND position = 0"
    " WHERE path = $1"};
constexpr Statement version = {
    "SELECT versions.content, size, bytes FROM tintgate.versions"
    " JOIN tintgate.contents ON contents.number = versions.content"
    " LEFT JOIN tintgate.pieces ON pieces.content = versions.content AND position = 0"
    " WHERE path = $1 AND versions.number = $2"};
constexpr Statement piece = {
    "SELECT bytes FROM tintgate.pieces WHERE content = $1 AND position = $2"};
constexpr Statement allFiles = {
    "SELECT path, size, written FROM tintgate.files"
    " JOIN tintgate.contents ON contents.number = content ORDER BY path"};
constexpr Statement oneFile = {
    "SELECT size, written FROM tintgate.files"
    " LEFT JOIN tintgate.contents ON contents.number = content WHERE path = $1"};
constexpr Statement allVersions = {
    "SELECT versions.number, size, written FROM tintgate.versions"
    " JOIN tintgate.contents ON contents.number = content WHERE path = $1"
    " ORDER BY versions.number"};
constexpr Statement putVersion = {
    "INSERT INTO tintgate.versions (path, number, content, written) VALUES ($1, $2, $3, $4)"
    " ON CONFLICT (path, number) DO UPDATE SET content = excluded.content,"
    " written = excluded.written"};
constexpr Statement dropVersions = {
    "DELETE FROM tintgate.versions WHERE path = $1 AND number <= $2 RETURNING content"};
constexpr Statement lockWhole = {
    "SELECT content, last_version FROM tintgate.files WHERE path = $1 FOR UPDATE"};
constexpr Statement dropFile = {"DELETE FROM tintgate.files WHERE path = $1"};
constexpr Statement dropContent = {
    "DELETE FROM tintgate.contents WHERE number = $1"
    " AND NOT EXISTS (SELECT FROM tintgate.files WHERE content = $1)"
    " AND NOT EXISTS (SELECT FROM tintgate.versions WHERE content = $1)"};
constexpr Statement contentsOf = {
    "SELECT content FROM tintgate.versions WHERE path = $1 AND number = $2"};

/// A path in the database's form, and its parent folders, topmost first.
struct Place {
    explicit Place(std::string_view given) {
        const auto parts = partsOfServerPath(given);
        for (std::size_t count = 1; count < parts.size(); ++count) {
            folders.push_back(joinedParts(parts, count));
        }
        path = joinedParts(parts, parts.size());
        for (const auto& folder : folders) {
            folderViews.push_back(folder);
        }
    }
    Place(const Place&) = delete;

    std::string what() const { return shownServerPath(path); }

    [[noreturn]] void refuse() const {
        throw StoreFailure(Fault::BadPath, what() + " is not a file, or leads through one");
    }

    std::string path;
    std::vector<std::string> folders;
    std::vector<std::string_view> folderViews;
};

std::size_t readPiece(std::istream& from, std::string& bytes, const Place& place) {
    bytes.resize(pieceSize);
    from.read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    if (from.bad()) {
        throw StoreFailure(Fault::Other, place.what() + ": the source can't be read");
    }
    bytes.resize(static_cast<std::size_t>(from.gcount()));
    return bytes.size();
}

/// Stores a stream as a content and returns its number. Requires a transaction.
std::int64_t storeContent(Connection& connection, Transaction& transaction, const Place& place,
                          std::istream& from) {
    std::string bytes;
    readPiece(from, bytes, place); // The writer of the stream may be slow to start.
    connection.send(addContent);
    const std::int64_t content = transaction.finish()[0].number(0, 0);
    std::int64_t size = 0;
    for (int position = 0; !bytes.empty(); ++position) {
        connection.send(addPiece, content, position, bytes);
        size += static_cast<std::int64_t>(bytes.size());
        if (position % piecesAhead == piecesAhead - 1) {
            transaction.finish();
        }
        readPiece(from, bytes, place);
    }
    connection.send(setSize, content, size);
    return content;
}

/// Creates the parent folders of a file and locks the file. Returns its content, or the given one
/// if there was none.
std::int64_t claim(Connection& connection, Transaction& transaction, const Place& place,
                   std::int64_t content) {
    connection.send(addFolders, place.folderViews);
    connection.send(isFileAmong, place.folderViews);
    connection.send(claimFile, place.path, content);
    const auto results = transaction.finish();
    const Result& there = results.back();
    if (results[results.size() - 2].number(0, 0) != 0 || there.isNull(0, 0)) {
        place.refuse();
    }
    return there.number(0, 0);
}

/// Replaces a file's content and keeps the old one as a version.
void exchangeFile(Connection& connection, Transaction& transaction, const Place& place,
                  std::int64_t content) {
    if (claim(connection, transaction, place, content) != content) {
        connection.send(keepVersion, place.path);
        connection.send(exchange, place.path, content);
    }
    transaction.commit();
}

std::vector<FileVersion> versionsIn(const Result& rows) {
    std::vector<FileVersion> list;
    for (int row = 0; row < rows.rows(); ++row) {
        list.push_back({static_cast<int>(rows.number(row, 0)),
                        static_cast<std::uint64_t>(rows.number(row, 1)), rows.number(row, 2)});
    }
    return list;
}

/// Sends what removes contents that nothing leads to any more.
void dropContents(Connection& connection, const Result& numbers) {
    for (int row = 0; row < numbers.rows(); ++row) {
        connection.send(dropContent, numbers.number(row, 0));
    }
}

/// Throws the reason why there is nothing at a path.
[[noreturn]] void failMissing(Connection& connection, const Place& place) {
    const Result among =
        connection.repeating([&] { return connection.run(isFileAmong, place.folderViews); });
    if (among.number(0, 0) != 0) {
        place.refuse();
    }
    throw StoreFailure(Fault::NoFile, place.what() + ": there is no such file");
}

/// Copies the content that one of the statements above finds; false if there is none. A content
/// never changes, so all of it is from one moment.
template<class... Each>
bool copyOut(Connection& connection, const Place& place, std::ostream& to, const Statement& find,
             const Each&... each) {
    const Result found = connection.repeating([&] { return connection.run(find, each...); });
    if (found.rows() == 0) {
        return false;
    }
    if (found.isNull(0, 0)) {
        place.refuse();
    }
    const auto write = [&](std::string_view bytes) {
        if (!to.write(bytes.data(), static_cast<std::streamsize>(bytes.size()))) {
            throw StoreFailure(Fault::Full, place.what() + ": the copy can't be written");
        }
        return static_cast<std::int64_t>(bytes.size());
    };
    const std::int64_t content = found.number(0, 0);
    std::int64_t left = found.number(0, 1) - write(found.bytes(0, 2));
    for (int position = 1; left > 0; ++position) {
        const Result next =
            connection.repeating([&] { return connection.run(piece, content, position); });
        if (next.rows() == 0) {
            throw StoreFailure(Fault::NoFile, place.what() + " was pruned while it was read");
        }
        left -= write(next.bytes(0, 0));
    }
    return true;
}

} // namespace

void Files::put(std::string_view path, std::istream& from) {
    const Place place(path);
    Transaction transaction(m_connection);
    const std::int64_t content = storeContent(m_connection, transaction, place, from);
    exchangeFile(m_connection, transaction, place, content);
}

void Files::get(std::string_view path, std::ostream& to) {
    const Place place(path);
    if (!copyOut(m_connection, place, to, current, place.path)) {
        failMissing(m_connection, place);
    }
}

std::vector<FileEntry> Files::list() {
    const Result rows = m_connection.run(allFiles);
    std::vector<FileEntry> entries;
    for (int row = 0; row < rows.rows(); ++row) {
        entries.push_back({rows.text(row, 0), static_cast<std::uint64_t>(rows.number(row, 1)),
                           rows.number(row, 2)});
    }
    return entries;
}

std::optional<FileEntry> Files::at(std::string_view path) {
    const Place place(path);
    const Result row = m_connection.run(oneFile, place.path);
    if (row.rows() == 0) {
        return std::nullopt;
    }
    if (row.isNull(0, 0)) {
        place.refuse();
    }
    return FileEntry{place.path, static_cast<std::uint64_t>(row.number(0, 0)), row.number(0, 1)};
}

std::vector<FileVersion> Files::versions(std::string_view path) {
    const Place place(path);
    return versionsIn(m_connection.run(allVersions, place.path));
}

void Files::getVersion(std::string_view path, int number, std::ostream& to) {
    const Place place(path);
    if (!copyOut(m_connection, place, to, version, place.path, number)) {
        throw StoreFailure(Fault::NoFile,
                           place.what() + " has no version " + std::to_string(number));
    }
}

void Files::restoreVersion(std::string_view path, int number) {
    const Place place(path);
    Transaction transaction(m_connection);
    // Locks first, so that the version is not pruned meanwhile.
    m_connection.send(lockFile, place.path);
    m_connection.send(contentsOf, place.path, number);
    const auto results = transaction.finish();
    if (results[1].rows() == 0) {
        throw StoreFailure(Fault::NoFile,
                           place.what() + " has no version " + std::to_string(number));
    }
    exchangeFile(m_connection, transaction, place, results[1].number(0, 0));
}

int Files::pruneVersions(std::string_view path, const Pruning& which) {
    const Place place(path);
    Transaction transaction(m_connection);
    m_connection.send(lockFile, place.path);
    m_connection.send(allVersions, place.path);
    const auto list = versionsIn(transaction.finish()[1]);
    const std::size_t count = countPruned(list, which);
    if (count == 0) {
        return 0;
    }
    m_connection.send(dropVersions, place.path, list[count - 1].number);
    const auto results = transaction.finish();
    dropContents(m_connection, results[0]);
    transaction.commit();
    return results[0].rows();
}

bool Files::remove(std::string_view path, std::optional<int> highestVersion) {
    const Place place(path);
    Transaction transaction(m_connection);
    m_connection.send(lockWhole, place.path);
    const auto found = transaction.finish();
    const Result& file = found[0];
    if (file.rows() == 0 || (highestVersion && file.number(0, 1) != *highestVersion)) {
        return false;
    }
    if (file.isNull(0, 0)) {
        place.refuse();
    }
    m_connection.send(dropVersions, place.path, std::numeric_limits<int>::max());
    m_connection.send(dropFile, place.path);
    const auto dropped = transaction.finish();
    dropContents(m_connection, dropped[0]);
    m_connection.send(dropContent, file.number(0, 0));
    transaction.commit();
    return true;
}

void Files::placeVersion(std::string_view path, const FileVersion& version, std::istream& from) {
    const Place place(path);
    Transaction transaction(m_connection);
    const std::int64_t content = storeContent(m_connection, transaction, place, from);
    const std::int64_t there = claim(m_connection, transaction, place, content);
    std::int64_t replaced = there;
    if (version.number != 0) {
        m_connection.send(contentsOf, place.path, version.number);
        const auto results = transaction.finish();
        replaced = results[0].rows() == 0 ? content : results[0].number(0, 0);
        m_connection.send(putVersion, place.path, version.number, content, version.time);
        m_connection.send(raiseLastVersion, place.path, version.number);
    } else {
        m_connection.send(exchangeAsOf, place.path, content, version.time);
    }
    if (replaced != content) {
        m_connection.send(dropContent, replaced);
    }
    transaction.commit();
}

int Files::highestVersion(std::string_view path) {
    const Place place(path);
    const Result found = m_connection.run(lastVersion, place.path);
    return found.rows() == 0 ? 0 : static_cast<int>(found.number(0, 0));
}

void Files::raiseHighestVersion(std::string_view path, int number) {
    const Place place(path);
    m_connection.run(raiseLastVersion, place.path, number);
}

} // namespace store::postgres
