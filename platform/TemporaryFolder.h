// SPDX-License-Identifier: Apache-2.0
// The place for logs and working files.
#pragma once

#include <string>

namespace platform {

/// The folder for temporary files, as bytes, or empty if none may be used.
///
/// It is the first of TMPDIR, TMP and TEMP that names a folder. A relative path is made absolute,
/// and so is the variable, because the viewer and other children run in other folders. If none
/// does, it is /tmp/tintgate-UID, created with mode 0700, used only if it is a folder of this user,
/// and exported as TMPDIR, so that wxFileName::GetTempDir and every child process find the same
/// folder.
///
/// The viewer's unquoted command line requires a path without quotes, backslashes, double blanks.
std::string temporaryFolder();

/// Creates a missing folder; the umask applies. True if the path is then a folder of this user, and
/// not a symbolic link: anybody can create names in a shared folder such as /tmp.
bool haveOwnFolder(const std::string& path, unsigned mode);

} // namespace platform
