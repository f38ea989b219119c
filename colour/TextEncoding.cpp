// SPDX-License-Identifier: Apache-2.0
#include "colour/TextEncoding.h"

#include "base/Utf8.h"

namespace colour {
namespace {

constexpr std::string_view markOfUtf8 = "\xEF\xBB\xBF";
constexpr std::string_view markLowFirst = "\xFF\xFE";
constexpr std::string_view markHighFirst = "\xFE\xFF";
constexpr char32_t replacement = 0xFFFD;

bool isHighSurrogate(char32_t unit) {
    return (unit & 0xFFFFFC00) == 0xD800;
}

bool isLowSurrogate(char32_t unit) {
    return (unit & 0xFFFFFC00) == 0xDC00;
}

} // namespace

bool isUtf16(std::string_view bytes) {
    return bytes.starts_with(markLowFirst) || bytes.starts_with(markHighFirst);
}

std::string_view withoutUtf16(std::string_view bytes, std::string& storage) {
    if (!isUtf16(bytes)) {
        return bytes.starts_with(markOfUtf8) ? bytes.substr(markOfUtf8.size()) : bytes;
    }
    const std::size_t high = bytes.starts_with(markHighFirst) ? 0 : 1;
    const auto unitAt = [&](std::size_t at) {
        const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(bytes[i]); };
        return static_cast<char32_t>(byte(at + high) << 8 | byte(at + 1 - high));
    };
    storage.clear();
    storage.reserve(bytes.size() / 2);
    std::size_t at = markLowFirst.size();
    for (; at + 1 < bytes.size(); at += 2) {
        char32_t c = unitAt(at);
        if (isHighSurrogate(c) && at + 3 < bytes.size() && isLowSurrogate(unitAt(at + 2))) {
            c = 0x10000 + ((c - 0xD800) << 10) + (unitAt(at + 2) - 0xDC00);
            at += 2;
        }
        base::appendUtf8(storage, base::isCharacter(c) ? c : replacement);
    }
    if (at < bytes.size()) {
        base::appendUtf8(storage, replacement);
    }
    return storage;
}

} // namespace colour
