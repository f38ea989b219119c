// SPDX-License-Identifier: Apache-2.0
// Shows pages in a browser.
#pragma once

#include <string>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace support {

/// Opens a local page in headless Chromium. `output` is the document after its scripts have run,
/// `error` the console's output. The profile is in the scratch folder.
Outcome browse(const ScratchFolder& scratch, const std::string& page);

/// What a local page is on paper, as `pdftotext -layout` reads it: a form feed ends each sheet.
std::string printed(const ScratchFolder& scratch, const std::string& page);

/// Shows a page with an additional script that acts like a person; the page's policy is changed to
/// allow it. In the script, seen("name", "text") adds "[name: text]" to the page.
Outcome browseHandled(const ScratchFolder& scratch, const std::string& page,
                      const std::string& script);

} // namespace support
