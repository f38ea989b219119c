// SPDX-License-Identifier: Apache-2.0
// The marks of our own files: only these are ever replaced by a later one.
#pragma once

#include <string>
#include <string_view>

namespace report {

enum class OwnKind {
    Page,   ///< A page of a result, with its summary.
    Result, ///< The JSON of a comparison.
    Broken, ///< JSON that describes an unusable measurement.
};

/// Whether the start of a file contains the mark. All marks are in the first summaryWithin bytes.
bool carriesMark(OwnKind kind, std::string_view start);

/// Whether the regular file at `path` has the mark. False for all other kinds of files and for
/// unreadable ones.
bool isOwnFile(OwnKind kind, const std::string& path);

} // namespace report
