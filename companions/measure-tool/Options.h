// SPDX-License-Identifier: Apache-2.0
// The options of this run.
#pragma once

#include <string>

namespace measuretool {

/// The relevant options; others are ignored. Paths are bytes.
struct Options {
    std::string definition; ///< -patch: the definition of the patches.
    std::string output;     ///< -o: path of the measurement.
    std::string title;      ///< -patchname: the strip's name for people; may be empty.
    std::string instrument; ///< -i: the instrument's name; may be empty.
};

/// Reads an options file. Throws Failure (BadOptions) if it can't be read, if its lines are not
/// pairs, if -m is not "measure", or if a path is missing.
Options readOptions(const std::string& path);

} // namespace measuretool
