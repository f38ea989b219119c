// SPDX-License-Identifier: Apache-2.0
#include "base/WholeFile.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <utility>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "base/FileDraft.h"
#include "base/Malloc.h"

namespace base {
namespace {

/// Of a pipe or device, which don't say how long they are.
constexpr std::size_t maxStreamBytes = std::size_t{512} << 20;

constexpr std::size_t headBytes = std::size_t{64} << 10;

/// How long a pipe may stay silent.
constexpr int patience = 30'000; // ms

/// How long nobody may have a pipe open to write. A writer that starts together with the reader
/// takes a moment.
constexpr int patienceForWriter = 2'000; // ms

/// What is read from, and how long to wait for it.
struct Source {
    int descriptor;
    bool isStream;
    bool awaitsWriter; ///< Nothing has shown yet that anybody has the pipe open to write.
};

/// One read that waits for data but not for ever. Bytes read, 0 at the end, -1 for a failure.
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

} // namespace

Reading readWholeFile(const std::string& path, std::size_t limit, std::string& bytes,
                      const WantsRest& wantsRest) {
    if (path.find('\0') != std::string::npos) {
        return Reading::Missing;
    }
    // Without O_NONBLOCK the opening of a pipe waits for its other end.
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (!file.isOpen()) {
        const bool missing = errno == ENOENT || errno == ENOTDIR || errno == ENAMETOOLONG;
        return missing ? Reading::Missing : Reading::Unreadable;
    }
    struct stat status {};
    if (fstat(file.get(), &status) != 0 || S_ISDIR(status.st_mode)) {
        return Reading::Unreadable;
    }
    const bool isStream = !S_ISREG(status.st_mode);
    Source source{file.get(), isStream, S_ISFIFO(status.st_mode)};
    if (isStream) {
        limit = std::min(limit, maxStreamBytes);
    } else if (static_cast<unsigned long long>(status.st_size) > limit) {
        return Reading::TooLarge;
    }

    std::string contents;
    std::size_t used = 0;
    bool isHeadSeen = wantsRest == nullptr;
    contents.resize(headBytes);
    while (true) {
        const ssize_t count = readSome(source, contents.data() + used, contents.size() - used);
        if (count < 0) {
            return Reading::Unreadable;
        }
        used += static_cast<std::size_t>(count);
        if (used > limit) {
            return Reading::TooLarge;
        }
        if (!isHeadSeen && (count == 0 || used == contents.size())) {
            isHeadSeen = true;
            if (!wantsRest({contents.data(), used})) {
                return Reading::NotWanted;
            }
        }
        if (count == 0) {
            break;
        }
        if (used == contents.size()) {
            // One byte more than a file says, so that its end is seen without another growth.
            const auto stated =
                isStream ? std::size_t{0} : static_cast<std::size_t>(status.st_size);
            contents.resize(stated >= used ? stated + 1 : 2 * used);
        }
    }
    contents.resize(used);
    bytes = std::move(contents);
    return Reading::Done;
}

std::string withoutLinks(const std::string& path) {
    const Malloced<char> real(realpath(path.c_str(), nullptr));
    return real == nullptr ? path : std::string(real.get());
}

bool writeWholeFile(const std::string& path, std::string_view bytes) {
    const std::string target = withoutLinks(path);
    FileDraft draft(target);
    return draft.isOpen() && draft.write(bytes) && draft.keepAccessOf(target) &&
           draft.replace(target);
}

bool replaceWholeFile(const std::string& path, std::string_view bytes) {
    FileDraft draft(path);
    return draft.isOpen() && draft.write(bytes) && draft.replace(path);
}

} // namespace base
