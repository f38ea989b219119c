// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Bytes.h"

#include <cstdint>
#include <cstdio>

#include "base/Utf8.h"

namespace admin {

namespace {

constexpr std::string_view digits =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

/// C0, C1 and DEL.
bool isControl(char32_t character) {
    return character < 0x20 || (character >= 0x7F && character < 0xA0);
}

} // namespace

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
    // Refuses alternative encodings: wrong padding, and bits after the last byte.
    if (toBase64(bytes) != text) {
        return std::nullopt;
    }
    return bytes;
}

Json textOrBytes(const std::string& bytes) {
    return base::isUtf8(bytes) ? Json(bytes) : Json{{"base64", toBase64(bytes)}};
}

std::string printable(std::string_view bytes) {
    std::string text;
    while (!bytes.empty()) {
        std::string_view rest = bytes;
        const auto character = base::takeUtf8(rest);
        if (character && !isControl(*character)) {
            base::appendUtf8(text, *character);
            bytes = rest;
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
