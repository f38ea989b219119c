// SPDX-License-Identifier: Apache-2.0
// Texts and numbers of findings.
#pragma once

#include <string>

#include <wx/string.h>

namespace diagnosis {

/// The bytes of a path of the tool.
std::string bytesOf(const wxString& text);

/// The last part of a path.
std::string fileName(const std::string& path);

/// An exit code and its meaning: "22, An input is neither CGATS text nor an ICC profile. ...",
/// without the final full stop. An unknown code gives only its number.
std::string explained(int code);

} // namespace diagnosis
