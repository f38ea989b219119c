// SPDX-License-Identifier: Apache-2.0
#include "base/FileDraft.h"

#include <cerrno>
#include <cstdio>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Malloc.h"

namespace base {
namespace {

std::string folderOf(const std::string& path) {
    return path.substr(0, path.rfind('/') + 1);
}

mode_t usualMode() {
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

/// The new name must survive a loss of power as well as the content.
bool flushFolder(const std::string& path) {
    const std::string folder = folderOf(path);
    const Descriptor descriptor(
        open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    // Not a failure: an unreadable folder, or a file system that does not flush folders.
    return !descriptor.isOpen() || fsync(descriptor.get()) == 0 || errno == EINVAL;
}

} // namespace

FileDraft::FileDraft(const std::string& target)
    : m_path(folderOf(target) + ".tintgate-new-XXXXXX") {
    m_file = Descriptor(mkostemp(m_path.data(), O_CLOEXEC));
    if (!m_file.isOpen()) {
        m_path.clear();
    } else if (fchmod(m_file.get(), usualMode()) != 0 && errno != ENOSYS && errno != EPERM) {
        m_file.close();
    }
}

FileDraft::~FileDraft() {
    if (!m_path.empty()) {
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
        return false;
    }
    // In this order, because changing the owner clears the set-user-ID and set-group-ID bits.
    static_cast<void>(fchown(m_file.get(), status.st_uid, status.st_gid) == 0);
    return fchmod(m_file.get(), status.st_mode & 07777) == 0 || errno == ENOSYS || errno == EPERM;
}

bool FileDraft::finish() {
    return m_file.isOpen() && fsync(m_file.get()) == 0 && m_file.close();
}

bool FileDraft::replace(const std::string& target) {
    if (!finish() || std::rename(m_path.c_str(), target.c_str()) != 0) {
        return false;
    }
    m_path.clear();
    return flushFolder(target);
}

bool FileDraft::nameFresh(const std::string& target) {
    if (m_file.isOpen() && !finish()) {
        return false;
    }
    if (renameat2(AT_FDCWD, m_path.c_str(), AT_FDCWD, target.c_str(), RENAME_NOREPLACE) != 0) {
        if (errno != EINVAL && errno != ENOSYS) {
            return false;
        }
        // This file system has no renameat2 flags, so the name is reserved first.
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
    }
    m_path.clear();
    return flushFolder(target);
}

bool writeWholeFile(const std::string& path, std::string_view bytes) {
    const Malloced<char> real(realpath(path.c_str(), nullptr));
    const bool exists = real != nullptr;
    if (!exists && errno != ENOENT) {
        return false;
    }
    const std::string target = exists ? real.get() : path;
    FileDraft draft(target);
    return draft.isOpen() && draft.write(bytes) && (!exists || draft.keepAccessOf(target)) &&
           draft.replace(target);
}

} // namespace base
