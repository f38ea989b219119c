// SPDX-License-Identifier: Apache-2.0
// Writes a file such that only complete contents replace the previous ones.
#pragma once

#include <initializer_list>

#include <string>
#include <string_view>

namespace analysis {

/// Makes `bytes` the contents of the file at `path` (bytes of the file system).
///
/// A file is written under another name in the same folder and renamed, keeping the old one's mode.
/// A link, device or pipe, or a file in a folder that takes no other name, is written in place; if
/// that fails, a regular file gets its old contents back. Gives 0, 50 (can't be created or written
/// to) or 51 (could not be written to its end).
int writeOutputFile(const std::string& path, std::string_view bytes);

/// Whether a CGATS text may be written to `path`: 0, 52 (a regular file that is one of `inputs`,
/// under any name) or 53 (a regular file that is neither empty nor CGATS text).
int checkOutput(const std::string& path, std::initializer_list<std::string> inputs);

} // namespace analysis
