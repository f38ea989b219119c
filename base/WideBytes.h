// SPDX-License-Identifier: Apache-2.0
// Bytes as wide text and back: paths and arguments pass through wide strings unchanged.
#pragma once

#include <string>
#include <string_view>

namespace base {

/// UTF-8 to one unit per character. Each byte that is not part of valid UTF-8 becomes U+DC80 to
/// U+DCFF, so that bytesFromWide returns the same bytes whatever they were.
std::wstring wideFromBytes(std::string_view bytes);

/// The reverse. U+DC80 to U+DCFF, and 0xFFFFFF80 to 0xFFFFFFFF (bytes that were widened as signed
/// numbers), become their low byte. Other units that are not characters become U+FFFD.
std::string bytesFromWide(std::wstring_view text);

/// Wide text as valid UTF-8, for documents: every unit that is not a character becomes U+FFFD.
std::string utf8FromWide(std::wstring_view text);

} // namespace base
