#include "platform/WideBytes.h"

#include <cstdint>

namespace platform {

namespace {

struct Decoded {
    std::uint32_t character;
    std::size_t length; // 0 where no valid sequence starts.
};

Decoded decode(const unsigned char* bytes, std::size_t size) {
    const unsigned char lead = bytes[0];
    if (lead < 0x80) {
        return {lead, 1};
    }
    const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (lead < 0xC2 || lead > 0xF4 || size < length) {
        return {0, 0};
    }
    std::uint32_t character = lead & (0xFFu >> (length + 1));
    for (std::size_t i = 1; i < length; ++i) {
        if ((bytes[i] & 0xC0) != 0x80) {
            return {0, 0};
        }
        character = character << 6 | (bytes[i] & 0x3Fu);
    }
    constexpr std::uint32_t smallest[] = {0, 0, 0x80, 0x800, 0x10000};
    const bool surrogate = character >= 0xD800 && character <= 0xDFFF;
    if (character < smallest[length] || character > 0x10FFFF || surrogate) {
        return {0, 0};
    }
    return {character, length};
}

void encode(std::uint32_t character, std::string& out) {
    const auto append = [&out](std::uint32_t byte) { out += static_cast<char>(byte); };
    if (character < 0x80) {
        append(character);
        return;
    }
    if (character < 0x800) {
        append(0xC0 | character >> 6);
    } else {
        if (character < 0x10000) {
            append(0xE0 | character >> 12);
        } else {
            append(0xF0 | character >> 18);
            append(0x80 | (character >> 12 & 0x3F));
        }
        append(0x80 | (character >> 6 & 0x3F));
    }
    append(0x80 | (character & 0x3F));
}

} // namespace

std::wstring wideFromBytes(const std::string& bytes) {
    std::wstring text;
    text.reserve(bytes.size());
    const auto* const data = reinterpret_cast<const unsigned char*>(bytes.data());
    for (std::size_t i = 0; i < bytes.size();) {
        const Decoded next = decode(data + i, bytes.size() - i);
        text += static_cast<wchar_t>(next.length == 0 ? 0xDC00u + data[i] : next.character);
        i += next.length == 0 ? 1 : next.length;
    }
    return text;
}

std::string bytesFromWide(const std::wstring& text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t wide : text) {
        const auto character = static_cast<std::uint32_t>(wide);
        if ((character >= 0xDC80 && character <= 0xDCFF) || character >= 0xFFFFFF80) {
            bytes += static_cast<char>(character & 0xFF);
        } else if (character > 0x10FFFF || (character >= 0xD800 && character <= 0xDFFF)) {
            bytes += '?';
        } else {
            encode(character, bytes);
        }
    }
    return bytes;
}

} // namespace platform
