// SPDX-License-Identifier: Apache-2.0
#include "colour/ColourFile.h"

#include <cerrno>
#include <cstring>
#include <new>
#include <stdexcept>
#include <string_view>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include "colour/Cxf.h"
#include "colour/TextEncoding.h"

namespace colour {

namespace {

/// Limit for pipes and devices, which don't report their size.
constexpr std::size_t maxStreamBytes = std::size_t{512} << 20;

/// Maximum silence of a pipe.
constexpr int patience = 30'000; // ms

/// Maximum time without a writer of a pipe. A writer started together with the reader needs a
/// moment.
constexpr int patienceForWriter = 2'000; // ms

/// Enough to decide whether to read the rest.
constexpr std::size_t headBytes = std::size_t{64} << 10;

class Descriptor {
  public:
    explicit Descriptor(int number) : m_number(number) {}
    ~Descriptor() {
        if (m_number >= 0) {
            close(m_number);
        }
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    int number() const { return m_number; }

  private:
    int m_number;
};

/// What to read from, and how long to wait for it.
struct Source {
    int descriptor;
    bool isStream;
    bool awaitsWriter; ///< Nobody is known to have the pipe open for writing yet.
};

/// Reads once, with a limited wait for data. Returns the bytes read, 0 at the end, -1 on failure.
ssize_t readSome(Source& source, char* target, std::size_t room) {
    while (true) {
        bool silent = false;
        if (source.isStream) {
            pollfd wait{source.descriptor, POLLIN, 0};
            const int ready = poll(&wait, 1, source.awaitsWriter ? patienceForWriter : patience);
            if (ready < 0 && errno == EINTR) {
                continue;
            }
            silent = ready == 0;
            if (ready < 0 || (silent && !source.awaitsWriter)) {
                return -1;
            }
        }
        const ssize_t count = read(source.descriptor, target, room);
        if (silent && count == 0) {
            return -1; // poll does not report a pipe without a writer, but read finds its end
        }
        source.awaitsWriter = false;
        if (count >= 0 || (errno != EINTR && errno != EAGAIN)) {
            return count;
        }
    }
}

using WorthReading = bool (*)(std::string_view head);

bool anything(std::string_view) {
    return true;
}

/// Text without NULs or a profile: anything else need not be read to its end.
bool textOrProfile(std::string_view head) {
    return looksLikeProfile(head) || isUtf16(head) ||
           std::memchr(head.data(), 0, head.size()) == nullptr;
}

/// NotRecognised if the first bytes show that the rest is not worth reading.
Failure readBytes(const std::string& path, std::size_t limit, WorthReading worthReading,
                  std::string& bytes) {
    if (path.find('\0') != std::string::npos) {
        return Failure::Missing;
    }
    // Without O_NONBLOCK, opening a pipe would wait for its other end.
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (file.number() < 0) {
        const bool missing = errno == ENOENT || errno == ENOTDIR || errno == ENAMETOOLONG;
        return missing ? Failure::Missing : Failure::Unreadable;
    }
    struct stat status {};
    if (fstat(file.number(), &status) != 0 || S_ISDIR(status.st_mode)) {
        return Failure::Unreadable;
    }
    const bool isStream = !S_ISREG(status.st_mode);
    Source source{file.number(), isStream, S_ISFIFO(status.st_mode)};
    if (isStream) {
        limit = std::min(limit, maxStreamBytes);
    } else if (static_cast<unsigned long long>(status.st_size) > limit) {
        return Failure::TooLarge;
    }

    std::string contents;
    std::size_t used = 0;
    bool isHeadSeen = false;
    contents.resize(headBytes);
    while (true) {
        const ssize_t count = readSome(source, contents.data() + used, contents.size() - used);
        if (count < 0) {
            return Failure::Unreadable;
        }
        used += static_cast<std::size_t>(count);
        if (used > limit) {
            return Failure::TooLarge;
        }
        if (!isHeadSeen && (count == 0 || used == contents.size())) {
            isHeadSeen = true;
            if (!worthReading({contents.data(), used})) {
                return Failure::NotRecognised;
            }
        }
        if (count == 0) {
            break;
        }
        if (used == contents.size()) {
            // One byte more than the file's size, so that its end is found without growing again.
            const auto stated =
                isStream ? std::size_t{0} : static_cast<std::size_t>(status.st_size);
            contents.resize(stated >= used ? stated + 1 : 2 * used);
        }
    }
    contents.resize(used);
    bytes = std::move(contents);
    return Failure::None;
}

} // namespace

Failure readWholeFile(const std::string& path, std::size_t limit, std::string& bytes) {
    try {
        return readBytes(path, limit, anything, bytes);
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

bool isEmptyOrCgats(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode) || status.st_size == 0) {
        return true;
    }
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    std::string head(headBytes, '\0');
    Source source{file.number(), false, false};
    const ssize_t count = file.number() < 0 ? -1 : readSome(source, head.data(), head.size());
    return count >= 0 && looksLikeCgats({head.data(), static_cast<std::size_t>(count)});
}

Failure loadProfile(const std::string& path, Profile& profile) {
    try {
        std::string bytes;
        if (const Failure failure = readBytes(path, maxCgatsBytes, looksLikeProfile, bytes);
            failure != Failure::None) {
            return failure;
        }
        return profile.open(bytes);
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

Failure readColourFile(std::string_view bytes, const CgatsWants& wants, ColourFile& file) {
    try {
        ColourFile loaded;
        const Failure failure = looksLikeProfile(bytes) ? loaded.profile.emplace().open(bytes)
                                : looksLikeCxf(bytes)
                                    ? readCxf(bytes, wants, loaded.set.emplace())
                                    : readCgats(bytes, wants, loaded.set.emplace());
        if (failure == Failure::None) {
            file = std::move(loaded);
        }
        return failure;
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

Failure loadColourFile(const std::string& path, const CgatsWants& wants, ColourFile& file) {
    try {
        std::string bytes;
        const Failure failure = readBytes(path, maxCgatsBytes, textOrProfile, bytes);
        return failure == Failure::None ? readColourFile(bytes, wants, file) : failure;
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

} // namespace colour
