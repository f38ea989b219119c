#include "platform/TemporaryFolder.h"

#include <cstdlib>

#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

bool isFolder(const char* path) {
    struct stat status;
    return stat(path, &status) == 0 && S_ISDIR(status.st_mode);
}

// Anybody may make names in /tmp, so what stands there is looked at without following a link.
bool isOurOwnFolder(const char* path) {
    struct stat status;
    return lstat(path, &status) == 0 && S_ISDIR(status.st_mode) && status.st_uid == geteuid();
}

} // namespace

std::string temporaryFolder() {
    for (const char* variable : {"TMPDIR", "TMP", "TEMP"}) {
        const char* path = std::getenv(variable);
        if (path != nullptr && isFolder(path)) {
            return path;
        }
    }
    std::string path = "/tmp/tintgate-" + std::to_string(geteuid());
    mkdir(path.c_str(), 0700);
    if (!isOurOwnFolder(path.c_str())) {
        return {};
    }
    setenv("TMPDIR", path.c_str(), 1);
    return path;
}

} // namespace platform
