// SPDX-License-Identifier: Apache-2.0
// What this run is to do.
#pragma once

#include <string>

namespace measuretool {

/// The options that matter here; the others are read over. Paths are bytes.
struct Options {
    std::string definition; ///< -patch: the definition of the patches.
    std::string output;     ///< -o: where the measurement goes.
    std::string title;      ///< -patchname: what people call the strip; may be empty.
    std::string instrument; ///< -i: the instrument's name; may be empty.
};

/// Reads an options file. Throws Failure (BadOptions) where it can't be read, where its lines are
/// no pairs, or where -m is not "measure" or a path is missing.
Options readOptions(const std::string& path);

} // namespace measuretool
