// SPDX-License-Identifier: Apache-2.0
// Wide text as a file of bytes.
#pragma once

#include <string>
#include <string_view>

namespace base {

/// Replaces a file's contents by a text in the multibyte encoding of the process's locale. The file
/// is opened in place, so that links and devices work. False if not all of it could be written;
/// then the file may be incomplete.
bool writeTextInPlace(const std::string& path, std::wstring_view text);

} // namespace base
