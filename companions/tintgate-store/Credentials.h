// SPDX-License-Identifier: Apache-2.0
// Names and passwords of users, in the bytes in which a login brings them: one for each character.
#pragma once

#include <string>

namespace admin {

/// The name's bytes. Throws Failure (BadInput) for a name that no login could bring: empty, of more
/// than 127 characters, with control characters or any above U+00FF.
std::string userName(const std::string& typed);

/// The same for a user that is to be made. Also refuses a name with a ":", with which nobody could
/// log in: of each of a job's arguments only what follows the last ":" counts.
std::string newUserName(const std::string& typed);

/// Throws Failure (BadInput) if a name, a password or an address has a ":"; `what` names it.
void refuseColon(const std::string& text, const std::string& what);

/// The password's bytes: the first line of a file ("-" is standard input), or with an empty path
/// what is typed on the terminal, twice and without echo, or the first line of standard input where
/// there is no terminal. Throws Failure for what newUserName refuses too, and where the two differ.
std::string askPassword(const std::string& path, const std::string& user);

} // namespace admin
