// SPDX-License-Identifier: Apache-2.0
// Text files in UTF-16, as some export programs on desktop systems write them.
#pragma once

#include <string>
#include <string_view>

namespace colour {

/// True if the bytes begin with the byte order mark of UTF-16, of either order.
bool isUtf16(std::string_view bytes);

/// The text as UTF-8 without a byte order mark. Text that is not UTF-16 is returned as it is, apart
/// from a mark of UTF-8; otherwise the result is in `storage`. Lone surrogates and half a unit at
/// the end become U+FFFD.
std::string_view withoutUtf16(std::string_view bytes, std::string& storage);

} // namespace colour
