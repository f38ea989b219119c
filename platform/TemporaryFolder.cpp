// SPDX-License-Identifier: Apache-2.0
#include "platform/TemporaryFolder.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

bool isFolder(const char* path) {
    struct stat status;
    return stat(path, &status) == 0 && S_ISDIR(status.st_mode);
}

/// The path made absolute. Unchanged if the current folder no longer exists.
std::string absolute(const std::string& path) {
    std::error_code failure;
    const std::filesystem::path folder = std::filesystem::current_path(failure);
    return failure ? path : (folder / path).string();
}

} // namespace

bool haveOwnFolder(const std::string& path, unsigned mode) {
    mkdir(path.c_str(), mode);
    struct stat status;
    return lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode) &&
           status.st_uid == geteuid();
}

std::string temporaryFolder() {
    for (const char* variable : {"TMPDIR", "TMP", "TEMP"}) {
        const char* path = std::getenv(variable);
        if (path != nullptr && isFolder(path)) {
            const std::string folder = absolute(path);
            setenv(variable, folder.c_str(), 1);
            return folder;
        }
    }
    std::string path = "/tmp/tintgate-" + std::to_string(geteuid());
    if (!haveOwnFolder(path, 0700)) {
        return {};
    }
    setenv("TMPDIR", path.c_str(), 1);
    return path;
}

} // namespace platform
