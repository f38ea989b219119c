// SPDX-License-Identifier: Apache-2.0
#include "report/InPage.h"

#include <charconv>
#include <cmath>

namespace report {

std::string inScript(const PageJson& json) {
    std::string safe;
    for (const char c : json.dump(-1, ' ', true, PageJson::error_handler_t::replace)) {
        switch (c) {
        case '<':
            safe += "\\u003c";
            break;
        case '>':
            safe += "\\u003e";
            break;
        case '&':
            safe += "\\u0026";
            break;
        default:
            safe += c;
        }
    }
    return safe;
}

std::string scriptTexts(const languages::Texts& say, const char* page) {
    return inScript(PageJson::parse(say.forScript(page)));
}

void appendNumber(std::string& text, double value) {
    char digits[32];
    if (!std::isfinite(value)) {
        text += "null";
    } else {
        text.append(digits, std::to_chars(digits, digits + sizeof digits, value).ptr);
    }
}

void appendRounded(std::string& text, const std::vector<double>& values, int decimals) {
    const double scale = std::pow(10, decimals);
    text += '[';
    for (std::size_t i = 0; i < values.size(); ++i) {
        if (i != 0) {
            text += ',';
        }
        appendNumber(text, std::round(values[i] * scale) / scale);
    }
    text += ']';
}

std::string swatchText(const Swatch& swatch) {
    static constexpr char digits[] = "0123456789abcdef";
    std::string text = "#";
    for (const std::uint8_t channel : {swatch.red, swatch.green, swatch.blue}) {
        text += digits[channel >> 4];
        text += digits[channel & 15];
    }
    return swatch.clipped ? text + '!' : text;
}

std::string linkTo(const std::string& path) {
    static constexpr char digits[] = "0123456789ABCDEF";
    std::string url = "./";
    for (const char c : path) {
        const auto byte = static_cast<unsigned char>(c);
        const bool plain = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                           (c >= '0' && c <= '9') || c == '/' || c == '-' || c == '.' || c == '_';
        if (plain) {
            url += c;
        } else {
            url += {'%', digits[byte >> 4], digits[byte & 15]};
        }
    }
    return url;
}

const char* keyOf(Verdict verdict) {
    return verdict == Verdict::Passed   ? "passed"
           : verdict == Verdict::Failed ? "failed"
                                        : "incomplete";
}

const char* keyOf(Outcome outcome) {
    switch (outcome) {
    case Outcome::Pass:
        return "passed";
    case Outcome::Fail:
        return "failed";
    case Outcome::Unanswered:
        return "incomplete";
    case Outcome::Unjudged:
        break;
    }
    return "unjudged";
}

} // namespace report
