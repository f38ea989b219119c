// SPDX-License-Identifier: Apache-2.0
// File names in tickets have forward slashes, whatever system they come from.
#pragma once

#include <string>
#include <vector>

/// The name with every backslash made a forward slash.
std::string FilenameToTicket(const std::string& name);

/// The same and not its reverse (C125): file names have forward slashes on both ways.
std::string FilenameFromTicket_C(const std::string& name);

/// FilenameToTicket of each name, in order; `out` is cleared first.
void FilenamesToTicket(std::vector<std::string>& out, const std::vector<std::string>& in);
