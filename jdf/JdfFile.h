// SPDX-License-Identifier: Apache-2.0
// A JDF file in memory, with room to grow.
#pragma once

#include <memory>
#include <string>

namespace jdf {

/// Contents in a buffer of fixed capacity. A byte that precedes the buffer stops every walk back
/// over blanks.
struct Contents {
    std::unique_ptr<char[]> block;
    char* start = nullptr;
    char* limit = nullptr; ///< Start plus capacity.
    long length = 0;

    char* end() const { return start + length; }
};

/// Reads a regular file of at least `smallest` bytes, with room for `more` additional bytes. On
/// failure, `block` is null.
Contents readFile(const std::string& path, long smallest, long more);

/// Replaces a whole file by the contents, through a new file in its folder. Permissions and
/// symbolic links are kept. If the process is killed meanwhile, the old file is unchanged, and
/// nothing is left over on file systems with unnamed files (ext4, XFS, Btrfs, tmpfs). Returns false
/// and leaves the file unchanged if it can't be opened for writing or if the contents can't be
/// written completely.
bool replaceFile(const std::string& path, const Contents& contents);

} // namespace jdf
