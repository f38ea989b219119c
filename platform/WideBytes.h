// Paths and arguments as wide text, byte for byte.
#pragma once

#include <string>

namespace platform {

/// UTF-8 to one character each. A byte that is not part of valid UTF-8 becomes U+DC80 to U+DCFF, so
/// that bytesFromWide gives it back.
std::wstring wideFromBytes(const std::string& bytes);

/// The reverse. Beside U+DC80 to U+DCFF, 0xFFFFFF80 to 0xFFFFFFFF (bytes that were widened as
/// signed numbers) become their low byte. What is no character otherwise becomes '?'.
std::string bytesFromWide(const std::wstring& text);

} // namespace platform
