#include "analysis/OutputFile.h"

#include <cerrno>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ExitCodes.h"

namespace analysis {
namespace {

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

bool writeAll(int fd, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = ::write(fd, bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR)
            return false;
        if (written > 0)
            bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

/// Room for the bytes before the old contents go. File systems that can't reserve take the risk.
bool reserve(int fd, std::size_t size) {
    return size == 0 || ::fallocate(fd, FALLOC_FL_KEEP_SIZE, 0, static_cast<off_t>(size)) == 0 ||
           (errno != ENOSPC && errno != EDQUOT && errno != EFBIG);
}

int writeInPlace(const std::string& path, std::string_view bytes) {
    Descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666));
    struct stat status {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return exitOutputNotWritable;
    const bool regular = S_ISREG(status.st_mode);
    if (regular && !reserve(file.get(), bytes.size()))
        return exitOutputIncomplete;
    if (!writeAll(file.get(), bytes))
        return exitOutputIncomplete;
    if (regular && ::ftruncate(file.get(), static_cast<off_t>(bytes.size())) != 0)
        return exitOutputIncomplete;
    return file.close() ? exitDone : exitOutputIncomplete;
}

/// A new file beside `path` whose name nobody else has.
int openDraft(const std::string& path, std::string& draft) {
    const std::string folder = path.substr(0, path.rfind('/') + 1);
    for (int attempt = 0; attempt < 100; ++attempt) {
        draft = folder + ".tintgate-" + std::to_string(::getpid()) + "-" + std::to_string(attempt);
        const int fd = ::open(draft.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (fd >= 0 || errno != EEXIST)
            return fd;
    }
    return -1;
}

/// `old`: what stands at the path, or null.
int replaceWhole(const std::string& path, std::string_view bytes, const struct stat* old) {
    std::string draft;
    Descriptor file(openDraft(path, draft));
    if (!file)
        return old ? writeInPlace(path, bytes) : static_cast<int>(exitOutputNotWritable);
    // Only root may give a file away, and some file systems have no modes: neither is a failure.
    if (old && ::fchown(file.get(), old->st_uid, old->st_gid) == 0)
        static_cast<void>(::fchmod(file.get(), old->st_mode & 07777));
    int status = exitDone;
    if (!writeAll(file.get(), bytes) || ::fsync(file.get()) != 0 || !file.close())
        status = exitOutputIncomplete;
    else if (::rename(draft.c_str(), path.c_str()) != 0)
        status = exitOutputNotWritable;
    if (status != exitDone)
        ::unlink(draft.c_str());
    return status;
}

} // namespace

int writeOutputFile(const std::string& path, std::string_view bytes) {
    struct stat old {};
    const bool exists = ::lstat(path.c_str(), &old) == 0;
    if (exists && S_ISDIR(old.st_mode))
        return exitOutputNotWritable;
    // A rename would replace a file that its owner has made read-only.
    if (exists && ::access(path.c_str(), W_OK) != 0 && errno != ENOENT)
        return exitOutputNotWritable;
    if (exists && !S_ISREG(old.st_mode))
        return writeInPlace(path, bytes);

    return replaceWhole(path, bytes, exists ? &old : nullptr);
}

} // namespace analysis
