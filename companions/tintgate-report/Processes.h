// SPDX-License-Identifier: Apache-2.0
// Who uses the folders of jobs right now.
#pragma once

#include <map>
#include <string>

namespace report {

/// For each job's folder that a living process uses, by its name below `folder` such as "JobID_7":
/// which process, in words. `folder` has no links in it.
///
/// A folder renamed to ".tidy-JobID_7" counts as JobID_7, since processes see it under its new
/// name.
std::map<std::string, std::string> usedFolders(const std::string& folder);

} // namespace report
