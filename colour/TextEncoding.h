// SPDX-License-Identifier: Apache-2.0
// Text files in UTF-16, as some export programs on desktop systems write them.
#pragma once

#include <string>
#include <string_view>

namespace colour {

/// True if the bytes start with a UTF-16 byte order mark, in either byte order.
bool isUtf16(std::string_view bytes);

/// Converts the text to UTF-8 without a byte order mark. Text that is not UTF-16 is returned
/// unchanged, except for a UTF-8 mark; otherwise the result is in `storage`. Lone surrogates and
/// half a unit at the end become U+FFFD.
std::string_view withoutUtf16(std::string_view bytes, std::string& storage);

} // namespace colour
