// SPDX-License-Identifier: Apache-2.0
// A JDF file in memory, with room to grow.
#pragma once

#include <memory>
#include <string>

namespace jdf {

/// Contents in a buffer of a fixed capacity. A byte in front of it ends every walk back over
/// blanks.
struct Contents {
    std::unique_ptr<char[]> block;
    char* start = nullptr;
    char* limit = nullptr; ///< The start plus the capacity.
    long length = 0;

    char* end() const { return start + length; }
};

/// Reads a regular file of at least `smallest` bytes, with room for `more` bytes behind it. No
/// block if that can't be done.
Contents readFile(const std::string& path, long smallest, long more);

/// Replaces a file by the contents, as a whole, through a new file in its folder. Its permissions
/// stay, and a symbolic link still leads to it. A process that is killed on the way leaves the file
/// as it was, and nothing beside it where the file system knows files without a name (ext4, XFS,
/// Btrfs and tmpfs do). False, with the file untouched, if it can't be opened for writing or the
/// contents can't be written to their end.
bool replaceFile(const std::string& path, const Contents& contents);

} // namespace jdf
