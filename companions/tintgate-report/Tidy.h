// SPDX-License-Identifier: Apache-2.0
// Removes old folders of jobs.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace report {

enum class Fate {
    Removed, ///< In a dry run: would be removed.
    Recent,  ///< Something in it has changed recently.
    InUse,   ///< A live process uses it.
    NotOurs, ///< Belongs to another user, or contains a mount point.
    Failed,  ///< Could not be examined, or not removed completely.
};

struct JobFolder {
    std::string name;         ///< "JobID_7"
    std::uint64_t files = 0;  ///< Including links and others, but not folders.
    std::uint64_t bytes = 0;  ///< Disk space in use.
    std::int64_t changed = 0; ///< Time of the last change in it, in seconds since 1970.
    Fate fate = Fate::Recent;
    std::string reason; ///< Explanation, if needed.
};

/// Removes the folders JobID_N in the tool's working folder in which nothing has changed for
/// `seconds`: neither contents nor names nor permissions. Returns all job folders, by name.
///
/// A folder is kept while a process works in it, has a file of it open or mapped, has its path
/// among its arguments, or is the tool with that job's number among them. Unless the caller is
/// root, only the arguments of other users' processes are visible. A folder is first renamed, then
/// all processes are checked again, and only then its contents are removed. A run that starts
/// meanwhile gets the folder back or creates its own. Links are removed, never followed. Folders
/// left renamed by an interrupted call are handled by the same rules.
///
/// A dry run changes nothing. If there is no working folder, the result is empty. Throws Failure
/// (NotTidied) if the working folder is a link, can't be read, or belongs to another user.
std::vector<JobFolder> tidy(const std::string& workingFolder, std::int64_t seconds, bool dryRun);

/// The outcome as lines for a person. Recent folders are only counted.
std::string tidiedText(const std::vector<JobFolder>& folders, bool dryRun);

} // namespace report
