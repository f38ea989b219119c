// Runs a real program as a process of its own.
#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace support {

struct RunOptions {
    /// Changes to this process's environment; an empty optional takes the variable out.
    std::map<std::string, std::optional<std::string>> environment;
    std::string folder;        ///< Working folder; empty: this process's own.
    std::string outputPath;    ///< Standard output goes there instead of into Outcome::output.
    bool ordinaryUser = false; ///< Without the rights of root; see dropToOrdinaryUser.
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

/// For root, makes this process one of the user "nobody", whom permissions bind; there is no way
/// back. For anybody else does nothing. False if that fails.
bool dropToOrdinaryUser();

/// Gives a file or folder to the user that dropToOrdinaryUser makes. For anybody but root does
/// nothing.
void giveToOrdinaryUser(const std::string& path);

} // namespace support
