// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/SqliteBackup.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <optional>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "store/sqlite/Permissions.h"

namespace store::sqlite {

namespace {

namespace fs = std::filesystem;

constexpr const char* partName = "/tickets.db.part";
constexpr int pagesAtOnce = 1'000;

[[noreturn]] void failAt(const std::string& path, int error) {
    throw StoreFailure(error == ENOSPC || error == EDQUOT ? Fault::Full : Fault::ReadOnly,
                       path + ": " + std::strerror(error));
}

base::Descriptor openFolder(const std::string& path) {
    base::Descriptor folder(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder.isOpen()) {
        failAt(path, errno);
    }
    return folder;
}

/// Whether a folder is empty, or has no more in it than a backup that was cut off.
bool isFree(const std::string& folder) {
    std::error_code failure;
    for (const auto& entry : fs::directory_iterator(folder, failure)) {
        const std::string name = entry.path().filename();
        if (name != "files" && !name.starts_with(partName + 1)) {
            return false;
        }
    }
    // With nothing but files it is somebody's folder, and not to be emptied.
    return !failure &&
           (!fs::exists(folder + "/files", failure) || fs::exists(folder + partName, failure));
}

/// Makes the backup's folder, as open to others as the store's is, and empties it. Nobody else
/// backs up to it while the result is there.
base::Descriptor takeFolder(const std::string& storeFolder, const std::string& path) {
    const bool isMade = mkdir(path.c_str(), 0700) == 0;
    if (!isMade && errno != EEXIST) {
        failAt(path, errno);
    }
    base::Descriptor folder = openFolder(path);
    if (flock(folder.get(), LOCK_EX | LOCK_NB) != 0) {
        throw StoreFailure(Fault::Busy, "somebody else backs up to " + path);
    }
    if (!isFree(path)) {
        throw StoreFailure(Fault::Exists, path + " is not empty");
    }
    if (isMade) {
        Permissions::of(openFolder(storeFolder).get()).giveTo(folder.get());
    }
    std::error_code failure;
    fs::remove_all(path + "/files", failure);
    for (const char* const ending : {"", "-journal", "-wal", "-shm"}) {
        fs::remove(path + partName + ending, failure);
    }
    return folder;
}

/// Copies what the source's transaction sees.
void copyDatabase(Database& from, Database& to, const StoreEngine::ShowProgress& progress) {
    const auto finish = [](sqlite3_backup* backup) { sqlite3_backup_finish(backup); };
    const std::unique_ptr<sqlite3_backup, decltype(finish)> backup(
        sqlite3_backup_init(to.get(), "main", from.get(), "main"), finish);
    if (backup == nullptr) {
        fail(to.get(), sqlite3_errcode(to.get()));
    }
    int code = SQLITE_OK;
    while (code == SQLITE_OK) {
        code = sqlite3_backup_step(backup.get(), pagesAtOnce);
        const int pages = sqlite3_backup_pagecount(backup.get());
        progress(static_cast<std::size_t>(pages - sqlite3_backup_remaining(backup.get())),
                 static_cast<std::size_t>(pages));
    }
    if (code != SQLITE_DONE) {
        fail(nullptr, code);
    }
}

} // namespace

void backUp(Database& database, ServerFiles& files, const std::string& storeFolder,
            const std::string& folder, const StoreEngine::ShowProgress& progress) {
    const base::Descriptor target = takeFolder(storeFolder, folder);
    const std::string part = folder + partName;
    FileSnapshot snapshot;
    {
        std::optional<Database> writers;
        std::optional<Transaction> keptOut;
        std::optional<ReadTransaction> moment;
        snapshot = files.snapshot([&] {
            try {
                writers.emplace(storeFolder + "/tickets.db", Opening::Existing);
                keptOut.emplace(*writers);
            } catch (const StoreFailure& failure) {
                if (failure.status != Fault::ReadOnly) {
                    throw;
                }
                keptOut.reset(); // Nobody can write.
            }
            moment.emplace(database);
            database.number("SELECT count(*) FROM tickets"); // Fixes the moment.
        });
        keptOut.reset();
        Database copy(part, Opening::New);
        Permissions::of(target.get()).giveTo(part);
        copy.run("PRAGMA synchronous = FULL");
        copyDatabase(database, copy, progress);
    }
    files.copySnapshot(snapshot, folder, progress);
    if (std::rename(part.c_str(), (folder + "/tickets.db").c_str()) != 0 ||
        fsync(target.get()) != 0) {
        failAt(folder, errno);
    }
}

} // namespace store::sqlite
