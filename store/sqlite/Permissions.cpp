// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/Permissions.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "store/StoreEngine.h"

namespace store {

Permissions Permissions::of(int folder) {
    struct stat status;
    if (fstat(folder, &status) != 0) {
        throw StoreFailure(Fault::Other,
                           std::string("the store's folder: ") + std::strerror(errno));
    }
    Permissions permissions;
    permissions.m_mode = status.st_mode;
    permissions.m_group = status.st_gid;
    return permissions;
}

bool Permissions::giveTo(int made) const {
    struct stat status;
    if (fstat(made, &status) != 0) {
        return false;
    }
    mode_t mode = m_mode & (S_ISDIR(status.st_mode) ? 02770 : 0660);
    if (status.st_gid != m_group && fchown(made, static_cast<uid_t>(-1), m_group) != 0) {
        mode &= 0700;
    }
    return fchmod(made, mode) == 0;
}

bool Permissions::giveTo(const std::string& path) const {
    const base::Descriptor made(open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC));
    return made.isOpen() && giveTo(made.get());
}

} // namespace store
