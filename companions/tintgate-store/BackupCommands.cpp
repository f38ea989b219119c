// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <iostream>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/CopyStore.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Rows.h"

namespace admin {

namespace {

namespace fs = std::filesystem;

struct BackupOptions {
    std::string folder;
};

struct RestoreOptions {
    std::string backup;
    bool replace = false;
};

/// Of a folder of this machine: a backup may have a path that no job could name.
std::string absolutePath(const std::string& typed) {
    std::string path = fs::absolute(typed).lexically_normal().string();
    while (path.size() > 1 && path.back() == '/') {
        path.pop_back();
    }
    return path;
}

void backUp(const Invocation& invocation, const BackupOptions& options) {
    const auto store = invocation.open();
    const std::string folder = absolutePath(options.folder);
    {
        Progress progress("pages and files");
        store->backUp(folder,
                      [&](std::size_t done, std::size_t total) { progress.done(done, total); });
    }
    if (invocation.json) {
        showObject({{"backup", textOrBytes(folder)}}, true);
        return;
    }
    std::cout << "Backed up to " << printable(folder) << '\n';
}

bool isThere(const std::string& path) {
    struct stat status;
    return lstat(path.c_str(), &status) == 0;
}

bool isEmptyFolder(const std::string& path) {
    std::error_code failure;
    return fs::is_directory(path, failure) && fs::is_empty(path, failure);
}

/// The name for the former store: the store's own name followed by the current time.
std::string nameForFormer(const std::string& address) {
    const std::time_t now = std::time(nullptr);
    std::tm parts{};
    localtime_r(&now, &parts);
    char text[40];
    std::strftime(text, sizeof text, ".before-%Y%m%d-%H%M%S", &parts);
    return address + text;
}

[[noreturn]] void failToMove(const std::string& path) {
    throw Failure(Status::ReadOnly,
                  printable(path) + " can't be put in its place: " + std::strerror(errno));
}

/// Makes the folder of the new store as open to others as the former one.
void makeFolderLike(const std::string& former, const std::string& folder) {
    struct stat status;
    if (stat(former.c_str(), &status) != 0 ||
        (mkdir(folder.c_str(), 0700) != 0 && errno != EEXIST) ||
        chown(folder.c_str(), static_cast<uid_t>(-1), status.st_gid) != 0 ||
        chmod(folder.c_str(), status.st_mode & 07777) != 0) {
        throw Failure(Status::ReadOnly,
                      printable(folder) + " can't be made: " + std::strerror(errno));
    }
}

/// Puts a new store beside a folder's store and then exchanges the two in one step. Returns where
/// the former one is now.
std::string replace(store::StoreEngine& from, const std::string& address, std::string& told) {
    const std::string fresh = address + ".restoring";
    const std::string former = nameForFormer(address);
    try {
        store::openStore(fresh, store::Access::Read);
        // Cut off between the two last steps: this is what was to be replaced.
        if (rename(fresh.c_str(), former.c_str()) != 0) {
            failToMove(fresh);
        }
    } catch (const store::StoreFailure&) { // Mostly there is nothing.
    }
    makeFolderLike(address, fresh);
    told = copyStore(from, *store::openCopy(fresh));
    if (renameat2(AT_FDCWD, fresh.c_str(), AT_FDCWD, address.c_str(), RENAME_EXCHANGE) != 0) {
        failToMove(fresh);
    }
    if (rename(fresh.c_str(), former.c_str()) != 0) {
        failToMove(former);
    }
    return former;
}

void restore(const Invocation& invocation, const RestoreOptions& options) {
    const std::string& address = invocation.givenAddress();
    const auto from = store::openStore(completeAddress(options.backup), store::Access::Read);
    std::string fault;
    from->verify([&](const std::string& where, const std::string& what) {
        fault = fault.empty() ? where + ": " + what : fault;
    });
    if (!fault.empty()) {
        throw Failure(Status::Damaged, "the backup is damaged: " + fault +
                                           "; \"verify\" shows all, and \"copy\" copies "
                                           "what can be read");
    }
    const bool isFolder = address[0] == '/';
    std::string former;
    std::string told;
    if (isFolder && isThere(address) && !isEmptyFolder(address) && options.replace) {
        former = replace(*from, address, told);
    } else {
        told = copyStore(*from, *store::openCopy(address));
    }
    if (invocation.json) {
        showObject({{"restored", textOrBytes(address)},
                    {"former", former.empty() ? Row() : Row(textOrBytes(former))}},
                   true);
        return;
    }
    std::cout << "Restored " << told << '\n';
    if (!former.empty()) {
        std::cout << "What was there is in " << printable(former) << '\n';
    }
}

} // namespace

void addBackupCommands(Command program, Invocation& invocation) {
    const auto backup = std::make_shared<BackupOptions>();
    auto command = addCommand<BackupOptions>(
        program, invocation, "backup", "Copy a store in a folder while others work on it", backup,
        [&](const BackupOptions& given) { backUp(invocation, given); });
    command.option("to", backup->folder, "Folder for the backup: empty, or not there").required();
    command.footer("Tickets and files are of one moment. The backup is a store itself: \"verify\" "
                   "proves it, reports can be made\nof it, and \"restore\" or \"copy\" put it "
                   "in place. One that was cut off is run again. A store on a\nserver is backed up "
                   "with pg_dump: see docs/stores.md.");

    const auto restored = std::make_shared<RestoreOptions>();
    auto restoring = addCommand<RestoreOptions>(
        program, invocation, "restore", "Make the store of a backup", restored,
        [&](const RestoreOptions& given) { restore(invocation, given); });
    restoring.option("backup", restored->backup, "The backup's folder, or any other store")
        .required();
    restoring.flag("--replace", restored->replace,
                   "Put it in the place of a store in a folder, which is kept beside it");
    restoring.footer("The backup is verified first. Nobody should be logged in. Without --replace "
                     "there must be no store; on a\nserver that is so after DROP SCHEMA tintgate "
                     "CASCADE. What is restored has all that \"copy\" copies.");
}

} // namespace admin
