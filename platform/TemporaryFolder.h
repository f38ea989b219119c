// SPDX-License-Identifier: Apache-2.0
// Where logs and working files go.
#pragma once

#include <string>

namespace platform {

/// The folder for temporary files, as bytes, or empty if there is none that may be used.
///
/// The first of TMPDIR, TMP and TEMP that names a folder. A relative path is made absolute, in the
/// variable too: the viewer and other children run in folders of their own. Else /tmp/tintgate-UID,
/// made with mode 0700 where it is missing, used only if it is a folder of this user, and exported
/// as TMPDIR so that wxFileName::GetTempDir and every child process find the same one.
///
/// The path must hold no quotes, backslashes or double blanks for the viewer to be started from
/// it: its command line is not quoted.
std::string temporaryFolder();

/// Makes a folder where it is missing; the umask applies. True if it is a folder of this user then,
/// and no symbolic link: anybody may make names in a shared folder such as /tmp.
bool haveOwnFolder(const std::string& path, unsigned mode);

} // namespace platform
