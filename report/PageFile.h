// SPDX-License-Identifier: Apache-2.0
// Writes pages to disk.
#pragma once

#include <string>
#include <string_view>

#include "report/Meta.h"

namespace report {

/// report-strip1-2024-05-01-123456: the strip and the time of the run (not of the display).
std::string pageStem(const Meta& meta);

/// Writes a page to FOLDER/STEM.html, or to STEM-2.html and so on if other pages have the name:
/// none is overwritten. If one of them already has this exact text, it is used. The page is written
/// completely, flushed to disk, and only then renamed.
///
/// Returns the page's path. On failure, returns nothing, sets `problem` and leaves no file.
std::string keepPage(const std::string& folder, const std::string& stem, std::string_view page,
                     std::string& problem);

} // namespace report
