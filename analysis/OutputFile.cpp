// SPDX-License-Identifier: Apache-2.0
#include "analysis/OutputFile.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ExitCodes.h"
#include "colour/ColourFile.h"

namespace analysis {
namespace {

/// Beyond this an old file is not held in memory to put it back.
constexpr std::size_t largestKept = std::size_t{1} << 30;

class Descriptor {
  public:
    explicit Descriptor(int fd) : m_fd(fd) {}
    ~Descriptor() { close(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    int get() const { return m_fd; }
    explicit operator bool() const { return m_fd >= 0; }

    /// Some file systems tell of a full disk only here.
    bool close() { return m_fd < 0 || ::close(std::exchange(m_fd, -1)) == 0; }

  private:
    int m_fd;
};

/// Writes from the start on. Gives how much was written: all of it, or up to the failure.
std::size_t writeAll(int fd, std::string_view bytes) {
    std::size_t done = 0;
    while (done < bytes.size()) {
        const ssize_t written = ::write(fd, bytes.data() + done, bytes.size() - done);
        if (written < 0 && errno != EINTR) {
            break;
        }
        if (written > 0) {
            done += static_cast<std::size_t>(written);
        }
    }
    return done;
}

/// Puts back what the first `written` bytes have replaced. It needs no room on the disk.
void restore(int fd, std::string_view old, std::size_t written) {
    if (::lseek(fd, 0, SEEK_SET) == 0 &&
        writeAll(fd, old.substr(0, written)) == std::min(old.size(), written)) {
        static_cast<void>(::ftruncate(fd, static_cast<off_t>(old.size())) == 0);
    }
}

int writeInPlace(const std::string& path, std::string_view bytes) {
    std::string old;
    struct stat status {};
    if (::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
        colour::readWholeFile(path, largestKept, old) != colour::Failure::None) {
        return exitOutputNotWritable; // what can't be kept is not put at risk
    }
    Descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666));
    if (!file || ::fstat(file.get(), &status) != 0) {
        return exitOutputNotWritable;
    }
    const std::size_t written = writeAll(file.get(), bytes);
    const bool regular = S_ISREG(status.st_mode);
    if (written < bytes.size()) {
        if (regular) {
            restore(file.get(), old, written);
        }
        return exitOutputIncomplete;
    }
    if (regular && ::ftruncate(file.get(), static_cast<off_t>(bytes.size())) != 0) {
        return exitOutputIncomplete;
    }
    return file.close() ? exitDone : exitOutputIncomplete;
}

/// A new file beside `path` whose name nobody else has.
int openDraft(const std::string& path, std::string& draft) {
    const std::string folder = path.substr(0, path.rfind('/') + 1);
    for (int attempt = 0; attempt < 100; ++attempt) {
        draft = folder + ".tintgate-" + std::to_string(::getpid()) + "-" + std::to_string(attempt);
        const int fd = ::open(draft.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (fd >= 0 || errno != EEXIST) {
            return fd;
        }
    }
    return -1;
}

/// `old`: what stands at the path, or null.
int replaceWhole(const std::string& path, std::string_view bytes, const struct stat* old) {
    std::string draft;
    Descriptor file(openDraft(path, draft));
    if (!file) {
        return old ? writeInPlace(path, bytes) : static_cast<int>(exitOutputNotWritable);
    }
    // Only root may give a file away, and some file systems have no modes: neither is a failure.
    if (old && ::fchown(file.get(), old->st_uid, old->st_gid) == 0) {
        static_cast<void>(::fchmod(file.get(), old->st_mode & 07777));
    }
    int status = exitDone;
    if (writeAll(file.get(), bytes) < bytes.size() || ::fsync(file.get()) != 0 || !file.close()) {
        status = exitOutputIncomplete;
    } else if (::rename(draft.c_str(), path.c_str()) != 0) {
        status = exitOutputNotWritable;
    }
    if (status != exitDone) {
        ::unlink(draft.c_str());
    }
    return status;
}

} // namespace

int writeOutputFile(const std::string& path, std::string_view bytes) {
    struct stat old {};
    const bool exists = ::lstat(path.c_str(), &old) == 0;
    if (exists && S_ISDIR(old.st_mode)) {
        return exitOutputNotWritable;
    }
    // A rename would replace a file that its owner has made read-only.
    if (exists && ::access(path.c_str(), W_OK) != 0 && errno != ENOENT) {
        return exitOutputNotWritable;
    }
    if (exists && !S_ISREG(old.st_mode)) {
        return writeInPlace(path, bytes);
    }

    return replaceWhole(path, bytes, exists ? &old : nullptr);
}

int checkOutput(const std::string& path, std::initializer_list<std::string> inputs) {
    for (const std::string& input : inputs) {
        std::error_code error; // Devices and pipes, and files that are not there, are not the same.
        if (std::filesystem::equivalent(path, input, error)) {
            return exitOutputIsInput;
        }
    }
    return colour::isEmptyOrCgats(path) ? exitDone : exitOutputNotOurs;
}

} // namespace analysis
