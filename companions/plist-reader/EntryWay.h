// SPDX-License-Identifier: Apache-2.0
// The command of the property-list reader: "Print" and the way to an entry.
//
//   Print :installed_path
//   Print :'Nerova Hue Workbench':library_path
//   Print :Folders:0
#pragma once

#include <optional>
#include <string>
#include <vector>

/// The names on the way to the entry that a command asks for, from the outside in; nothing if the
/// command is not of this form.
///
/// A colon stands in front of each name; the first may be left out. A name that stands in single or
/// double quotes as a whole may hold colons; a backslash takes the character behind it as it is.
std::optional<std::vector<std::string>> parsePrintCommand(const std::string& command);
