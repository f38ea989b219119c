// SPDX-License-Identifier: Apache-2.0
// Results in files with their meta files, and the output.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "report/Meta.h"
#include "report/Result.h"
#include "report/languages/Language.h"

namespace report {

struct LoadedResult {
    std::string path;
    Result result;
    std::optional<Meta> meta;
    std::string hash; ///< SHA-256 of the result's bytes, if it is wanted.

    const Meta* metaOrNull() const { return meta ? &*meta : nullptr; }
    std::string folder() const; ///< "." if the path has none.
    std::string stem() const;   ///< Name without folder and ".json".
};

enum class Hash { Unwanted, Wanted };

/// Reads a result; "-" is standard input. If metaPath is empty, "meta.json" next to a result named
/// "output.json" is used, as written by a job's run. If it can't be used, `note` says so and there
/// is no meta data. Throws Failure (Unreadable, Broken); for a meta file only if it is named.
LoadedResult loadResult(const std::string& path, const std::string& metaPath, std::string& note,
                        Hash hash = Hash::Unwanted);

/// When a result was made, in seconds since 1970 on the room's own clock: by its job, else as its
/// measurement states it, else as its file does; `byFile` is true then.
std::int64_t timeOfResult(const LoadedResult& loaded, bool& byFile);

/// Throws Failure (Unreadable).
std::string standardInput(std::size_t mostBytes);

/// The page in the given language; without one, in that of the job or of the user.
std::string pageOf(const LoadedResult& loaded, std::optional<languages::Language> language);

/// The files that the arguments mean, in their order: of a folder all results (named "*.json", with
/// the format's name in their beginning) in it and in the folders below, by name. Links to folders
/// are not followed. Throws Failure (Unreadable) for a folder that can't be read.
std::vector<std::string> filesOf(const std::vector<std::string>& arguments);

/// The path relative to a folder.
std::string relativeTo(const std::string& folder, const std::string& path);

/// Writes to a file, completely or not at all, or to standard output for "-". Devices and pipes are
/// written in place. Throws Failure (NotWritten).
void writeOutput(const std::string& path, std::string_view text);

} // namespace report
