// SPDX-License-Identifier: Apache-2.0
// The command line.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "companions/tintgate-check/Aim.h"
#include "companions/tintgate-check/Labels.h"

namespace check {

struct Options {
    std::vector<std::string> measurements;
    AimWanted aim;
    std::string conditionsFile;
    bool page = false;
    bool result = false;
    std::string out;
    bool json = false;
    bool quiet = false;
    bool list = false;
    std::string language; ///< As named; empty for the user's.
    unsigned threads = 1;
    std::string watch; ///< The folder; empty if nothing is watched.
    bool poll = false;
    double interval = 2; ///< Seconds between two rounds.
    LabelWanted labels;
};

/// Reads the command line. Gives the exit status if the program ends here, after help was printed
/// or a fault was reported.
std::optional<int> readOptions(int argumentCount, char** arguments, Options& options);

} // namespace check
