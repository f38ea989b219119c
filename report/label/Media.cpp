// SPDX-License-Identifier: Apache-2.0
// Formats and sizes of labels and certificates.
#include <algorithm>
#include <cctype>
#include <charconv>
#include <clocale>
#include <langinfo.h>
#include <locale.h>

#include "report/label/Label.h"

namespace label {
namespace {

std::string lowerCase(std::string_view text) {
    std::string result(text);
    for (char& c : result) {
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    return result;
}

/// Removes a positive number from the front of the text.
std::optional<double> takeNumber(std::string_view& text) {
    double value = 0;
    const auto [end, error] =
        std::from_chars(text.data(), text.data() + text.size(), value, std::chars_format::fixed);
    if (error != std::errc() || !(value > 0)) {
        return std::nullopt;
    }
    text.remove_prefix(static_cast<std::size_t>(end - text.data()));
    return value;
}

bool isUsable(const Size& size) {
    const double shorter = std::min(size.width, size.height);
    const double longer = std::max(size.width, size.height);
    return shorter >= shortestSide && longer >= leastLongerSide && longer <= longestSide;
}

} // namespace

std::optional<Format> formatOf(std::string_view path) {
    const std::size_t dot = path.rfind('.');
    const std::string extension = dot == path.npos ? "" : lowerCase(path.substr(dot));
    return extension == ".pdf"   ? std::optional(Format::Pdf)
           : extension == ".svg" ? std::optional(Format::Svg)
           : extension == ".png" ? std::optional(Format::Png)
                                 : std::nullopt;
}

std::optional<Size> sizeOf(std::string_view text) {
    constexpr double millimetresPerInch = 25.4;
    const std::string lower = lowerCase(text);
    std::string_view rest = lower;
    const auto width = takeNumber(rest);
    if (!width || !rest.starts_with('x')) {
        return std::nullopt;
    }
    rest.remove_prefix(1);
    const auto height = takeNumber(rest);
    if (!height || (!rest.empty() && rest != "mm" && rest != "in")) {
        return std::nullopt;
    }
    const double unit = rest == "in" ? millimetresPerInch : 1;
    const Size size = {*width * unit, *height * unit};
    return isUsable(size) ? std::optional(size) : std::nullopt;
}

std::optional<Size> sheetOf(std::string_view text) {
    const std::string name = lowerCase(text);
    return name == "a4"       ? std::optional(a4)
           : name == "letter" ? std::optional(letter)
                              : std::nullopt;
}

Size usualSheet() {
    constexpr int heightOfLetter = 279;
    const locale_t users = newlocale(LC_PAPER_MASK, "", nullptr);
    if (users == nullptr) {
        return a4;
    }
    // This item is a number in the place of the pointer.
    const auto height =
        static_cast<int>(reinterpret_cast<std::intptr_t>(nl_langinfo_l(_NL_PAPER_HEIGHT, users)));
    freelocale(users);
    return height == heightOfLetter ? letter : a4;
}

} // namespace label
