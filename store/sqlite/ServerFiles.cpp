// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/ServerFiles.h"

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <cstring>
#include <functional>
#include <istream>
#include <memory>
#include <ostream>
#include <set>
#include <thread>
#include <utility>

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "store/Engines.h"
#include "store/ServerPath.h"
#include "store/sqlite/Permissions.h"

namespace store {

namespace {

using base::Descriptor;

constexpr std::string_view deliveryPrefix = ".tintgate-new-";
constexpr const char* versionsFolder = ".tintgate-versions";
constexpr std::size_t blockSize = 1 << 16;

[[noreturn]] void fail(int error, const std::string& what) {
    const std::string text = what + ": " + std::strerror(error);
    switch (error) {
    case ENOENT:
        throw StoreFailure(Fault::NoFile, text);
    case ELOOP:
    case ENOTDIR:
    case EISDIR:
    case ENAMETOOLONG:
    case ENXIO:
        throw StoreFailure(Fault::BadPath, text);
    case EACCES:
    case EPERM:
    case EROFS:
        throw StoreFailure(Fault::ReadOnly, text);
    case ENOSPC:
    case EDQUOT:
    case EFBIG:
        throw StoreFailure(Fault::Full, text);
    case ENOMEM:
        throw std::bad_alloc();
    default:
        throw StoreFailure(Fault::Other, text);
    }
}

/// The folders and the name in a server path.
class Place {
  public:
    explicit Place(std::string_view path) : m_parts(partsOfServerPath(path)) {}

    std::vector<std::string> folders() const { return {m_parts.begin(), m_parts.end() - 1}; }
    const std::string& name() const { return m_parts.back(); }

    /// The folders of the place's versions, relative to the files folder.
    std::vector<std::string> versions() const {
        std::vector<std::string> folders{versionsFolder};
        folders.insert(folders.end(), m_parts.begin(), m_parts.end());
        return folders;
    }

    std::string path() const { return joinedParts(m_parts, m_parts.size()); }
    std::string text() const { return shownServerPath(path()); }

  private:
    std::vector<std::string> m_parts;
};

Descriptor openFolder(int parent, const char* name) {
    return Descriptor(openat(parent, name, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
}

void flush(const Descriptor& file, const std::string& what) {
    if (fsync(file.get()) != 0) {
        fail(errno, what);
    }
}

/// Walks down from the store's files. With `make`, missing folders are created with the permissions
/// of the files folder and are on the disk when this returns.
Descriptor walk(const Descriptor& from, const std::vector<std::string>& folders, bool make,
                const std::string& what) {
    Descriptor folder = openFolder(from.get(), ".");
    for (const auto& name : folders) {
        Descriptor next = openFolder(folder.get(), name.c_str());
        if (!next.isOpen() && errno == ENOENT && make) {
            const bool isMade = mkdirat(folder.get(), name.c_str(), 0770) == 0;
            if (isMade) {
                flush(folder, what);
            } else if (errno != EEXIST) {
                fail(errno, what);
            }
            next = openFolder(folder.get(), name.c_str());
            if (isMade && next.isOpen() && !Permissions::of(from.get()).giveTo(next.get())) {
                fail(errno, what);
            }
        }
        if (!next.isOpen()) {
            fail(errno, what);
        }
        folder = std::move(next);
    }
    return folder;
}

bool isMissing(const StoreFailure& failure) {
    return failure.status == Fault::NoFile;
}

/// Names in a folder, in byte order.
std::vector<std::string> namesIn(const Descriptor& folder) {
    Descriptor own = openFolder(folder.get(), ".");
    const std::unique_ptr<DIR, int (*)(DIR*)> stream(own.isOpen() ? fdopendir(own.get()) : nullptr,
                                                     closedir);
    if (stream == nullptr) {
        fail(errno, "a folder of the store");
    }
    own.release();
    std::vector<std::string> names;
    errno = 0;
    while (const dirent* const entry = readdir(stream.get())) {
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..") {
            names.emplace_back(name);
        }
        errno = 0;
    }
    if (errno != 0) {
        fail(errno, "a folder of the store");
    }
    std::sort(names.begin(), names.end());
    return names;
}

struct stat statusOf(int file, const std::string& what) {
    struct stat status;
    if (fstat(file, &status) != 0) {
        fail(errno, what);
    }
    return status;
}

/// Opens a regular file for reading. O_NONBLOCK, because opening a pipe would wait for its writer.
Descriptor openFile(const Descriptor& folder, const std::string& name, const std::string& what) {
    Descriptor file(
        openat(folder.get(), name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (!file.isOpen()) {
        fail(errno, what);
    }
    if (!S_ISREG(statusOf(file.get(), what).st_mode)) {
        throw StoreFailure(Fault::BadPath, what + " is not a file");
    }
    return file;
}

/// Reads up to `size` bytes; fewer only at the end of the file.
std::size_t readBlock(const Descriptor& file, char* block, std::size_t size,
                      const std::string& what) {
    const std::ptrdiff_t count = base::readAll(file, block, size);
    if (count < 0) {
        fail(errno, what);
    }
    return static_cast<std::size_t>(count);
}

void writeBlock(const Descriptor& file, std::string_view bytes, const std::string& what) {
    if (base::writeAll(file, bytes) != bytes.size()) {
        fail(errno, what);
    }
}

void copyOut(const Descriptor& file, std::ostream& to, const std::string& what) {
    std::vector<char> block(blockSize);
    std::size_t count = blockSize;
    while (count == blockSize) {
        count = readBlock(file, block.data(), block.size(), what);
        if (!to.write(block.data(), static_cast<std::streamsize>(count))) {
            throw StoreFailure(Fault::Full, what + ": the copy can't be written");
        }
    }
}

/// Reads the next bytes; returns 0 at the end.
using Source = std::function<std::size_t(char* block, std::size_t size)>;

Source sourceOf(std::istream& from, const Place& place) {
    return [&from, &place](char* block, std::size_t size) {
        from.read(block, static_cast<std::streamsize>(size));
        if (from.bad()) {
            throw StoreFailure(Fault::Other, place.text() + ": the source can't be read");
        }
        return static_cast<std::size_t>(from.gcount());
    };
}

/// A file being written under an internal name; removed unless it is put in place. It is locked,
/// which distinguishes it from leftovers of interrupted deliveries.
class Delivery {
  public:
    /// Unless `later`, everything is on the disk when it is in place.
    Delivery(const Descriptor& folder, const Permissions& permissions, std::string what,
             bool later = false)
        : m_folder(folder), m_what(std::move(what)), m_later(later) {
        static int counter = 0;
        do {
            m_name = std::string(deliveryPrefix) + std::to_string(getpid()) + "-" +
                     std::to_string(counter++);
            m_file = Descriptor(openat(folder.get(), m_name.c_str(),
                                       O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0660));
        } while (!m_file.isOpen() && errno == EEXIST);
        if (!m_file.isOpen()) {
            fail(errno, m_what);
        }
        flock(m_file.get(), LOCK_EX | LOCK_NB);
        if (!permissions.giveTo(m_file.get())) {
            const int error = errno;
            unlinkat(folder.get(), m_name.c_str(), 0);
            fail(error, m_what);
        }
    }

    ~Delivery() {
        if (!m_name.empty()) {
            unlinkat(m_folder.get(), m_name.c_str(), 0);
        }
    }

    void fill(const Source& source) {
        std::vector<char> block(blockSize);
        while (const std::size_t count = source(block.data(), block.size())) {
            writeBlock(m_file, {block.data(), count}, m_what);
        }
        if (!m_later) {
            flush(m_file, m_what);
        }
    }

    void setTime(const timespec& written) {
        const timespec times[2] = {{0, UTIME_OMIT}, written};
        if (futimens(m_file.get(), times) != 0) {
            fail(errno, m_what);
        }
    }

    void putInPlace(const std::string& name) {
        if (renameat(m_folder.get(), m_name.c_str(), m_folder.get(), name.c_str()) != 0) {
            fail(errno, m_what);
        }
        m_name.clear();
        if (!m_later) {
            flush(m_folder, m_what);
        }
    }

  private:
    const Descriptor& m_folder;
    const std::string m_what;
    const bool m_later;
    std::string m_name; ///< Empty after it was put in place.
    Descriptor m_file;
};

/// Locked while a file is replaced, so that each of two concurrent deliveries keeps the content
/// that it really replaces. The kernel releases the lock with the process.
class ExchangeLock {
  public:
    explicit ExchangeLock(const Descriptor& files) : m_own(openFolder(files.get(), ".")) {
        using namespace std::chrono;
        const auto end = steady_clock::now() + milliseconds(longestWaitMilliseconds);
        while (flock(m_own.get(), LOCK_EX | LOCK_NB) != 0) {
            if (errno != EWOULDBLOCK && errno != EINTR) {
                fail(errno, "the store's files");
            }
            if (steady_clock::now() > end) {
                throw StoreFailure(Fault::Busy, "the store's files are held by another process");
            }
            std::this_thread::sleep_for(milliseconds(1));
        }
    }

  private:
    Descriptor m_own;
};

std::string versionName(int number) {
    return std::string(ownPrefix) + std::to_string(number);
}

/// The number in a version's name, or 0.
int versionNumber(std::string_view name) {
    if (!name.starts_with(ownPrefix)) {
        return 0;
    }
    name.remove_prefix(ownPrefix.size());
    int number = 0;
    const auto result = std::from_chars(name.data(), name.data() + name.size(), number);
    const bool whole = result.ec == std::errc() && result.ptr == name.data() + name.size();
    return whole && number > 0 ? number : 0;
}

/// Prefix of an empty file that remains if versions up to the newest one are pruned, so that their
/// numbers are not reused.
constexpr std::string_view usedUpPrefix = ".tintgate-used-";

/// The highest number ever pruned in a folder of versions, or 0.
int lastUsedUp(const Descriptor& versions) {
    int last = 0;
    for (const auto& name : namesIn(versions)) {
        int number = 0;
        if (name.starts_with(usedUpPrefix)) {
            std::from_chars(name.data() + usedUpPrefix.size(), name.data() + name.size(), number);
        }
        last = std::max(last, number);
    }
    return last;
}

/// Records a number as used, before its version is removed.
void useUp(const Descriptor& versions, int number, const std::string& what) {
    const int former = lastUsedUp(versions);
    if (former >= number) {
        return;
    }
    const auto nameOf = [](int used) { return std::string(usedUpPrefix) + std::to_string(used); };
    const Descriptor mark(openat(versions.get(), nameOf(number).c_str(),
                                 O_WRONLY | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0660));
    if (!mark.isOpen()) {
        fail(errno, what);
    }
    flush(versions, what);
    if (former != 0) {
        unlinkat(versions.get(), nameOf(former).c_str(), 0);
    }
}

struct VersionFile {
    FileVersion version;
    ino_t inode = 0;
};

/// By number.
std::vector<VersionFile> versionsIn(const Descriptor& folder) {
    std::vector<VersionFile> found;
    for (const auto& name : namesIn(folder)) {
        struct stat status;
        const int number = versionNumber(name);
        if (number > 0 && fstatat(folder.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
            S_ISREG(status.st_mode)) {
            found.push_back({{number, static_cast<std::uint64_t>(status.st_size),
                              std::int64_t{status.st_mtim.tv_sec}},
                             status.st_ino});
        }
    }
    std::sort(found.begin(), found.end(),
              [](const auto& a, const auto& b) { return a.version.number < b.version.number; });
    return found;
}

/// Keeps the current file at the place as a version. The exchange lock must be held.
void keepVersion(const Descriptor& files, const Descriptor& folder, const Place& place) {
    const std::string what = place.text();
    struct stat current;
    if (fstatat(folder.get(), place.name().c_str(), &current, AT_SYMLINK_NOFOLLOW) != 0) {
        if (errno == ENOENT) {
            return;
        }
        fail(errno, what);
    }
    if (!S_ISREG(current.st_mode)) {
        throw StoreFailure(Fault::BadPath, what + " is not a file");
    }
    const Descriptor versions = walk(files, place.versions(), true, what);
    const auto kept = versionsIn(versions);
    // A process that was killed between this and the exchange has already kept it.
    if (!kept.empty() && kept.back().inode == current.st_ino) {
        return;
    }
    const int last = kept.empty() ? 0 : kept.back().version.number;
    const int number = std::max(last, lastUsedUp(versions)) + 1;
    if (linkat(folder.get(), place.name().c_str(), versions.get(), versionName(number).c_str(),
               0) != 0) {
        fail(errno, what);
    }
    flush(versions, what);
}

/// Removes a file's versions, and the folders above them as far as they are empty then. The
/// exchange lock is held, so that nobody else makes any of them. False if there are none.
bool removeVersions(const Descriptor& files, const Place& place) {
    const std::string what = place.text();
    auto folders = place.versions();
    bool removed = false;
    try {
        const Descriptor versions = walk(files, folders, false, what);
        for (const auto& version : versionsIn(versions)) {
            if (unlinkat(versions.get(), versionName(version.version.number).c_str(), 0) != 0) {
                fail(errno, what);
            }
            removed = true;
        }
        for (const auto& name : namesIn(versions)) {
            if (name.starts_with(usedUpPrefix)) {
                unlinkat(versions.get(), name.c_str(), 0);
            }
        }
        for (; folders.size() > 1; folders.pop_back()) {
            const Descriptor above = walk(files, {folders.begin(), folders.end() - 1}, false, what);
            if (unlinkat(above.get(), folders.back().c_str(), AT_REMOVEDIR) != 0) {
                break; // Versions of other files are in it.
            }
        }
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
    }
    return removed;
}

void deliver(const Descriptor& files, const Place& place, const Source& source) {
    const std::string what = place.text();
    const Descriptor folder = walk(files, place.folders(), true, what);
    Delivery delivery(folder, Permissions::of(files.get()), what);
    delivery.fill(source);
    const ExchangeLock lock(files);
    keepVersion(files, folder, place);
    delivery.putInPlace(place.name());
}

/// An entry other than a folder: its folder, its name, and its path relative to the files.
using ShowEntry = std::function<void(const Descriptor& folder, const std::string& name,
                                     const std::string& path, const struct stat& status)>;

/// The parts of a path below the files folder, names of the store's own with them.
std::vector<std::string> partsOnDisk(const std::string& path) {
    std::vector<std::string> parts;
    for (std::size_t start = 0; start < path.size();) {
        const std::size_t end = std::min(path.find('/', start), path.size());
        parts.push_back(path.substr(start, end - start));
        start = end + 1;
    }
    return parts;
}

/// Folders that are still to be visited. Few are open at a time, however deep they are.
class Visit {
  public:
    Visit(const Descriptor& files, std::string top) : m_files(files), m_pending{std::move(top)} {}

    /// Moves to the next folder; false after the last one. Skips folders that no longer exist.
    bool next() {
        while (!m_pending.empty()) {
            std::string path = std::move(m_pending.back());
            m_pending.pop_back();
            try {
                m_folder = opened(path);
                m_path = std::move(path);
                return true;
            } catch (const StoreFailure& failure) {
                if (!isMissing(failure)) {
                    throw;
                }
            }
        }
        return false;
    }

    const Descriptor& folder() const { return m_folder; }
    std::string pathOf(const std::string& name) const {
        return m_path.empty() ? name : m_path + "/" + name;
    }
    void add(std::string path) { m_pending.push_back(std::move(path)); }

  private:
    Descriptor opened(const std::string& path) const {
        const std::string what = shownServerPath(path);
        const std::size_t slash = path.rfind('/');
        if (slash != std::string::npos && m_folder.isOpen() && path.substr(0, slash) == m_path) {
            return walk(m_folder, {path.substr(slash + 1)}, false, what);
        }
        return walk(m_files, partsOnDisk(path), false, what);
    }

    const Descriptor& m_files;
    std::vector<std::string> m_pending;
    Descriptor m_folder;
    std::string m_path;
};

/// Calls back for each entry in the folder and below it, except the versions. An unreadable folder
/// is a failure.
void visitAll(const Descriptor& files, const std::string& top, const ShowEntry& show) {
    Visit visit(files, top);
    while (visit.next()) {
        for (const auto& name : namesIn(visit.folder())) {
            const std::string path = visit.pathOf(name);
            struct stat status;
            if (name == versionsFolder) {
                continue;
            }
            if (fstatat(visit.folder().get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
                if (errno != ENOENT) {
                    fail(errno, shownServerPath(path));
                }
            } else if (S_ISDIR(status.st_mode)) {
                visit.add(path);
            } else {
                show(visit.folder(), name, path, status);
            }
        }
    }
}

/// Removes abandoned deliveries of at least this age.
int removeDeliveries(const Descriptor& files, const std::string& top, std::int64_t seconds) {
    int removed = 0;
    visitAll(files, top,
             [&](const Descriptor& folder, const std::string& name, const std::string&,
                 const struct stat& status) {
                 if (!S_ISREG(status.st_mode) || !name.starts_with(deliveryPrefix) ||
                     time(nullptr) - status.st_mtim.tv_sec < seconds) {
                     return;
                 }
                 const Descriptor file(
                     openat(folder.get(), name.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC));
                 if (file.isOpen() && flock(file.get(), LOCK_EX | LOCK_NB) == 0 &&
                     unlinkat(folder.get(), name.c_str(), 0) == 0) {
                     ++removed;
                 }
             });
    return removed;
}

/// Reads a file to its end; its size. A fault is shown; one that is gone meanwhile is none.
std::uint64_t verifyContent(const Descriptor& folder, const std::string& name,
                            const std::string& where, const StoreEngine::ShowFault& show) {
    try {
        const Descriptor file = openFile(folder, name, where);
        std::vector<char> block(blockSize);
        std::uint64_t size = 0;
        std::size_t count = blockSize;
        while (count == blockSize) {
            count = readBlock(file, block.data(), block.size(), where);
            size += count;
        }
        return size;
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            show(where, failure.what());
        }
        return 0;
    }
}

/// The path and the folder of each file that has versions or had some.
using ShowVersions = std::function<void(const std::string& path, const Descriptor& folder)>;

void visitVersions(const Descriptor& files, const ShowVersions& show) {
    Visit visit(files, versionsFolder);
    while (visit.next()) {
        bool hasVersions = false;
        for (const auto& name : namesIn(visit.folder())) {
            struct stat status;
            if (fstatat(visit.folder().get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
                S_ISDIR(status.st_mode)) {
                visit.add(visit.pathOf(name));
            } else {
                hasVersions = true;
            }
        }
        if (hasVersions) {
            // Without the name of the topmost folder.
            const std::string path = visit.pathOf("");
            show(path.substr(std::strlen(versionsFolder) + 1,
                             path.size() - std::strlen(versionsFolder) - 2),
                 visit.folder());
        }
    }
}

/// The file that a snapshot saw, wherever it is by now: what was replaced is among the versions.
/// Throws StoreFailure (Busy) if it is gone.
Descriptor openSame(const Descriptor& files, const FileSnapshot::Entry& entry) {
    const std::string what = shownServerPath(entry.path);
    const auto opened = [&](std::vector<std::string> parts, const std::string& name) {
        const Descriptor folder = walk(files, parts, false, what);
        Descriptor file = openFile(folder, name, what);
        const struct stat status = statusOf(file.get(), what);
        const bool isSame = status.st_ino == entry.inode &&
                            status.st_mtim.tv_sec == entry.written.tv_sec &&
                            status.st_mtim.tv_nsec == entry.written.tv_nsec &&
                            static_cast<std::uint64_t>(status.st_size) == entry.size;
        return isSame ? std::move(file) : Descriptor();
    };
    const auto parts = partsOnDisk(entry.path);
    try {
        Descriptor file = opened({parts.begin(), parts.end() - 1}, parts.back());
        if (file.isOpen()) {
            return file;
        }
        std::vector<std::string> kept = {versionsFolder};
        kept.insert(kept.end(), parts.begin(), parts.end());
        for (const auto& version : versionsIn(walk(files, kept, false, what))) {
            if (version.inode == entry.inode) {
                file = opened(kept, versionName(version.version.number));
                if (file.isOpen()) {
                    return file;
                }
            }
        }
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
    }
    throw StoreFailure(Fault::Busy, what + " was removed while it was backed up: run it again");
}

void makeFilesFolder(const std::string& storeFolder, const std::string& path) {
    if (mkdir(path.c_str(), 0770) != 0) {
        if (errno != EEXIST) {
            fail(errno, path);
        }
        return;
    }
    const Descriptor folder = openFolder(AT_FDCWD, storeFolder.c_str());
    if (!folder.isOpen() || !Permissions::of(folder.get()).giveTo(path)) {
        fail(errno, path);
    }
}

} // namespace

ServerFiles::ServerFiles(const std::string& storeFolder, bool create) {
    const std::string path = storeFolder + "/files";
    if (create) {
        makeFilesFolder(storeFolder, path);
    }
    // A link here was set by the administrator, to put the files on another disk.
    m_files = Descriptor(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!m_files.isOpen()) {
        throw StoreFailure(Fault::Missing, path + ": " + std::strerror(errno));
    }
}

void ServerFiles::put(std::string_view path, std::istream& from) {
    const Place place(path);
    deliver(m_files, place, sourceOf(from, place));
}

void ServerFiles::get(std::string_view path, std::ostream& to) {
    const Place place(path);
    const std::string what = place.text();
    const Descriptor folder = walk(m_files, place.folders(), false, what);
    copyOut(openFile(folder, place.name(), what), to, what);
}

std::vector<FileEntry> ServerFiles::list() {
    std::vector<FileEntry> entries;
    visitAll(m_files, "",
             [&](const Descriptor&, const std::string& name, const std::string& path,
                 const struct stat& status) {
                 if (S_ISREG(status.st_mode) && !name.starts_with(ownPrefix)) {
                     entries.push_back({path, static_cast<std::uint64_t>(status.st_size),
                                        std::int64_t{status.st_mtim.tv_sec}});
                 }
             });
    std::sort(entries.begin(), entries.end(),
              [](const auto& a, const auto& b) { return a.path < b.path; });
    return entries;
}

std::optional<FileEntry> ServerFiles::at(std::string_view path) {
    const Place place(path);
    try {
        const Descriptor folder = walk(m_files, place.folders(), false, place.text());
        const Descriptor file = openFile(folder, place.name(), place.text());
        const struct stat status = statusOf(file.get(), place.text());
        return FileEntry{place.path(), static_cast<std::uint64_t>(status.st_size),
                         std::int64_t{status.st_mtim.tv_sec}};
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
        return std::nullopt;
    }
}

std::vector<FileVersion> ServerFiles::versions(std::string_view path) {
    const Place place(path);
    const std::string what = place.text();
    std::vector<FileVersion> list;
    try {
        const Descriptor folder = walk(m_files, place.versions(), false, what);
        struct stat current {};
        try {
            const Descriptor above = walk(m_files, place.folders(), false, what);
            fstatat(above.get(), place.name().c_str(), &current, AT_SYMLINK_NOFOLLOW);
        } catch (const StoreFailure& failure) {
            if (!isMissing(failure)) {
                throw;
            }
        }
        for (const auto& file : versionsIn(folder)) {
            // A version that is still in place has not been replaced yet.
            if (file.inode != current.st_ino) {
                list.push_back(file.version);
            }
        }
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
    }
    return list;
}

void ServerFiles::getVersion(std::string_view path, int number, std::ostream& to) {
    const Place place(path);
    const std::string what = place.text() + ", version " + std::to_string(number);
    const Descriptor folder = walk(m_files, place.versions(), false, what);
    copyOut(openFile(folder, versionName(number), what), to, what);
}

void ServerFiles::restoreVersion(std::string_view path, int number) {
    const Place place(path);
    const std::string what = place.text() + ", version " + std::to_string(number);
    const Descriptor folder = walk(m_files, place.versions(), false, what);
    const Descriptor version = openFile(folder, versionName(number), what);
    deliver(m_files, place,
            [&](char* block, std::size_t size) { return readBlock(version, block, size, what); });
}

int ServerFiles::pruneVersions(std::string_view path, const Pruning& which) {
    const Place place(path);
    const std::string what = place.text();
    const ExchangeLock lock(m_files);
    const auto list = versions(path);
    const std::size_t count = countPruned(list, which);
    if (count == 0) {
        return 0;
    }
    const Descriptor folder = walk(m_files, place.versions(), false, what);
    if (count == list.size()) {
        useUp(folder, list.back().number, what);
    }
    for (std::size_t i = 0; i < count; ++i) {
        if (unlinkat(folder.get(), versionName(list[i].number).c_str(), 0) != 0) {
            fail(errno, what);
        }
    }
    return static_cast<int>(count);
}

bool ServerFiles::remove(std::string_view path, std::optional<int> highestVersion) {
    const Place place(path);
    const std::string what = place.text();
    const ExchangeLock lock(m_files);
    if (highestVersion && this->highestVersion(path) != *highestVersion) {
        return false;
    }
    Descriptor folder;
    try {
        Descriptor found = walk(m_files, place.folders(), false, what);
        openFile(found, place.name(), what); // Throws if it is something else.
        folder = std::move(found);
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
    }
    // The file goes last: while it is there, a removal that was cut off can be finished.
    const bool hadVersions = removeVersions(m_files, place);
    if (!folder.isOpen()) {
        return hadVersions;
    }
    if (unlinkat(folder.get(), place.name().c_str(), 0) != 0) {
        fail(errno, what);
    }
    flush(folder, what);
    return true;
}

int ServerFiles::removeLeftovers() {
    constexpr std::int64_t youngestSeconds = 60; // Time between creating and locking a file.
    return removeDeliveries(m_files, "", youngestSeconds) +
           removeDeliveries(m_files, versionsFolder, youngestSeconds);
}

void ServerFiles::verify(Verified& found, const StoreEngine::ShowFault& show) {
    visitAll(m_files, "",
             [&](const Descriptor& folder, const std::string& name, const std::string& path,
                 const struct stat& status) {
                 if (!S_ISREG(status.st_mode)) {
                     show("/" + path, "is neither a file nor a folder");
                 } else if (!name.starts_with(ownPrefix)) {
                     ++found.files;
                     found.bytes += verifyContent(folder, name, "/" + path, show);
                 }
             });
    visitVersions(m_files, [&](const std::string& path, const Descriptor& folder) {
        try {
            verifyVersions(path, folder, found, show);
        } catch (const StoreFailure& failure) { // No path that a delivery makes, say.
            show("/" + path, failure.what());
        }
    });
}

void ServerFiles::verifyVersions(const std::string& path, const Descriptor& folder, Verified& found,
                                 const StoreEngine::ShowFault& show) {
    const auto list = versions(path);
    for (const auto& version : list) {
        ++found.versions;
        found.bytes +=
            verifyContent(folder, versionName(version.number),
                          "/" + path + ", version " + std::to_string(version.number), show);
    }
    const int highest = std::max(list.empty() ? 0 : list.back().number, lastUsedUp(folder));
    if (const std::string gap = gapIn(list, highest); !gap.empty()) {
        show("/" + path, gap);
    }
    // A removal may be under way, which takes the versions first.
    if (!at(path) && !versions(path).empty()) {
        show("/" + path, "has versions, but no file");
    }
}

FileSnapshot ServerFiles::snapshot(const std::function<void()>& within) {
    FileSnapshot snapshot;
    std::set<ino_t> inPlace;
    const auto take = [&](const Descriptor&, const std::string& name, const std::string& path,
                          const struct stat& status) {
        // A version that is still in place has not been replaced yet.
        const bool counts = S_ISREG(status.st_mode) && !name.starts_with(deliveryPrefix) &&
                            !(versionNumber(name) != 0 && inPlace.contains(status.st_ino));
        if (counts) {
            snapshot.entries.push_back(
                {path, status.st_ino, status.st_mtim, static_cast<std::uint64_t>(status.st_size)});
        }
    };
    list(); // So that the system knows the names already, and others wait less.
    const ExchangeLock lock(m_files);
    within();
    visitAll(m_files, "", take);
    for (const auto& entry : snapshot.entries) {
        inPlace.insert(entry.inode);
    }
    visitAll(m_files, versionsFolder, take);
    return snapshot;
}

void ServerFiles::copySnapshot(const FileSnapshot& snapshot, const std::string& storeFolder,
                               const StoreEngine::ShowProgress& progress) {
    const ServerFiles target(storeFolder, true);
    const Permissions permissions = Permissions::of(target.m_files.get());
    std::size_t done = 0;
    for (const auto& entry : snapshot.entries) {
        const std::string what = shownServerPath(entry.path);
        const Descriptor from = openSame(m_files, entry);
        auto parts = partsOnDisk(entry.path);
        const std::string name = std::move(parts.back());
        parts.pop_back();
        const Descriptor folder = walk(target.m_files, parts, true, what);
        Delivery delivery(folder, permissions, what, true);
        delivery.fill(
            [&](char* block, std::size_t size) { return readBlock(from, block, size, what); });
        delivery.setTime(entry.written);
        delivery.putInPlace(name);
        progress(++done, snapshot.entries.size());
    }
    if (syncfs(target.m_files.get()) != 0) {
        fail(errno, "the backup's files");
    }
}

void ServerFiles::placeVersion(std::string_view path, const FileVersion& version,
                               std::istream& from) {
    const Place place(path);
    const std::string what = place.text();
    const bool current = version.number == 0;
    std::optional<ExchangeLock> lock;
    if (!m_later) {
        lock.emplace(m_files); // Nobody removes the folder meanwhile.
    }
    const Descriptor folder =
        walk(m_files, current ? place.folders() : place.versions(), true, what);
    Delivery delivery(folder, Permissions::of(m_files.get()), what, m_later);
    delivery.fill(sourceOf(from, place));
    delivery.setTime({static_cast<time_t>(version.time), 0});
    delivery.putInPlace(current ? place.name() : versionName(version.number));
}

int ServerFiles::highestVersion(std::string_view path) {
    const Place place(path);
    const auto list = versions(path);
    int highest = list.empty() ? 0 : list.back().number;
    try {
        highest =
            std::max(highest, lastUsedUp(walk(m_files, place.versions(), false, place.text())));
    } catch (const StoreFailure& failure) {
        if (!isMissing(failure)) {
            throw;
        }
    }
    return highest;
}

void ServerFiles::raiseHighestVersion(std::string_view path, int number) {
    const Place place(path);
    const std::string what = place.text();
    const ExchangeLock lock(m_files);
    useUp(walk(m_files, place.versions(), true, what), number, what);
}

void ServerFiles::finishCopy() {
    for (const char* const top : {"", versionsFolder}) {
        removeDeliveries(m_files, top, 0);
    }
    if (syncfs(m_files.get()) != 0) {
        fail(errno, "the store's files");
    }
}

} // namespace store
