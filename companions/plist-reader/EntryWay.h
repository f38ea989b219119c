// SPDX-License-Identifier: Apache-2.0
// The command of the property-list reader: "Print" and the path of an entry.
//
//   Print :installed_path
//   Print :'Nerova Hue Workbench':library_path
//   Print :Folders:0
#pragma once

#include <optional>
#include <string>
#include <vector>

/// The names on the path to the requested entry, from the outside in. Nothing if the command does
/// not have this form.
///
/// A colon precedes each name; the first may be omitted. A name completely in single or double
/// quotes may contain colons. A backslash makes the next character literal.
std::optional<std::vector<std::string>> parsePrintCommand(const std::string& command);
