// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Bytes.h"

#include <cstdint>
#include <cstdio>

namespace admin {

namespace {

constexpr std::string_view digits =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

/// Bytes of the UTF-8 character in front, 0 if there is none.
std::size_t leadingCharacter(std::string_view bytes) {
    const auto at = [&](std::size_t i) {
        return i < bytes.size() ? static_cast<unsigned char>(bytes[i]) : 0U;
    };
    const unsigned first = at(0);
    if (bytes.empty() || first < 0x80) {
        return bytes.empty() ? 0 : 1;
    }
    if (first < 0xC2 || first > 0xF4) {
        return 0;
    }
    const std::size_t length = first < 0xE0 ? 2 : first < 0xF0 ? 3 : 4;
    for (std::size_t i = 1; i < length; ++i) {
        if ((at(i) & 0xC0) != 0x80) {
            return 0;
        }
    }
    const bool outside = (first == 0xE0 && at(1) < 0xA0) || (first == 0xED && at(1) > 0x9F) ||
                         (first == 0xF0 && at(1) < 0x90) || (first == 0xF4 && at(1) > 0x8F);
    return outside ? 0 : length;
}

/// Of one character: C0, C1 and DEL.
bool isControl(std::string_view character) {
    const auto first = static_cast<unsigned char>(character[0]);
    return first < 0x20 || first == 0x7F ||
           (first == 0xC2 && static_cast<unsigned char>(character[1]) < 0xA0);
}

} // namespace

bool isUtf8(std::string_view bytes) {
    while (!bytes.empty()) {
        const std::size_t length = leadingCharacter(bytes);
        if (length == 0) {
            return false;
        }
        bytes.remove_prefix(length);
    }
    return true;
}

std::string toBase64(std::string_view bytes) {
    std::string text;
    text.reserve((bytes.size() + 2) / 3 * 4);
    for (std::size_t i = 0; i < bytes.size(); i += 3) {
        std::uint32_t group = 0;
        for (std::size_t j = i; j < i + 3; ++j) {
            group = group << 8 | (j < bytes.size() ? static_cast<unsigned char>(bytes[j]) : 0U);
        }
        const std::size_t used = std::min<std::size_t>(bytes.size() - i, 3) + 1;
        for (std::size_t j = 0; j < 4; ++j) {
            text += j < used ? digits[group >> (18 - 6 * j) & 63] : '=';
        }
    }
    return text;
}

std::optional<std::string> fromBase64(std::string_view text) {
    std::string bytes;
    bytes.reserve(text.size() / 4 * 3);
    std::uint32_t group = 0;
    std::size_t count = 0;
    for (const char sign : text) {
        const std::size_t digit = digits.find(sign);
        if (digit == std::string_view::npos) {
            break;
        }
        group = group << 6 | static_cast<std::uint32_t>(digit);
        ++count;
        if (count % 4 != 1) {
            bytes += static_cast<char>(group >> (6 - 2 * ((count - 1) % 4)));
        }
    }
    // Whatever has a second spelling is refused: wrong padding, and bits behind the last byte.
    if (toBase64(bytes) != text) {
        return std::nullopt;
    }
    return bytes;
}

Json textOrBytes(const std::string& bytes) {
    return isUtf8(bytes) ? Json(bytes) : Json{{"base64", toBase64(bytes)}};
}

std::string printable(std::string_view bytes) {
    std::string text;
    while (!bytes.empty()) {
        const std::size_t length = leadingCharacter(bytes);
        if (length != 0 && !isControl(bytes)) {
            text += bytes.substr(0, length);
            bytes.remove_prefix(length);
            continue;
        }
        char escaped[8];
        std::snprintf(escaped, sizeof escaped, "\\x%02X", static_cast<unsigned char>(bytes[0]));
        text += escaped;
        bytes.remove_prefix(1);
    }
    return text;
}

} // namespace admin
