// SPDX-License-Identifier: Apache-2.0
// Texts and numbers of findings.
#pragma once

#include <string>

#include <wx/string.h>

namespace diagnosis {

/// A path of the tool's as bytes.
std::string bytesOf(const wxString& text);

/// The last part of a path.
std::string fileName(const std::string& path);

/// An exit code with what it means: "22, An input is neither CGATS text nor an ICC profile. ...".
/// Without a full stop. A code that is not known is its number.
std::string explained(int code);

} // namespace diagnosis
