// SPDX-License-Identifier: Apache-2.0
// Files that are read or written whole.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace base {

enum class Reading {
    Done,
    Missing,
    Unreadable, ///< A folder, no permission, or a pipe that stays silent.
    TooLarge,
    NotWanted,
};

/// Shown the first 64 KiB of a file, or all of a shorter one. False if the rest is not wanted.
using WantsRest = std::function<bool(std::string_view head)>;

/// Reads the file at `path` (bytes as the file system has them), which may be a pipe or a device: a
/// pipe that nobody opens for writing counts as unreadable after 2 s, a silent one after 30 s, and
/// neither gives more than 512 MiB. The limit is in bytes. `bytes` is untouched unless all was
/// read. Running out of memory is an exception.
Reading readWholeFile(const std::string& path, std::size_t limit, std::string& bytes,
                      const WantsRest& wantsRest = {});

/// Where the file at `path` really is; the path itself if there is no file.
std::string withoutLinks(const std::string& path);

/// Writes a file whole: a regular file or a missing one through a draft, keeping the access of the
/// one that was there. Symbolic links are followed and remain links. False with errno set; then the
/// old file is unchanged.
bool writeWholeFile(const std::string& path, std::string_view bytes);

/// Same, but a link is replaced and not followed, and so are the permissions: for folders in which
/// others can put files.
bool replaceWholeFile(const std::string& path, std::string_view bytes);

} // namespace base
