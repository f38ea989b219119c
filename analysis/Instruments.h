// SPDX-License-Identifier: Apache-2.0
// Display names of measuring instruments.
#pragma once

#include <string>

namespace analysis {

/// "Instrument N", or what the names file has for N.
///
/// The names file is "instruments.txt" beside the installed presets, found from the place of the
/// library itself; TINTGATE_INSTRUMENTS names another one. Lines of "N = name" in UTF-8; blank
/// lines and lines that begin with # are passed over, and so is whatever has another form.
std::string instrumentName(unsigned int id);

/// Display name for the DEVICE line of the definition file at `path` (bytes as the file system has
/// them). Gives 0 or a code of docs/exit-codes.csv, `name` untouched: the file's own, 23 without
/// such a line, 28 where its value is no instrument number.
int instrumentOfDefinition(const std::string& path, std::string& name);

} // namespace analysis
