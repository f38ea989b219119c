// SPDX-License-Identifier: Apache-2.0
#include "text/StringUtilsComGUI.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <sstream>
#include <vector>

#include "platform/CoreFoundationStrings.h"

namespace StringUtilsComGUI {

std::string stringFromwstring(const std::wstring& text) {
    std::string narrow(text.size(), '\0');
    std::transform(text.begin(), text.end(), narrow.begin(),
                   [](wchar_t c) { return static_cast<char>(c); });
    return narrow;
}

std::wstring wstringFromstring(const std::string& text) {
    std::wstring wide(text.size(), L'\0');
    std::transform(text.begin(), text.end(), wide.begin(),
                   [](char c) { return static_cast<wchar_t>(static_cast<signed char>(c)); });
    return wide;
}

std::string::size_type UnicodeToUTF8(const std::wstring& text, std::string& target) {
    const auto end = std::find(text.begin(), text.end(), L'\0');
    std::vector<UniChar> units(static_cast<std::size_t>(end - text.begin()));
    std::transform(text.begin(), end, units.begin(),
                   [](wchar_t c) { return static_cast<UniChar>(c); });

    const auto count = static_cast<CFIndex>(units.size());
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCharacters(kCFAllocatorDefault, units.data(), count));
    const CFIndex size = CFStringGetMaximumSizeForEncoding(count, kCFStringEncodingUTF8) + 1;
    std::vector<char> bytes(static_cast<std::size_t>(size));
    if (string == nullptr ||
        !CFStringGetCString(string.get(), bytes.data(), size, kCFStringEncodingUTF8)) {
        return 0;
    }
    target = bytes.data();
    return target.length();
}

std::string UTF8FromUni(const std::wstring& text) {
    std::string target;
    UnicodeToUTF8(text, target);
    return target;
}

std::wstring::size_type UTF8ToUnicode(const std::string& text, std::wstring& target) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, text.c_str(), kCFStringEncodingUTF8));
    if (string == nullptr) {
        return 0;
    }
    const CFIndex count = CFStringGetLength(string.get());
    std::vector<UniChar> units(static_cast<std::size_t>(count));
    CFStringGetCharacters(string.get(), {0, count}, units.data());

    std::wstring wide(text.size(), L'\0');
    std::copy(units.begin(), units.end(), wide.begin());
    target = std::move(wide);
    return target.length();
}

std::wstring UniFromUTF8(const std::string& text) {
    std::wstring target;
    UTF8ToUnicode(text, target);
    return target;
}

int ConvertHexStrToInt(const char* text) {
    int value = -1;
    if (text != nullptr) {
        std::istringstream(text) >> std::hex >> value;
    }
    return value;
}

std::string ConvertIntToHexStr(int value) {
    char digits[8];
    const auto written =
        std::to_chars(std::begin(digits), std::end(digits), static_cast<unsigned int>(value), 16);
    return {digits, written.ptr};
}

char* lower(char* text) {
    for (char* c = text; c != nullptr && *c != '\0'; ++c) {
        *c = static_cast<char>(std::tolower(static_cast<unsigned char>(*c)));
    }
    return text;
}

} // namespace StringUtilsComGUI
