// SPDX-License-Identifier: Apache-2.0
// Text in UTF-16, as written by export programs of desktop systems.
#pragma once

#include <stdexcept>
#include <string>

#include <iconv.h>

namespace support {

/// Converts UTF-8 text to UTF-16 with a byte order mark. `order` is "LE" or "BE".
inline std::string utf16(const std::string& text, const std::string& order) {
    const iconv_t conversion = iconv_open(("UTF-16" + order).c_str(), "UTF-8");
    std::string source = "\xEF\xBB\xBF" + text;
    std::string result(2 * source.size() + 2, '\0');
    char* from = source.data();
    char* to = result.data();
    std::size_t left = source.size();
    std::size_t room = result.size();
    const bool converted = iconv(conversion, &from, &left, &to, &room) == 0;
    iconv_close(conversion);
    if (!converted) {
        throw std::runtime_error("not UTF-8");
    }
    result.resize(result.size() - room);
    return result;
}

} // namespace support
