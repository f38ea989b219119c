// SPDX-License-Identifier: Apache-2.0
// Finds the processes that use folders of jobs.
#pragma once

#include <map>
#include <string>

namespace report {

/// For each job's folder in use by a live process, a description of the process. The key is the
/// folder's name below `folder`, such as "JobID_7". `folder` must not contain links.
///
/// A folder renamed to ".tidy-JobID_7" counts as JobID_7, because processes see its new name.
std::map<std::string, std::string> usedFolders(const std::string& folder);

} // namespace report
