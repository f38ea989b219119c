// SPDX-License-Identifier: Apache-2.0
// The options file of the measuring tool.
#pragma once

#include <string>

#include "measure/NerovaMeasureParams.h"

namespace measure {

/// The file's text as bytes: each given option and its unchanged value on separate lines. A value
/// with a line break breaks the format; a path that is not valid UTF-8 does not.
std::string optionsText(const NerovaMeasureParams& params);

} // namespace measure
