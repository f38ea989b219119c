// SPDX-License-Identifier: Apache-2.0
#include "report/PageFile.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "colour/ColourFile.h"

namespace report {
namespace {

/// A page under a name that nobody looks for, gone again unless it gets its own.
class Draft {
  public:
    explicit Draft(const std::string& folder) : m_path(folder + "/.report-XXXXXX") {
        m_file = mkostemp(m_path.data(), O_CLOEXEC);
    }
    ~Draft() {
        if (m_file < 0) {
            return;
        }
        close(m_file);
        if (!m_named) {
            unlink(m_path.c_str());
        }
    }
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;

    /// False with errno set.
    bool write(std::string_view text) const {
        if (m_file < 0) {
            return false;
        }
        while (!text.empty()) {
            const ssize_t count = ::write(m_file, text.data(), text.size());
            if (count < 0 && errno != EINTR) {
                return false;
            }
            text.remove_prefix(count < 0 ? 0 : static_cast<std::size_t>(count));
        }
        const mode_t mask = umask(0);
        umask(mask);
        return fchmod(m_file, 0666 & ~mask) == 0 && fsync(m_file) == 0;
    }

    /// Takes over a name, and with `fresh` only one that is free: errno is EEXIST then.
    bool name(const std::string& path, bool fresh) {
        m_named = fresh ? nameFresh(path) : rename(m_path.c_str(), path.c_str()) == 0;
        return m_named;
    }

  private:
    bool nameFresh(const std::string& path) const {
        if (renameat2(AT_FDCWD, m_path.c_str(), AT_FDCWD, path.c_str(), RENAME_NOREPLACE) == 0) {
            return true;
        }
        if (errno != EINVAL && errno != ENOSYS) {
            return false;
        }
        // This file system can't, so the name is taken first.
        const int place = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        if (place < 0) {
            return false;
        }
        close(place);
        if (rename(m_path.c_str(), path.c_str()) == 0) {
            return true;
        }
        const int reason = errno;
        unlink(path.c_str());
        errno = reason;
        return false;
    }

    std::string m_path;
    int m_file = -1;
    bool m_named = false;
};

bool holds(const std::string& path, std::string_view page) {
    std::string bytes;
    return colour::readWholeFile(path, page.size(), bytes) == colour::Failure::None &&
           bytes == page;
}

} // namespace

std::string pageStem(const Meta& meta) {
    const std::string& t = meta.created;
    return "report-strip" + std::to_string(meta.strip) + "-" + t.substr(0, 10) + "-" +
           t.substr(11, 2) + t.substr(14, 2) + t.substr(17, 2);
}

std::string keepPage(const std::string& folder, const std::string& stem, std::string_view page,
                     std::string& problem) {
    constexpr int mostOfOneName = 10'000;
    Draft draft(folder);
    if (!draft.write(page)) {
        problem = std::strerror(errno);
        return {};
    }
    for (int number = 1; number <= mostOfOneName; ++number) {
        const std::string path =
            folder + "/" + stem + (number == 1 ? "" : "-" + std::to_string(number)) + ".html";
        if (draft.name(path, true)) {
            return path;
        }
        if (errno != EEXIST) {
            problem = std::strerror(errno);
            return {};
        }
        if (holds(path, page)) {
            return path;
        }
    }
    problem = "every name is taken";
    return {};
}

bool replacePage(const std::string& path, std::string_view page, std::string& problem) {
    const std::size_t slash = path.rfind('/');
    Draft draft(slash == path.npos ? "." : path.substr(0, slash));
    if (draft.write(page) && draft.name(path, false)) {
        return true;
    }
    problem = std::strerror(errno);
    return false;
}

} // namespace report
