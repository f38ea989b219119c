#include "analysis/JsonWriter.h"

#include <cmath>
#include <cstdio>
#include <limits>
#include <random>

#include <gtest/gtest.h>

#include "analysis/Text.h"

namespace {

std::string numberText(double value) {
    analysis::JsonWriter json(16);
    json.number(value);
    return std::string(json.written());
}

/// What printf makes of it, without the zeros at the end.
std::string printed(double value) {
    char text[400];
    std::string number(text,
                       static_cast<std::size_t>(std::snprintf(text, sizeof text, "%.6f", value)));
    number.erase(number.find_last_not_of('0') + 1);
    if (number.back() == '.')
        number.pop_back();
    return number == "-0" ? "0" : number;
}

TEST(JsonNumbers, AreWhatPrintfRounds) {
    std::vector<double> values = {0,      -0.0,           0.5,       100,
                                  -1e-7,  0.9999995,      1.0000005, 0.1,
                                  2.5e-7, 999999.9999995, 0.0000005, 123456789.123456,
                                  -74.57};
    std::mt19937_64 random(1);
    for (int i = 0; i < 200'000; ++i) {
        const double magnitude = std::pow(10.0, static_cast<int>(random() % 16) - 7.0);
        values.push_back(std::uniform_real_distribution<>(-magnitude, magnitude)(random));
        // At and beside the halves of the seventh decimal, where rounding is decided.
        const double half = (static_cast<double>(random() % 1'000'000'000) + 0.5) / 1e6;
        values.insert(values.end(), {half, std::nextafter(half, 0), std::nextafter(half, 1e9)});
    }
    for (const double value : values)
        ASSERT_EQ(numberText(value), printed(value)) << std::hexfloat << value;

    EXPECT_EQ(numberText(1e300), "1e+300");
    EXPECT_EQ(numberText(std::numeric_limits<double>::infinity()), "null");
    EXPECT_EQ(numberText(std::nan("")), "null");
}

TEST(JsonText, IsAsciiWhateverGoesIn) {
    const struct {
        std::string text, json;
    } cases[] = {
        {"", R"("")"},
        {"a \"b\" \\ /", R"("a \"b\" \\ /")"},
        {std::string("\0\n\t\x1f\x7f", 5), R"("\u0000\n\t\u001f\u007f")"},
        {"\u00e4\u20ac", R"("\u00e4\u20ac")"},
        {"\U0001F3A8", R"("\ud83c\udfa8")"},
        {"\xff\xc3", R"("\ufffd\ufffd")"},
        {"\xed\xa0\x80", R"("\ufffd\ufffd\ufffd")"}, // a surrogate
        {"\xc0\xaf", R"("\ufffd\ufffd")"},           // overlong
    };
    for (const auto& c : cases) {
        analysis::JsonWriter json(0);
        json.text(c.text);
        EXPECT_EQ(json.written(), c.json);
    }
}

TEST(Text, BytesSurviveTheRoundTrip) {
    std::string bytes;
    for (int first = 0; first < 256; ++first)
        for (int second = 0; second < 256; ++second)
            bytes += {static_cast<char>(first), static_cast<char>(second), '/'};
    bytes += "\xed\xb2\x80 \xf0\x9f\x8e\xa8 \xf4\x90\x80\x80 \xe2\x82";
    EXPECT_EQ(analysis::narrowed(analysis::widened(bytes)), bytes);

    EXPECT_EQ(analysis::widened("\xc3\xa4\xff"), L"\u00e4\xdcff");
    const std::wstring units = {wchar_t(0xDC80), wchar_t(0xFFFFFF80), wchar_t(0xFFFFFFFF),
                                wchar_t(0xD800), wchar_t(0x110000)};
    EXPECT_EQ(analysis::narrowed(units), "\x80\x80\xff\ufffd\ufffd");
    EXPECT_EQ(analysis::documentText(units), "\ufffd\ufffd\ufffd\ufffd\ufffd");
}

} // namespace
