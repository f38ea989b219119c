// SPDX-License-Identifier: Apache-2.0
// Runs a real program as a process of its own.
#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace support {

/// A user whom permissions bind.
inline constexpr unsigned ordinaryUser = 65534;

struct RunOptions {
    /// Changes to this process's environment; an empty optional takes the variable out.
    std::map<std::string, std::optional<std::string>> environment;
    std::string folder;     ///< Working folder; empty: this process's own.
    std::string outputPath; ///< Standard output goes there instead of into Outcome::output.
    unsigned user = 0;      ///< Root becomes this user first; anybody else stays who he is.
    std::chrono::milliseconds limit{60'000}; ///< Then the program and its children are killed.
};

struct Outcome {
    int exitCode = -1; ///< -1 where a signal ended the program.
    int signal = 0;
    bool timedOut = false;
    std::string output; ///< What came on standard output.
    std::string error;  ///< What came on standard error.
};

/// Runs command[0], which is looked for on PATH where it has no slash, and waits for its end. Exit
/// code 127 where it can't be started. Standard input is empty.
Outcome run(const std::vector<std::string>& command, const RunOptions& options = {});

/// Whether a child ends in time. It stays one that is to be waited for.
bool awaitEnd(pid_t process, std::chrono::milliseconds limit);

/// Makes root's process one of this user; there is no way back. For anybody but root does nothing.
/// False if that fails.
bool becomeUser(unsigned user);

/// Gives a file or folder to a user. For anybody but root does nothing.
void giveTo(unsigned user, const std::string& path);

} // namespace support
