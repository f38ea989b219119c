// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfFile.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <new>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace jdf {
namespace {

class Descriptor {
  public:
    explicit Descriptor(int number) : m_number(number) {}
    ~Descriptor() { close(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    bool isOpen() const { return m_number >= 0; }
    int number() const { return m_number; }

    void reset(int number) {
        close();
        m_number = number;
    }

    /// close can be the first call to report a failed write.
    bool close() {
        const int number = m_number;
        m_number = -1;
        return number < 0 || ::close(number) == 0;
    }

  private:
    int m_number;
};

/// Calls read or write until `size` bytes are transferred.
template<class Byte>
bool transfer(ssize_t (*call)(int, Byte*, std::size_t), const Descriptor& file, Byte* bytes,
              long size) {
    auto* at = static_cast<std::conditional_t<std::is_const_v<Byte>, const char, char>*>(bytes);
    while (size > 0) {
        const ssize_t count = call(file.number(), at, static_cast<std::size_t>(size));
        if (count == 0 || (count < 0 && errno != EINTR)) {
            return false;
        }
        at += count > 0 ? count : 0;
        size -= count > 0 ? count : 0;
    }
    return true;
}

std::string withoutLinks(const std::string& path) {
    const std::unique_ptr<char, decltype(&std::free)> real(realpath(path.c_str(), nullptr),
                                                           &std::free);
    return real == nullptr ? path : std::string(real.get());
}

/// A new file in a folder. It has no name while it is written, so that a killed process leaves
/// nothing behind. It gets a name at once if the file system does not support that.
class NewFile {
  public:
    NewFile(std::string folder, bool isNamed) : m_folder(std::move(folder)), m_file(-1) {
        std::string name = nameFor("XXXXXX");
        m_file.reset(isNamed ? mkostemp(name.data(), O_CLOEXEC)
                             : open(m_folder.c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, 0600));
        if (isNamed && m_file.isOpen()) {
            m_name = name;
        }
    }
    ~NewFile() {
        if (!m_name.empty()) {
            unlink(m_name.c_str());
        }
    }
    NewFile(const NewFile&) = delete;
    NewFile& operator=(const NewFile&) = delete;

    bool write(const Contents& contents, mode_t mode) {
        return m_file.isOpen() &&
               transfer<const void>(::write, m_file, contents.start, contents.length) &&
               fchmod(m_file.number(), mode) == 0;
    }

    /// Replaces the target.
    bool replace(const std::string& target) {
        if (!giveName() || !m_file.close() || std::rename(m_name.c_str(), target.c_str()) != 0) {
            return false;
        }
        m_name.clear();
        return true;
    }

  private:
    /// Does not depend on the target's name, which can have the maximum length.
    std::string nameFor(const std::string& ending) const {
        return m_folder + "/.tintgate-jdf-" + ending;
    }

    bool giveName() {
        if (!m_name.empty()) {
            return true;
        }
        const std::string open = "/proc/self/fd/" + std::to_string(m_file.number());
        const std::string name = nameFor(std::to_string(getpid()));
        unlink(name.c_str()); // Left by a process killed between the next two steps.
        if (linkat(AT_FDCWD, open.c_str(), AT_FDCWD, name.c_str(), AT_SYMLINK_FOLLOW) != 0) {
            return false;
        }
        m_name = name;
        return true;
    }

    const std::string m_folder;
    Descriptor m_file;
    std::string m_name; ///< Empty if unnamed.
};

} // namespace

Contents readFile(const std::string& path, long smallest, long more) {
    // Non-blocking, so that a pipe in the file's place is refused at once.
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status = {};
    if (!file.isOpen() || fstat(file.number(), &status) != 0 || !S_ISREG(status.st_mode) ||
        status.st_size < smallest) {
        return {};
    }
    const long capacity = status.st_size + more;
    Contents contents;
    contents.block.reset(new (std::nothrow) char[static_cast<std::size_t>(capacity) + 2]);
    if (contents.block == nullptr) {
        return {};
    }
    contents.block[0] = '\0';
    contents.start = contents.block.get() + 1;
    contents.limit = contents.start + capacity;
    contents.length = status.st_size;
    if (!transfer<void>(::read, file, contents.start, contents.length)) {
        return {};
    }
    *contents.end() = '\0';
    return contents;
}

bool replaceFile(const std::string& path, const Contents& contents) {
    const std::string target = withoutLinks(path);
    const Descriptor old(open(target.c_str(), O_WRONLY | O_CLOEXEC));
    struct stat status = {};
    if (!old.isOpen() || fstat(old.number(), &status) != 0) {
        return false;
    }
    for (const bool isNamed : {false, true}) {
        NewFile file(target.substr(0, target.rfind('/') + 1) + ".", isNamed);
        if (file.write(contents, status.st_mode & 07777) && file.replace(target)) {
            return true;
        }
    }
    return false;
}

} // namespace jdf
