// SPDX-License-Identifier: Apache-2.0
// Starts the program that makes labels.
#pragma once

#include <string>
#include <string_view>

#include "companions/viewer/LabelSettings.h"

namespace viewer {

/// What the program reads: the bytes that the page was made of. The files can't be passed instead:
/// the next run may have replaced them by the time the program reads them.
struct LabelInput {
    std::string_view result;
    std::string_view meta;
};

/// Starts the program in its own session, because the next job ends a running viewer. Does not wait
/// for it. For the page NAME.html it makes NAME.label.pdf (or .svg, .png) and NAME.pdf; its
/// messages go to NAME.label.log. Returns false, with the reason in `problem`, if it can't be
/// started.
bool startLabelProgram(const LabelSettings& settings, const std::string& page,
                       const LabelInput& input, std::string& problem);

} // namespace viewer
