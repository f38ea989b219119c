// SPDX-License-Identifier: Apache-2.0
#include "base/FileDraft.h"

#include <cerrno>
#include <cstdio>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace base {
namespace {

std::string folderOf(const std::string& path) {
    const std::string folder = path.substr(0, path.rfind('/') + 1);
    return folder.empty() ? "./" : folder;
}

mode_t usualMode() {
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

/// The new name must survive a loss of power as well as the content.
bool flushFolder(const std::string& path) {
    const Descriptor folder(open(folderOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    // Not a failure: an unreadable folder, or a file system that does not flush folders.
    return !folder.isOpen() || fsync(folder.get()) == 0 || errno == EINVAL;
}

bool isUnsupported() {
    return errno == ENOSYS || errno == EPERM;
}

} // namespace

FileDraft::FileDraft(const std::string& target)
    : m_prefix(folderOf(target) + ".tintgate-new-"),
      m_file(open(folderOf(target).c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0666)),
      m_path("/proc/self/fd/" + std::to_string(m_file.get())) {
    // A name is given to the file by way of /proc.
    if (!m_file.isOpen() || access(m_path.c_str(), F_OK) != 0) {
        m_path = m_prefix + "XXXXXX";
        m_file = Descriptor(mkostemp(m_path.data(), O_CLOEXEC));
        m_hasName = m_file.isOpen();
    }
    if (m_file.isOpen() && fchmod(m_file.get(), usualMode()) != 0 && !isUnsupported()) {
        m_file.close();
    }
}

FileDraft::~FileDraft() {
    if (m_hasName) {
        const int reason = errno;
        unlink(m_path.c_str());
        errno = reason;
    }
}

bool FileDraft::write(std::string_view bytes) const {
    return writeAll(m_file, bytes) == bytes.size();
}

bool FileDraft::keepAccessOf(const std::string& old) const {
    struct stat status = {};
    if (stat(old.c_str(), &status) != 0) {
        return errno == ENOENT;
    }
    // In this order, because changing the owner clears the set-user-ID and set-group-ID bits.
    static_cast<void>(fchown(m_file.get(), status.st_uid, status.st_gid) == 0);
    return fchmod(m_file.get(), status.st_mode & 07777) == 0 || isUnsupported();
}

/// Nothing replaces a file by one without a name.
bool FileDraft::giveOwnName() {
    for (int attempt = 0; !m_hasName; ++attempt) {
        const std::string name =
            m_prefix + std::to_string(getpid()) + "-" + std::to_string(attempt);
        if (linkat(AT_FDCWD, m_path.c_str(), AT_FDCWD, name.c_str(), AT_SYMLINK_FOLLOW) == 0) {
            m_path = name;
            m_hasName = true;
        } else if (errno != EEXIST) {
            return false;
        }
    }
    return true;
}

bool FileDraft::replace(const std::string& target, Flush flush) {
    if (!m_file.isOpen() || (flush == Flush::Yes && fsync(m_file.get()) != 0) || !giveOwnName() ||
        !m_file.close() || std::rename(m_path.c_str(), target.c_str()) != 0) {
        return false;
    }
    m_hasName = false;
    return flush == Flush::No || flushFolder(target);
}

bool FileDraft::nameFresh(const std::string& target) {
    if (!m_file.isOpen() || fsync(m_file.get()) != 0) {
        return false;
    }
    const int flags = m_hasName ? 0 : AT_SYMLINK_FOLLOW;
    if (linkat(AT_FDCWD, m_path.c_str(), AT_FDCWD, target.c_str(), flags) != 0) {
        if (!m_hasName || !(isUnsupported() || errno == EOPNOTSUPP)) {
            return false;
        }
        // This file system has no links, so the name is reserved first.
        const Descriptor place(open(target.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
        if (!place.isOpen()) {
            return false;
        }
        if (std::rename(m_path.c_str(), target.c_str()) != 0) {
            const int reason = errno;
            unlink(target.c_str());
            errno = reason;
            return false;
        }
    } else if (m_hasName) {
        unlink(m_path.c_str());
    }
    m_hasName = false;
    return m_file.close() && flushFolder(target);
}

} // namespace base
