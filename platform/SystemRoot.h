// SPDX-License-Identifier: Apache-2.0
// The folder that replaces "/" in the suite's fixed paths.
#pragma once

#include <string>

namespace platform {

/// The system root as bytes, without a trailing slash; empty if the suite uses the machine's own
/// paths. Determined anew at every call.
///
/// It is the first of: the environment variable TINTGATE_ROOT; the CMake variable of that name; the
/// root of the installation that contains the program, so that an installed suite works under any
/// prefix. A program in a build tree has no installation. A root with a quote, dollar sign,
/// backtick or backslash counts as none, because it can't be used in a shell command.
std::string systemRoot();

/// A literal path of the suite, below the system root. Only for literals: paths from property lists
/// are complete already, and a path must not get a second root.
std::string underRoot(const char* literal);

} // namespace platform
