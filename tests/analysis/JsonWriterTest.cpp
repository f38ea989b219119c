// SPDX-License-Identifier: Apache-2.0
#include "analysis/JsonWriter.h"

#include <cmath>
#include <cstdio>
#include <limits>
#include <random>

#include <gtest/gtest.h>

namespace {

std::string numberText(double value) {
    analysis::JsonWriter json(16);
    json.number(value);
    const std::wstring text = json.finish();
    return {text.begin(), text.end()};
}

/// The number as printf writes it, without trailing zeros.
std::string printed(double value) {
    char text[400];
    std::string number(text,
                       static_cast<std::size_t>(std::snprintf(text, sizeof text, "%.6f", value)));
    number.erase(number.find_last_not_of('0') + 1);
    if (number.back() == '.') {
        number.pop_back();
    }
    return number == "-0" ? "0" : number;
}

TEST(JsonNumbers, AreWhatPrintfRounds) {
    std::vector<double> values = {0, -0.0, -1e-7, 0.9999995, 999999.9999995, 123456789.123456};
    std::mt19937_64 random(1);
    for (int i = 0; i < 20'000; ++i) {
        const double magnitude = std::pow(10.0, static_cast<int>(random() % 16) - 7.0);
        values.push_back(std::uniform_real_distribution<>(-magnitude, magnitude)(random));
        // At and next to the halves of the seventh decimal, the limits of rounding.
        const double half = (static_cast<double>(random() % 1'000'000'000) + 0.5) / 1e6;
        values.insert(values.end(), {half, std::nextafter(half, 0), std::nextafter(half, 1e9)});
    }
    for (const double value : values) {
        ASSERT_EQ(numberText(value), printed(value)) << std::hexfloat << value;
    }

    EXPECT_EQ(numberText(1e300), "1e+300");
    EXPECT_EQ(numberText(std::numeric_limits<double>::infinity()), "null");
    EXPECT_EQ(numberText(std::nan("")), "null");
}

TEST(JsonText, IsAsciiWhateverGoesIn) {
    const std::pair<std::string, std::string> cases[] = {
        {"a \"b\" \\ /", R"("a \"b\" \\ /")"},
        {std::string("\0\n\t\x1f\x7f", 5), R"("\u0000\n\t\u001f\u007f")"},
        {"\u00e4\u20ac\U0001F3A8", R"("\u00e4\u20ac\ud83c\udfa8")"},
        {"\xff\xc3", R"("\ufffd\ufffd")"},
        {std::string(10'000, '-') + '"', '"' + std::string(10'000, '-') + R"(\"")"}, // Blocks.
    };
    for (const auto& [text, expected] : cases) {
        analysis::JsonWriter json(0);
        json.text(text);
        EXPECT_EQ(json.finish(), std::wstring(expected.begin(), expected.end()));
    }
}

} // namespace
