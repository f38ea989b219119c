// SPDX-License-Identifier: Apache-2.0
// The mark by which files of ours are known: only these are ever replaced by a later one.
#pragma once

#include <string>
#include <string_view>

namespace report {

enum class OwnKind {
    Page,   ///< A page of a result, with its summary.
    Result, ///< The JSON of a comparison.
    Broken, ///< JSON that describes a measurement that could not be used.
};

/// Whether the beginning of a file carries the mark; all marks are within summaryWithin bytes.
bool carriesMark(OwnKind kind, std::string_view start);

/// Whether the regular file at `path` carries the mark. False for all other kinds of files and for
/// those that can't be read.
bool isOwnFile(OwnKind kind, const std::string& path);

} // namespace report
