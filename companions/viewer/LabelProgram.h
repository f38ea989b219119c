// SPDX-License-Identifier: Apache-2.0
// The program that makes labels, started and left alone.
#pragma once

#include <string>
#include <string_view>

#include "companions/viewer/LabelSettings.h"

namespace viewer {

/// What the program reads: the bytes that the page was made of. The files themselves may be those
/// of the next run by the time that it reads them.
struct LabelInput {
    std::string_view result;
    std::string_view meta;
};

/// Starts the program in a session of its own, since the next job ends a running viewer, and does
/// not wait for it. For the page NAME.html it makes NAME.label.pdf (or .svg, .png) and NAME.pdf;
/// its messages go to NAME.label.log. False with the reason in `problem` if it can't be started.
bool startLabelProgram(const LabelSettings& settings, const std::string& page,
                       const LabelInput& input, std::string& problem);

} // namespace viewer
