// SPDX-License-Identifier: Apache-2.0
// Names and passwords of users as the bytes of a login: one byte per character.
#pragma once

#include <string>

namespace admin {

/// The name's bytes. Throws Failure (BadInput) for a name that a login can't contain: empty, more
/// than 127 characters, control characters, or characters above U+00FF.
std::string userName(const std::string& typed);

/// Same for a new user. Also rejects a name with a ":", which could not log in: of each job
/// argument, only the text after the last ":" counts.
std::string newUserName(const std::string& typed);

/// Throws Failure (BadInput) if a name, a password or an address contains a ":"; `what` names it.
void refuseColon(const std::string& text, const std::string& what);

/// The password's bytes: the first line of a file ("-" is standard input), or with an empty path
/// what is typed on the terminal, twice and without echo, or the first line of standard input where
/// there is no terminal. Throws Failure for what newUserName refuses too, and where the two differ.
std::string askPassword(const std::string& path, const std::string& user);

} // namespace admin
