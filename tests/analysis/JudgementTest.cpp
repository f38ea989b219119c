#include "analysis/Judgement.h"

#include <cmath>
#include <map>
#include <regex>
#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"

using analysis::Comparison;
using analysis::Judgement;
using analysis::Verdict;

namespace {

/// One patch: device values, and what is added to the target's L*, a*, b*.
struct Patch {
    std::vector<double> device;
    double dL, da, db;
};

/// Target Lab 50, 0, 40 everywhere: an offset of b* is chroma, one of a* nearly hue.
void compareAs(const std::vector<Patch>& patches, Comparison& c) {
    colour::DataSet& set = c.target.file.set.emplace();
    set.patchCount = patches.size();
    set.deviceSpace = colour::DeviceSpace::Cmyk;
    set.channels.resize(patches.front().device.size());
    c.selection = &c.target;
    c.devices = &c.target;
    c.target.pairing = analysis::pairWithItself(patches.size());
    for (const Patch& patch : patches) {
        set.device.insert(set.device.end(), patch.device.begin(), patch.device.end());
        const colour::Lab target{50, 0, 40};
        const colour::Lab measured{50 + patch.dL, patch.da, 40 + patch.db};
        c.selectedRow.push_back(static_cast<std::uint32_t>(c.selectedRow.size()));
        c.targetLab.push_back(target);
        c.measuredLab.push_back(measured);
        c.difference.push_back(colour::difference(c.formula, target, measured));
    }
}

/// A preset that uses the given criteria; two decimals everywhere.
tolerancePresetParameterRecord presetOf(const std::map<std::string, double>& tolerances) {
    tolerancePresetParameterRecord preset;
    std::fill(std::begin(preset.decimalPlaces), std::end(preset.decimalPlaces), 2);
    for (const auto& [name, tolerance] : tolerances) {
        const int index = analysis::criterionOfName(name)->index;
        preset.presetValues[index] = tolerance;
        preset.usedForResult[index] = 1;
    }
    return preset;
}

// The offsets are such that every kind of patch has a figure of its own.
const std::vector<Patch> strip = {
    {{0, 0, 0, 0, 0}, 1, 0, 0},      {{0, 0.4, 0, 0, 0}, 2, 0, 0},   // paper, twice
    {{100, 0, 0, 0, 0}, 3, 0, 0},    {{0, 100, 0, 0, 0}, 0, 3, 0},   // the second with hue
    {{0, 0, 99.6, 0, 0}, 5, 0, 0},   {{0, 0, 0, 100, 0}, 0, 9, 0},   // black has no hue figure
    {{0, 100, 100, 0, 0}, 7, 0, 0},  {{100, 0, 100, 0, 0}, 8, 0, 0}, // red, green
    {{40, 27, 27, 0, 0}, 99, 3, 4},  {{10.2, 7.4, 7.4, 0, 0}, 0, 0, 1},
    {{40, 27, 27, 10, 0}, 90, 0, 0},                               // black in it: no grey
    {{0, 0, 0, 0, 100}, 10, 0, 0},   {{0, 0, 0, 0, 50}, 91, 0, 0}, // a spot solid, a spot tint
    {{50, 0, 0, 0, 100}, 92, 0, 0},                                // spot over process
    {{30, 20, 0, 0, 0}, 12, 0, 0},
};

TEST(Judgement, EachCriterionLooksAtItsPatches) {
    Comparison c;
    compareAs(strip, c);
    const Judgement judgement = judge(c, {});
    const double hue = std::sqrt(2 * (40 * std::hypot(3, 40) - 1600)); // CIE 15
    const std::map<std::string, double> expected = {
        {"paperWhite", 2},        {"solidCyan", 3},
        {"solidMagenta", 3},      {"solidYellow", 5},
        {"solidBlack", 9},        {"solidMaximum", 9},
        {"solidHueMaximum", hue}, {"secondaryRed", 7},
        {"secondaryGreen", 8},    {"secondaryBlue", -1},
        {"secondaryMaximum", 8},  {"greyMaximum", 5},
        {"greyAverage", 3},       {"spotAverage", 10},
        {"spotMaximum", 10},      {"outerGamutAverage", (3 + 3 + 5 + 7 + 8 + 12) / 6.0},
        {"outerGamutMaximum", 12}};
    std::size_t found = 0;
    for (const analysis::Finding& finding : judgement.findings)
        if (const auto at = expected.find(finding.criterion->name); at != expected.end()) {
            EXPECT_NEAR(finding.value, at->second, 1e-12) << at->first;
            ++found;
        }
    EXPECT_EQ(found, expected.size());
}

TEST(Criteria, AreThoseOfTheDocs) {
    std::string table;
    for (const analysis::Criterion& criterion : analysis::criteria)
        table += "| " + std::to_string(criterion.index) + " | `" + criterion.name + "` | " +
                 std::to_string(criterion.value) + " | " + std::to_string(criterion.psdEntry) +
                 " | " + unit(criterion.quantity) + " |\n";
    std::string documented;
    const std::regex row("\\| [0-9]+ \\| `\\w+` \\| [0-9]+ \\| [0-9]+ \\| \\w+ \\|");
    const std::string docs = support::contentsOf(TINTGATE_SOURCE_DIR "/docs/criteria.md");
    for (std::sregex_iterator it(docs.begin(), docs.end(), row), end; it != end; ++it)
        documented += it->str() + "\n";
    EXPECT_EQ(table, documented);
}

TEST(Judgement, TheVerdictNeverPassesBySilence) {
    const struct {
        const char* what;
        std::map<std::string, double> tolerances;
        Verdict verdict;
    } cases[] = {
        {"within", {{"solidCyan", 3}, {"paperWhite", 2}}, Verdict::Passed},
        {"one above", {{"solidCyan", 2.99}, {"paperWhite", 2}}, Verdict::Failed},
        {"one without an answer", {{"solidCyan", 3}, {"secondaryBlue", 50}}, Verdict::Incomplete},
        {"above and without", {{"solidCyan", 1}, {"secondaryBlue", 50}}, Verdict::Incomplete},
        {"none used", {}, Verdict::Incomplete},
        {"a tolerance that is none", {{"solidCyan", std::nan("")}}, Verdict::Failed},
    };
    Comparison c;
    compareAs(strip, c);
    analyseResultsRecord results;
    for (const auto& [what, tolerances, verdict] : cases) {
        const tolerancePresetParameterRecord preset = presetOf(tolerances);
        const Judgement judgement = judge(c, preset);
        EXPECT_EQ(judgement.verdict, verdict) << what;
        fillResults(judgement, preset, results);
        EXPECT_EQ(results.overallPassed, verdict == Verdict::Passed) << what;
    }
    EXPECT_EQ(results.values[3], 9);   // black
    EXPECT_EQ(results.values[17], -1); // no blue
    EXPECT_EQ(results.values[106], -1);

    tolerancePresetParameterRecord preset = presetOf({{"solidCyan", 3}});
    preset.usedForResult[2] = 1; // an entry without a meaning
    Judgement judgement = judge(c, preset);
    EXPECT_EQ(judgement.verdict, Verdict::Passed);
    ASSERT_EQ(judgement.warnings.size(), 1u);
    EXPECT_STREQ(judgement.warnings[0].code, "criterionUnknown");

    // PSD presets have arrays of their own.
    preset = presetOf({{"solidCyan", 1}});
    preset.fograPSDPreset = 1;
    preset.psdPresetValues[6] = 3;
    preset.usedForPSDResult[6] = 1;
    EXPECT_EQ(judge(c, preset).verdict, Verdict::Passed);
    preset.psdPresetValues[21] = 9; // the largest spot colour
    preset.usedForPSDResult[21] = 1;
    EXPECT_EQ(judge(c, preset).verdict, Verdict::Failed);
}

TEST(Judgement, RoundsTheValueBeforeItIsHeldAgainstTheTolerance) {
    const struct {
        double value;
        int decimals;
        double tolerance;
        bool passed;
    } cases[] = {{2.54, 1, 2.5, true},  {2.75, 1, 2.7, false}, {2.549, 2, 2.5, false},
                 {3.49, 0, 3, true},    {3.5, 0, 3, false},    {2.5000001, 99, 2.5, false},
                 {2.504, 2, 2.5, true}, {2.4, -3, 2.5, true}};
    for (const auto& expected : cases) {
        Comparison c;
        compareAs({{{100, 0, 0, 0}, expected.value, 0, 0}}, c);
        tolerancePresetParameterRecord preset = presetOf({{"solidCyan", expected.tolerance}});
        preset.decimalPlaces[6] = expected.decimals;
        analyseResultsRecord results;
        fillResults(judge(c, preset), preset, results);
        EXPECT_EQ(results.approvals[6], expected.passed) << expected.value;
        EXPECT_NEAR(results.values[0], expected.value, 1e-12); // stays unrounded
        EXPECT_EQ(results.decimals[6], expected.decimals > 0);
    }
}

} // namespace
