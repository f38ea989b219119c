// SPDX-License-Identifier: Apache-2.0
// The folder that stands in for "/" where the suite's fixed paths are concerned.
#pragma once

#include <string>

namespace platform {

/// The system root as bytes, without a slash at its end; empty when the paths are the machine's
/// own. Asked afresh at every call.
///
/// The environment variable TINTGATE_ROOT, else the one given at build time (the CMake variable of
/// the same name), else that of the installation to which the program belongs: an installed suite
/// works wherever its prefix is. A program in a build tree belongs to none. A root with a quote, a
/// dollar sign, a backtick or a backslash counts as none: it could not stand in a shell command.
std::string systemRoot();

/// A literal path of the suite, below the system root. For literals alone: values that were read
/// from property lists are paths of their own, and a path that has its root gets no second one.
std::string underRoot(const char* literal);

} // namespace platform
