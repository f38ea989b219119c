// SPDX-License-Identifier: Apache-2.0
#include "colour/ColourFile.h"

#include <cstring>
#include <limits>
#include <new>
#include <stdexcept>
#include <string_view>

#include <sys/stat.h>

#include "base/WholeFile.h"
#include "colour/Cxf.h"
#include "colour/TextEncoding.h"

namespace colour {

namespace {

/// Text without NULs or a profile: anything else need not be read to its end.
bool textOrProfile(std::string_view head) {
    return looksLikeProfile(head) || isUtf16(head) ||
           std::memchr(head.data(), 0, head.size()) == nullptr;
}

/// NotRecognised if the first bytes show that the rest is not worth reading.
Failure readBytes(const std::string& path, std::size_t limit, const base::WantsRest& worthReading,
                  std::string& bytes) {
    switch (base::readWholeFile(path, limit, bytes, worthReading)) {
    case base::Reading::Done:
        return Failure::None;
    case base::Reading::Missing:
        return Failure::Missing;
    case base::Reading::TooLarge:
        return Failure::TooLarge;
    case base::Reading::NotWanted:
        return Failure::NotRecognised;
    default:
        return Failure::Unreadable;
    }
}

template<class Body>
Failure guarded(Body body) {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

} // namespace

Failure readWholeFile(const std::string& path, std::size_t limit, std::string& bytes) {
    return guarded([&] { return readBytes(path, limit, {}, bytes); });
}

bool isEmptyOrCgats(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode) || status.st_size == 0) {
        return true;
    }
    bool isCgats = false;
    std::string bytes;
    base::readWholeFile(path, std::numeric_limits<std::size_t>::max(), bytes,
                        [&](std::string_view head) {
                            isCgats = looksLikeCgats(head);
                            return false;
                        });
    return isCgats;
}

Failure loadProfile(const std::string& path, Profile& profile) {
    return guarded([&] {
        std::string bytes;
        const Failure failure = readBytes(path, maxCgatsBytes, looksLikeProfile, bytes);
        return failure == Failure::None ? profile.open(bytes) : failure;
    });
}

Failure readColourFile(std::string_view bytes, const CgatsWants& wants, ColourFile& file) {
    return guarded([&] {
        ColourFile loaded;
        const Failure failure = looksLikeProfile(bytes) ? loaded.profile.emplace().open(bytes)
                                : looksLikeCxf(bytes)
                                    ? readCxf(bytes, wants, loaded.set.emplace())
                                    : readCgats(bytes, wants, loaded.set.emplace());
        if (failure == Failure::None) {
            file = std::move(loaded);
        }
        return failure;
    });
}

Failure loadColourFile(const std::string& path, const CgatsWants& wants, ColourFile& file) {
    return guarded([&] {
        std::string bytes;
        const Failure failure = readBytes(path, maxCgatsBytes, textOrProfile, bytes);
        return failure == Failure::None ? readColourFile(bytes, wants, file) : failure;
    });
}

} // namespace colour
