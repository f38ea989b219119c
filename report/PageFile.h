// SPDX-License-Identifier: Apache-2.0
// Pages on disk.
#pragma once

#include <string>
#include <string_view>

#include "report/Meta.h"

namespace report {

/// report-strip1-2024-05-01-123456: the strip and the time of the run, not of the viewing.
std::string pageStem(const Meta& meta);

/// Writes a page to FOLDER/STEM.html, or to STEM-2.html and on where other pages have the name:
/// none is overwritten. Where one of them holds this very text already, that one is taken. The page
/// is written whole, brought to the disk, and only then gets its name.
///
/// Returns the page's path, or nothing, with the reason in `problem` and no file left behind.
std::string keepPage(const std::string& folder, const std::string& stem, std::string_view page,
                     std::string& problem);

/// Writes a page to `path`, in place of the one that is there, whole as above. False with the
/// reason in `problem` where that fails; then an old page still stands.
bool replacePage(const std::string& path, std::string_view page, std::string& problem);

} // namespace report
