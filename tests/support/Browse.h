// Pages as a browser shows them.
#pragma once

#include <string>
#include <vector>

#include "RunProgram.h"

namespace support {

/// Opens a local page in headless Chromium. The document as its scripts leave it is in `output`,
/// what its console got in `error`. The profile is kept in a folder of that name, made if missing.
/// Further options come in front of the page, such as "--window-size=390,844".
Outcome browse(const std::string& page, const std::string& profile,
               const std::vector<std::string>& options = {});

} // namespace support
