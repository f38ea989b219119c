#include "platform/WideBytes.h"

#include "platform/Utf8.h"

namespace platform {

std::wstring wideFromBytes(const std::string& bytes) {
    std::wstring text;
    text.reserve(bytes.size());
    for (std::string_view rest = bytes; !rest.empty();) {
        if (const auto c = takeUtf8(rest)) {
            text += static_cast<wchar_t>(*c);
        } else {
            text += static_cast<wchar_t>(0xDC00 | static_cast<unsigned char>(rest.front()));
            rest.remove_prefix(1);
        }
    }
    return text;
}

std::string bytesFromWide(const std::wstring& text) {
    std::string bytes;
    bytes.reserve(text.size());
    for (const wchar_t wide : text) {
        const auto c = static_cast<char32_t>(wide);
        if ((c >= 0xDC80 && c <= 0xDCFF) || c >= 0xFFFFFF80) {
            bytes += static_cast<char>(c);
        } else {
            appendUtf8(bytes, isCharacter(c) ? c : U'?');
        }
    }
    return bytes;
}

} // namespace platform
