// Results in files, with the meta file that belongs to each, and where the output goes.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "companions/report/Meta.h"
#include "companions/report/Result.h"

namespace reporting {

struct LoadedResult {
    std::string path;
    report::Result result;
    std::optional<report::Meta> meta;

    const report::Meta* metaOrNull() const { return meta ? &*meta : nullptr; }
    std::string folder() const; ///< "." where the path has none.
    std::string stem() const;   ///< Name without folder and ".json".
};

/// Reads a result; "-" is standard input. An empty metaPath means "meta.json" beside a result named
/// "output.json", as a job's run leaves them; where that one can't be used, `note` says so and the
/// result goes without. Throws Failure (Unreadable, Broken), for a meta file only if it is named.
LoadedResult loadResult(const std::string& path, const std::string& metaPath, std::string& note);

/// The files that the arguments mean, in their order: of a folder all "*.json" in it and in the
/// folders below, by name, but no "meta.json". Links to folders are not followed. Throws Failure
/// (Unreadable) for an argument that is not there.
struct FoundFile {
    std::string path;
    bool named = false; ///< By an argument, not met in a folder.
};
std::vector<FoundFile> filesOf(const std::vector<std::string>& arguments);

/// Writes to a file whole or not at all, or to standard output for "-". Devices and pipes are
/// written in place. Throws Failure (NotWritten).
void writeOutput(const std::string& path, std::string_view text);

} // namespace reporting
