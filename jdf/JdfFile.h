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

/// Replaces a file by the contents, through a file of another name beside it; its permissions stay,
/// and a symbolic link goes on leading to it. False, with the file untouched, if it can't be opened
/// for writing or the contents can't be written to their end.
bool replaceFile(const std::string& path, const Contents& contents);

} // namespace jdf
