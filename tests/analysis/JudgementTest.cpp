// SPDX-License-Identifier: Apache-2.0
#include "LibraryTest.h"

#include <cmath>
#include <map>
#include <regex>

#include <gmock/gmock.h>

namespace {

// Differences from a target of 50, 0, 40. Each kind of patch has its own figure.
const std::string strip = "0 0 0 0 0 51 0 40\n0 0.4 0 0 0 52 0 40\n"    // paper, twice
                          "100 0 0 0 0 53 0 40\n0 100 0 0 0 50 3 40\n"  // the second with hue
                          "0 0 99.6 0 0 55 0 40\n0 0 0 100 0 50 9 40\n" // black has no hue figure
                          "0 100 100 0 0 57 0 40\n100 0 100 0 0 58 0 40\n"   // red, green
                          "40 27 27 0 0 10 3 44\n10.2 7.4 7.4 0 0 50 0 41\n" // five greys
                          "20 12 12 0 0 50 0 41\n60 45 45 0 0 50 0 41\n80 65 65 0 0 50 0 41\n"
                          "40 27 27 10 0 90 0 40\n"                      // has black: not a grey
                          "0 0 0 0 100 60 0 40\n0 0 0 0 50 91 0 40\n"    // a spot solid and a tint
                          "50 0 0 0 100 92 0 40\n30 20 0 0 0 62 0 40\n"; // spot over process

/// Entries of a criterion in the records.
struct Entries {
    int index, value, psd;
};

class JudgementTest : public LibraryTest {
  protected:
    JudgementTest() {
        const std::regex row("\\| ([0-9]+) \\| `(\\w+)` \\| ([0-9]+) \\| ([0-9]+) \\|");
        const std::string docs = support::contentsOf(TINTGATE_SOURCE_DIR "/docs/criteria.md");
        for (std::sregex_iterator it(docs.begin(), docs.end(), row), end; it != end; ++it) {
            documented[(*it)[2]] = {stoi((*it)[1]), stoi((*it)[3]), stoi((*it)[4])};
        }
        std::fill(std::begin(preset.decimalPlaces), std::end(preset.decimalPlaces), 99);
    }

    void use(const std::string& name, double tolerance) {
        preset.presetValues[documented.at(name).index] = tolerance;
        preset.usedForResult[documented.at(name).index] = 1;
    }

    std::string verdict() {
        EXPECT_EQ(analyse(target, measured), 0);
        const std::size_t at = json.find("\"verdict\": \"") + 12;
        const std::string word = json.substr(at, json.find('"', at) - at);
        EXPECT_EQ(results.overallPassed, word == "passed");
        return word;
    }

    std::map<std::string, Entries> documented;
    const std::string columns = "CMYK_C CMYK_M CMYK_Y CMYK_K SPOT_1 LAB_L LAB_A LAB_B";
    std::string measured = chart(columns, strip);
    std::string target = chart(
        columns, std::regex_replace(strip, std::regex("[0-9]+ [0-9]+ [0-9]+\n"), "50 0 40\n"));
};

} // namespace

TEST_F(JudgementTest, EachCriterionLooksAtItsPatches) {
    const double hue = std::sqrt(2 * (40 * std::hypot(3, 40) - 1600)); // CIE 15
    const std::map<std::string, double> expected = {
        {"paperWhite", 2},        {"solidCyan", 3},
        {"solidMagenta", 3},      {"solidYellow", 5},
        {"solidBlack", 9},        {"solidMaximum", 9},
        {"solidHueMaximum", hue}, {"secondaryRed", 7},
        {"secondaryGreen", 8},    {"secondaryBlue", -1},
        {"secondaryMaximum", 8},  {"greyMaximum", 5},
        {"greyAverage", 1.8},     {"spotAverage", 10},
        {"spotMaximum", 10},      {"outerGamutAverage", (1 + 2 + 3 + 3 + 5 + 7 + 8) / 7.0},
        {"outerGamutMaximum", 8}, {"maximum", 42}};
    EXPECT_EQ(verdict(), "incomplete");
    for (const auto& [name, value] : expected) {
        EXPECT_NEAR(results.values[documented.at(name).value], value, 1e-12) << name;
    }
    EXPECT_EQ(results.values[106], -1);
    // Each criterion alone, as a plain preset and as a PSD preset, which uses other arrays.
    ASSERT_EQ(documented.size(), 21U);
    for (const auto& [name, entries] : documented) {
        SCOPED_TRACE(name);
        const double value = results.values[entries.value];
        preset = {};
        std::fill(std::begin(preset.decimalPlaces), std::end(preset.decimalPlaces), 99);
        use(name, value);
        EXPECT_EQ(verdict(), value < 0 ? "incomplete" : "passed");
        EXPECT_EQ(results.approvals[entries.index], value >= 0);
        use(name, value - 1e-9);
        EXPECT_EQ(verdict(), value < 0 ? "incomplete" : "failed");
        preset.fograPSDPreset = 1;
        EXPECT_EQ(verdict(), "incomplete");
        preset.psdPresetValues[entries.psd] = value;
        preset.usedForPSDResult[entries.psd] = 1;
        EXPECT_EQ(verdict(), value < 0 ? "incomplete" : "passed");
    }
}

TEST_F(JudgementTest, NeverPassesBySilence) {
    use("solidCyan", 3);
    preset.usedForResult[2] = 1; // an entry without a meaning
    EXPECT_EQ(verdict(), "passed");
    EXPECT_THAT(json, testing::HasSubstr("criterionUnknown"));
    use("secondaryBlue", 50); // no answer
    EXPECT_EQ(verdict(), "incomplete");
    use("paperWhite", 1.99); // fails, although another has no answer
    EXPECT_EQ(verdict(), "failed");
    preset = {};
    use("solidCyan", std::nan(""));
    EXPECT_EQ(verdict(), "failed");
}

TEST_F(JudgementTest, RoundsTheValueBeforeItIsHeldAgainstTheTolerance) {
    const struct {
        const char* value;
        int decimals;
        double tolerance;
        bool passed;
    } cases[] = {{"2.54", 1, 2.5, true},  {"2.75", 1, 2.7, false}, {"2.549", 2, 2.5, false},
                 {"3.49", 0, 3, true},    {"3.5", 0, 3, false},    {"2.5000001", 99, 2.5, false},
                 {"2.504", 2, 2.5, true}, {"2.4", -3, 2.5, true}};
    target = chart("C M Y K L a b", "100 0 0 0 0 0 0\n");
    for (const auto& [value, decimals, tolerance, passed] : cases) {
        measured = chart("C M Y K L a b", std::string("100 0 0 0 ") + value + " 0 0\n");
        use("solidCyan", tolerance);
        preset.decimalPlaces[6] = decimals;
        EXPECT_EQ(verdict(), passed ? "passed" : "failed") << value;
        EXPECT_EQ(results.values[0], std::stod(value)); // stays unrounded
        EXPECT_EQ(results.decimals[6], decimals > 0);
    }
}
