// SPDX-License-Identifier: Apache-2.0
// Numbers in the cells of a table.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "colour/CgatsLines.h"

namespace colour::cgats {

/// The number in a cell, with a point or `comma` as the decimal point. NaN for anything else,
/// including infinities.
double numberIn(std::string_view text, char comma);

/// Reads numbers and records how they are written. Each result is the nearest double.
class NumberReader {
  public:
    /// `chars` must outlive the reader.
    explicit NumberReader(const CharTable& chars) : m_chars(&chars) {}

    /// Reads a number in any notation. NaN if it is not a number.
    double read(std::string_view text);

    /// Reads a number in the most common notation: digits and a point, up to a blank or line end.
    /// Otherwise returns false and leaves `at` unchanged. REQUIRES: at < end.
    bool readPlain(const char*& at, const char* end, double& value) {
        return readShort(at, end, value) || readLong(at, end, value);
    }

    bool sawCommas() const { return m_commas; }

    /// True if commas may be thousands separators instead of decimal points: 1,234 next to 1.5.
    bool isAmbiguous() const { return m_thousands && m_points; }

  private:
    bool readShort(const char*& at, const char* end, double& value);
    bool readLong(const char*& at, const char* end, double& value);
    void seeComma(const char* number, std::size_t whole, std::size_t decimals);

    const CharTable* m_chars;
    bool m_points = false;
    bool m_commas = false;
    bool m_thousands = false;
};

/// Any decimal with so many digits fits an unsigned 64-bit number.
inline constexpr std::size_t mostDigits = 18;

inline constexpr double powersOfTen[mostDigits + 1] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,
                                                       1e7,  1e8,  1e9,  1e10, 1e11, 1e12, 1e13,
                                                       1e14, 1e15, 1e16, 1e17, 1e18};

/// Reads up to seven digits and a point without a loop: eight bytes are loaded as one word, with
/// the first character in the lowest byte.
inline bool NumberReader::readShort(const char*& at, const char* end, double& value) {
    if (std::endian::native != std::endian::little || end - at < 9) {
        return false;
    }
    const bool negative = *at == '-';
    const char* const p = at + (negative ? 1 : 0);
    std::uint64_t digits = 0;
    std::memcpy(&digits, p, sizeof digits);
    digits ^= 0x3030303030303030; // digits become 0 to 9
    // The top bit of every byte that is not a digit, exact up to the second one.
    std::uint64_t others = (digits | (digits + 0x7676767676767676)) & 0x8080808080808080;
    if (others == 0) {
        return false;
    }
    int length = std::countr_zero(others) / 8;
    int count = length;
    int decimals = 0;
    if (p[length] == '.') {
        others &= others - 1;
        if (others == 0) {
            return false;
        }
        const std::uint64_t whole = (std::uint64_t{1} << (8 * length)) - 1;
        digits = (digits & whole) | ((digits >> 8) & ~whole);
        count = std::countr_zero(others) / 8 - 1;
        decimals = count - length;
        length = count + 1;
        m_points = true;
    }
    if (count == 0 || m_chars->isPlain(p[length])) {
        return false;
    }
    // Pads to eight digits with zeros in front, then combines pairs, fours and all eight.
    digits <<= 8 * (8 - count);
    digits = 10 * digits + (digits >> 8);
    constexpr std::uint64_t pairs = 0x000000FF000000FF;
    digits =
        ((digits & pairs) * 0x000F424000000064 + ((digits >> 16) & pairs) * 0x0000271000000001) >>
        32;
    const double magnitude =
        static_cast<double>(static_cast<std::uint32_t>(digits)) / powersOfTen[decimals];
    value = negative ? -magnitude : magnitude;
    at = p + length;
    return true;
}

} // namespace colour::cgats
