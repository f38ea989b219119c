// SPDX-License-Identifier: Apache-2.0
// Pages as a browser shows them.
#pragma once

#include <string>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace support {

/// Opens a local page in headless Chromium. The document as its scripts leave it is in `output`,
/// what its console got in `error`. The profile is in the scratch folder.
Outcome browse(const ScratchFolder& scratch, const std::string& page);

/// Shows a page with a script at its end for a person's hand, which the page's policy has to let in
/// for once. The script notes what it sees: seen("name", "text") adds "[name: text]" to the page.
Outcome browseHandled(const ScratchFolder& scratch, const std::string& page,
                      const std::string& script);

} // namespace support
