// SPDX-License-Identifier: Apache-2.0
// File names in tickets have forward slashes on every system.
#pragma once

#include <string>
#include <vector>

/// Returns the name with every backslash replaced by a forward slash.
std::string FilenameToTicket(const std::string& name);

/// Same, not the inverse (C125): file names have forward slashes in both directions.
std::string FilenameFromTicket_C(const std::string& name);

/// Applies FilenameToTicket to each name, in order. Clears `out` first.
void FilenamesToTicket(std::vector<std::string>& out, const std::vector<std::string>& in);
