// SPDX-License-Identifier: Apache-2.0
// Old folders of jobs, removed.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace report {

enum class Fate {
    Removed, ///< Or, of a dry run, would be.
    Recent,  ///< Something in it has changed lately.
    InUse,   ///< By a process that lives.
    NotOurs, ///< Of another user, or another file system is mounted in it.
    Failed,  ///< Could not be looked at, or not removed to its end.
};

struct JobFolder {
    std::string name;         ///< "JobID_7"
    std::uint64_t files = 0;  ///< Links and others, too, but no folders.
    std::uint64_t bytes = 0;  ///< That it takes on the disk.
    std::int64_t changed = 0; ///< When anything in it changed last, in seconds since 1970.
    Fate fate = Fate::Recent;
    std::string reason; ///< In words, where it is not plain.
};

/// Removes the folders JobID_N in the tool's working folder in which nothing has changed for so
/// many seconds, neither contents nor names nor permissions. Gives all such folders, by name.
///
/// A folder stays while a process works in it, has a file of it open or mapped, has its path among
/// its arguments, or is the tool with that job's number among them. Of other users' processes only
/// the arguments can be seen, but by root. A folder is first given another name, all processes are
/// looked at once more, and only then its contents go; a run that begins meanwhile gets the folder
/// back, or makes its own. Links are removed, never followed. What a call that was cut off has left
/// under the other name goes by the same rules.
///
/// A dry run changes nothing. No working folder is no folders. Throws Failure (NotTidied) where the
/// working folder is a link, can't be read, or belongs to another user.
std::vector<JobFolder> tidy(const std::string& workingFolder, std::int64_t seconds, bool dryRun);

/// What became of the folders, in lines for a person; those that are recent are only counted.
std::string tidiedText(const std::vector<JobFolder>& folders, bool dryRun);

} // namespace report
