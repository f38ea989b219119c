// SPDX-License-Identifier: Apache-2.0
// Display names of measuring instruments.
#pragma once

#include <string>

namespace analysis {

/// "Instrument N", or the name of N in the names file.
///
/// The names file is "instruments.txt" next to the installed presets, found relative to the
/// library, or the file that TINTGATE_INSTRUMENTS names. It has lines of "N = name" in UTF-8. Blank
/// lines, lines that begin with # and all other lines are ignored.
std::string instrumentName(unsigned int id);

/// Same for a program other than the library, with its folder of installed presets.
std::string instrumentName(unsigned int id, const std::string& presets);

/// Display name for the DEVICE line of the definition file at `path` (bytes of the file system).
/// Returns 0, or a code of docs/exit-codes.csv with `name` unchanged: the code of the file's
/// failure, 23 if there is no such line, 28 if its value is not an instrument number.
int instrumentOfDefinition(const std::string& path, std::string& name);

} // namespace analysis
