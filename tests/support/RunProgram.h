// SPDX-License-Identifier: Apache-2.0
// Runs a real program as a separate process.
#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace support {

/// A user without special permissions.
inline constexpr unsigned ordinaryUser = 65534;

struct RunOptions {
    /// Changes to this process's environment; an empty optional removes the variable.
    std::map<std::string, std::optional<std::string>> environment;
    std::string folder;     ///< Working folder; if empty, this process's own.
    std::string outputPath; ///< If set, standard output goes here, not to Outcome::output.
    unsigned user = 0;      ///< Root first becomes this user; others stay unchanged.
    std::chrono::milliseconds limit{60'000}; ///< Then kills the program and its children.
};

struct Outcome {
    int exitCode = -1; ///< -1 if a signal ended the program.
    int signal = 0;
    bool timedOut = false;
    std::string output; ///< Standard output.
    std::string error;  ///< Standard error.
};

/// Runs command[0], which is searched on PATH if it has no slash, and waits for its end. The exit
/// code is 127 if it can't be started. Standard input is empty.
Outcome run(const std::vector<std::string>& command, const RunOptions& options = {});

/// Whether a child ends in time. The caller must still wait for it.
bool awaitEnd(pid_t process, std::chrono::milliseconds limit);

/// Changes root's process to this user permanently. Does nothing for anybody but root. False on
/// failure.
bool becomeUser(unsigned user);

/// Gives a file or folder to a user. Does nothing for anybody but root.
void giveTo(unsigned user, const std::string& path);

} // namespace support
