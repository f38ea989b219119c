// SPDX-License-Identifier: Apache-2.0
#include "colour/CgatsNumbers.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>

namespace colour::cgats {

namespace {

/// Up to here every integer is a double, so a single division gives the nearest double.
constexpr std::uint64_t largestExact = std::uint64_t{1} << 53;

constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

bool isDigit(char c) {
    return static_cast<unsigned char>(c - '0') < 10;
}

} // namespace

double numberIn(std::string_view text, char comma) {
    while (!text.empty() && blanksSeparate.isBlank(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && blanksSeparate.isBlank(text.back())) {
        text.remove_suffix(1);
    }
    if (text.size() > 1 && text[0] == '+' && text[1] != '-') {
        text.remove_prefix(1);
    }

    char pointed[64];
    const std::size_t at = text.find(comma);
    if (at != std::string_view::npos && comma != '.') {
        if (text.size() > sizeof pointed || text.find('.') != std::string_view::npos) {
            return notANumber;
        }
        std::copy(text.begin(), text.end(), pointed);
        pointed[at] = '.';
        text = {pointed, text.size()};
    }
    double value = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, value);
    if (stop != end || text.empty()) {
        return notANumber;
    }
    const bool tiny = text.find("e-") != std::string_view::npos || // too small for a double
                      text.find("E-") != std::string_view::npos;
    if (error == std::errc::result_out_of_range && tiny) {
        return 0;
    }
    return error == std::errc() && std::isfinite(value) ? value : notANumber;
}

double NumberReader::read(std::string_view text) {
    const double value = numberIn(text, m_chars->decimalComma());
    if (std::isnan(value)) {
        return value;
    }
    const std::size_t comma = text.find(m_chars->decimalComma());
    if (text.find('.') != std::string_view::npos) {
        m_points = true;
    } else if (comma != std::string_view::npos) {
        const std::size_t start = text.find_first_not_of(" \t+-");
        seeComma(text.data() + start, comma - start, text.size() - comma - 1);
    }
    return value;
}

/// As many digits as a double represents exactly, so that the single division is exact too.
bool NumberReader::readLong(const char*& at, const char* end, double& value) {
    const char* p = at;
    const bool negative = *p == '-';
    p += negative ? 1 : 0;
    const char* const first = p;
    std::uint64_t digits = 0;
    while (p != end && isDigit(*p)) {
        digits = 10 * digits + static_cast<std::uint64_t>(*p++ - '0');
    }
    const auto whole = static_cast<std::size_t>(p - first);
    std::size_t decimals = 0;
    bool comma = false;
    if (p != end && (*p == '.' || *p == m_chars->decimalComma())) {
        comma = *p != '.';
        const char* const start = ++p;
        while (p != end && isDigit(*p)) {
            digits = 10 * digits + static_cast<std::uint64_t>(*p++ - '0');
        }
        decimals = static_cast<std::size_t>(p - start);
    }
    const std::size_t count = whole + decimals;
    if (count == 0 || count > mostDigits || digits > largestExact ||
        (p != end && m_chars->isPlain(*p))) {
        return false;
    }
    const double magnitude = static_cast<double>(digits) / powersOfTen[decimals];
    value = negative ? -magnitude : magnitude;
    if (comma) {
        seeComma(first, whole, decimals);
    } else {
        m_points |= decimals > 0;
    }
    at = p;
    return true;
}

void NumberReader::seeComma(const char* number, std::size_t whole, std::size_t decimals) {
    m_commas = true;
    m_thousands |= decimals == 3 && whole >= 1 && whole <= 3 && *number != '0';
}

} // namespace colour::cgats
