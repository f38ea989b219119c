// Runs of the measuring tool on definitions as the writer makes them.
#include <algorithm>
#include <cmath>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <signal.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "SuiteRoot.h"
#include "colour/CgatsText.h"
#include "colour/Difference.h"
#include "colour/Spectra.h"
#include "measure/Helper.h"

namespace {

using testing::HasSubstr;

const std::string profile = "/usr/share/color/icc/ghostscript/default_cmyk.icc";
const std::string virtualPrint = "instrument = virtual\nprofile = " + profile + "\n";

const std::string head = "CGATS.17\nORIGINATOR \"Nerova Verify\"\n";
const std::string cmyk = "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
const std::string begin = "BEGIN_DATA\n";
const std::string end = "END_DATA\n";
const std::string paper = "0\t0\t0\t0";
const std::string rows = begin + "1\t100\t0\t0\t0\n2\t40\t27\t27\t0\n";

std::string format(const std::string& names) {
    return "BEGIN_DATA_FORMAT\nSAMPLE_ID\t" + names + "\nEND_DATA_FORMAT\n";
}

/// The lines of a definition end in CR LF.
std::string crlf(const std::string& text) {
    return std::regex_replace(text, std::regex("\n"), "\r\n");
}

/// A definition of these patches, such as "100\t0\t0\t0".
std::string definitionOf(const std::vector<std::string>& patches) {
    std::string lines;
    for (std::size_t i = 0; i < patches.size(); ++i)
        lines += std::to_string(i + 1) + "\t" + patches[i] + "\n";
    return crlf(head + format(cmyk) + "DEVICE 33\n" + begin + lines + end);
}

/// "1: 100 0 0 0; 2: 40 27 27 0; "
std::string patchesText(const colour::DataSet& set) {
    std::ostringstream text;
    const std::size_t channels = set.channels.size();
    for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
        text << set.ids[patch] << ':';
        for (std::size_t i = 0; i < channels; ++i)
            text << ' ' << std::round(100 * set.device[patch * channels + i]) / 100;
        text << "; ";
    }
    return text.str();
}

class MeasureTool : public testing::Test {
  protected:
    MeasureTool() { m_folder.makeFolder("out"); }

    support::Outcome measure(const std::string& definition, const std::string& settings) const {
        m_folder.write("definition.it8", definition);
        return support::run({MEASURE_TOOL, writeOptions()}, environmentWith(settings));
    }

    std::string writeOptions() const {
        return m_folder.write("options",
                              "-apnm\nNerova Verify\n-l\n57\n-pwd\n\"\"\n-i\nInstrument 33"
                              "\n-m\nmeasure\n-o\n" +
                                  m_output + "\n-patch\n" + m_folder.path("definition.it8") +
                                  "\n-patchname\nstrip.it8\n-forcemeasure\nTrue\n");
    }

    support::RunOptions environmentWith(const std::string& settings) const {
        support::RunOptions options;
        options.environment["TINTGATE_MEASURE"] = m_folder.write("settings", settings);
        return options;
    }

    /// What was measured; empties the folder that it was written to.
    colour::DataSet takeResult() const {
        colour::DataSet set;
        if (support::exists(m_output)) {
            EXPECT_EQ(colour::readCgats(support::contentsOf(m_output), {}, set),
                      colour::Failure::None);
            std::filesystem::remove(m_output);
        }
        EXPECT_TRUE(std::filesystem::is_empty(m_folder.path("out")));
        return set;
    }

    /// Measures with what works.
    colour::DataSet measured(const std::string& definition, const std::string& settings) const {
        const support::Outcome outcome = measure(definition, settings);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
        EXPECT_EQ(outcome.output + outcome.error, "");
        return takeResult();
    }

    /// One distinct failure, one line, and no file.
    void expectFailure(const support::Outcome& outcome, int exitCode, const std::string& words) {
        EXPECT_EQ(outcome.exitCode, exitCode) << words;
        EXPECT_THAT(outcome.error, HasSubstr(words));
        EXPECT_EQ(outcome.error.find('\n'), outcome.error.size() - 1) << outcome.error;
        EXPECT_EQ(takeResult().patchCount, 0u) << words;
    }

    const support::ScratchFolder m_folder;
    const std::string m_output = m_folder.path("out/Measured sample.txt");
};

TEST_F(MeasureTool, ReadsEveryDefinition) {
    const auto table = [](const std::string& names, const std::string& lines) {
        return head + format(names) + "KEYWORD\tDEVICE\nDEVICE 33\n" + begin + lines;
    };
    const std::string lab = "\tLAB_L\tLAB_A\tLAB_B";
    const std::string colours = lab + "\tXYZ_X\tXYZ_Y\tXYZ_Z";
    const std::string simple = "1: 100 0 0 0; 2: 40 27 27 0; ";
    const std::string white = "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00\n";
    const std::string whiteRgb = "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00\n";
    std::string longNames = cmyk;
    std::string values;
    for (int nm = 380; nm <= 730; nm += 10) {
        longNames += "\tSPECTRAL_NM_" + std::to_string(nm);
        values += "\t0.123456789012";
    }
    longNames.resize(511 - std::string("SAMPLE_ID\t").size());

    const struct {
        std::string text;
        std::string patches;
        int exitCode = 0;
        const char* words = "";
    } cases[] = {
        // Names of several bytes and none, in rows that are cut off.
        {table("SAMPLE_NAME\t" + cmyk + colours,
               "1\tGröße a\t100\t0\t0\t0\t55\t-36\t-50\t1\t2\t74.\n"
               "2\t白い 紙\t40\t27\t27\t0\t95.00\t0.00\t0.00\t84.00\n"
               "3\t\t0\t0\t0\t50\t95\t0\t0\t84\t87\t74\n" +
                   end),
         simple + "3: 0 0 0 50; "},
        // Rows and names of columns cut off at 511 bytes.
        {table(longNames, ("1\t100\t0\t0\t0" + values).substr(0, 511) + "\n" +
                              ("2\t40\t27\t27\t0" + values).substr(0, 511) + "\n" + end),
         simple},
        // Rows that fill a strip, with columns of their own.
        {table("SAMPLE_NAME\tCMYK_K\tCMYK_C\tCMYK_M\tCMYK_Y\tSPOT_1",
               "1\tA1\t5\t100\t0\t0\t0\n2" + white + "3" + white + "END_DATA"),
         "1: 100 0 0 5 0; 2: 0 0 0 0 0; 3: 0 0 0 0 0; "},
        {table("RGB_R\tRGB_G\tRGB_B" + lab, "1\t0\t20\t100\t3\t0\t0\n2" + whiteRgb + "END_DATA"),
         "1: 0 20 100; 2: 100 100 100; "},
        {"", "", 4, "is neither"},
        {head + format(cmyk) + begin + "1\t100", "", 4, "is damaged or cut off"},
        {table("SAMPLE_NAME\t" + cmyk + "\tSPOT_1", "1\tGrün\t0\t0\t0\t0\t10\n" + end), "", 4,
         "row 1 of the definition has lost"},
        {table(cmyk + "\tSPOT_1", "1\t0\t0\t0\t0\t9\n" + end), "", 5, "other colorants"},
    };
    for (const auto& [text, patches, exitCode, words] : cases) {
        SCOPED_TRACE(text);
        if (exitCode != 0)
            expectFailure(measure(crlf(text), virtualPrint), exitCode, words);
        else
            EXPECT_EQ(patchesText(measured(crlf(text), virtualPrint)), patches);
    }
}

TEST_F(MeasureTool, SpectraHaveTheColourMeasured) {
    const std::string steps[] = {"0", "50", "100"};
    std::vector<std::string> grid;
    for (int i = 0; i < 81; ++i)
        grid.push_back(steps[i / 27] + "\t" + steps[i / 9 % 3] + "\t" + steps[i / 3 % 3] + "\t" +
                       steps[i % 3]);
    const colour::DataSet set =
        measured(definitionOf(grid), virtualPrint + "spectra = yes\nerror = 1\n");
    ASSERT_EQ(set.axis.base, 380);
    ASSERT_EQ(set.axis.step, 10);
    ASSERT_EQ(set.axis.length, 36);
    const colour::SpectralWeights weights(set.axis);
    for (std::size_t i = 0; i < grid.size(); ++i) {
        const double* const spectrum = &set.spectra[36 * i];
        EXPECT_LE(colour::deltaE76(colour::labFromXyz(weights.xyz(spectrum)), set.lab[i]), 0.001);
        const auto [least, most] = std::minmax_element(spectrum, spectrum + 36);
        EXPECT_GT(*least, 0);
        EXPECT_LT(*most, 1);
    }
}

TEST_F(MeasureTool, ErrorsHaveTheirSizeAndCanBeRepeated) {
    const std::string definition = definitionOf(std::vector<std::string>(4000, "20\t15\t15\t0"));
    const colour::Lab printed = measured(definition, virtualPrint).lab[0];
    const std::string settings = virtualPrint + "error = 2\nbias = 1 -2 0.5\n";
    const colour::DataSet set = measured(definition, settings);
    double size = 0;
    for (const colour::Lab& lab : set.lab)
        size += colour::deltaE76(lab, {printed.L + 1, printed.a - 2, printed.b + 0.5}) / 4000;
    EXPECT_NEAR(size, 2, 0.06);
    EXPECT_THAT(set.instrumentation, HasSubstr("Virtual")); // Nobody is to take it for real.

    const auto last = [&](const std::string& more) {
        return measured(definition, settings + more).lab.back().a;
    };
    EXPECT_EQ(last("spectra = yes\nseed = 1\n"), set.lab.back().a);
    EXPECT_NE(last("seed = 2\n"), set.lab.back().a);
}

TEST_F(MeasureTool, HandsOverAnExportOfThesePatches) {
    const std::string definition =
        crlf(head + format(cmyk + "\tSAMPLE_NAME") + "DEVICE 33\n" + begin +
             "1\t100\t0\t0\t0\tA1\n2\t40\t27\t27\t0\tA2\n3\t0\t0\t0\t0\tA3\n"
             "4\t0\t0\t0\t0\tA4\n" +
             end);
    const std::string lab = "LAB_L\tLAB_A\tLAB_B";
    const std::string labels = "CGATS.17\n" + format(lab) + begin;
    const std::string made = "CGATS.17\nINSTRUMENTATION \"i9\"\nMEASUREMENT_CONDITION \"M1\"\n" +
                             format(cmyk + "\t" + lab) + begin;
    const std::string two = "1 100 0 0 0 55 -37 -50\n2 40 27 27 0 60 1 2\n";
    const std::string whites = "3 0 0 0 0 95 0 -2\n4 0 0 0 0 95 0 -3\n";
    const struct {
        const char* what;
        std::string text;
        int exitCode = 0;
        const char* words = "";
    } cases[] = {
        {"in another order", made + whites + two + end},
        {"numbered anew, rounded",
         made + "11 100 0 0 0 55 -37 -50\n12 39.6 27.4 27 0 60 1 2\n" + whites + end},
        {"ids that are names here",
         labels + "A4 95 0 -3\nA1 55 -37 -50\nA2 60 1 2\nA3 95 0 -2\n" + end},
        {"two too few", made + two + end, 8, "2 patches where 4"},
        {"another patch", made + "1 100 0 0 0 55 -37 -50\n2 40 27 29 0 60 1 2\n" + whites + end, 8,
         "patch 2 should be 40 27 27 0, and row 2 is 40 27 29 0"},
        {"other ids", labels + "4 95 0 -3\n1 55 -37 -50\n2 60 1 2\n5 95 0 -2\n" + end, 8,
         "there is no patch 3"},
        {"no colours", head + format(cmyk) + rows + end, 7, "holds no measured colours"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        m_folder.write("export.txt", c.text);
        // A relative path starts from the settings.
        const std::string settings = "instrument = file\nfile = export.txt\n";
        if (c.exitCode != 0) {
            expectFailure(measure(definition, settings), c.exitCode, c.words);
            continue;
        }
        const colour::DataSet set = measured(definition, settings);
        EXPECT_EQ(patchesText(set), "1: 100 0 0 0; 2: 40 27 27 0; 3: 0 0 0 0; 4: 0 0 0 0; ");
        std::vector<double> b;
        for (const colour::Lab& measuredLab : set.lab)
            b.push_back(measuredLab.b);
        EXPECT_THAT(b, testing::ElementsAre(-50, 2, -2, -3));
        EXPECT_EQ(set.conditions.measurement, c.text.starts_with(made) ? "M1" : "");
    }
    expectFailure(measure(definition, "instrument = file\nfile = missing\n"), 7, "is not there");
}

TEST_F(MeasureTool, WaitsForANewExport) {
    const std::string definition = definitionOf({"100\t0\t0\t0"});
    const std::string names = "CGATS.17\n" + format(cmyk + "\tLAB_L\tLAB_A\tLAB_B") + begin;
    const std::string path = m_folder.write("export.txt", names + "1 100 0 0 0 11 0 0\nEND_DATA\n");
    expectFailure(measure(definition, "instrument = file\nfile = export.txt\nwait = 1\n"), 7,
                  "was not exported in time");
    std::thread software([&] {
        std::this_thread::sleep_for(std::chrono::milliseconds(200));
        std::ofstream file(path);
        file << names << std::flush; // a slow one: it rests before it is done
        std::this_thread::sleep_for(std::chrono::milliseconds(700));
        file << "1 100 0 0 0 22 0 0\nEND_DATA\n";
    });
    const colour::DataSet set =
        measured(definition, "instrument = file\nfile = export.txt\nwait = 60\n");
    software.join();
    EXPECT_EQ(set.lab.at(0).L, 22);
}

TEST_F(MeasureTool, IsCancelledBySignals) {
    m_folder.write("definition.it8", definitionOf({paper}));
    expectFailure(
        support::run({"timeout", "--preserve-status", "0.5", MEASURE_TOOL, writeOptions()},
                     environmentWith(virtualPrint + "mishap = hang\n")),
        11, "cancelled");
}

TEST_F(MeasureTool, RefusesOptionsSettingsAndPlaces) {
    m_folder.write("definition.it8", definitionOf({paper}));
    const std::string options = support::contentsOf(writeOptions());
    const auto replaced = [&](const std::string& from, const std::string& to) {
        std::string text = options;
        return text.replace(text.find(from), from.size(), to);
    };
    const struct {
        std::string options;
        std::string settings;
        int exitCode;
        const char* words;
    } cases[] = {
        {replaced("-patch\n", "-parch\n"), virtualPrint, 2, "has no -patch"},
        {replaced("-o\n" + m_output, "-o\n" + m_folder.path("definition.it8")), virtualPrint, 2,
         "would replace"},
        {replaced("-o\n" + m_output, "-o\n" + m_folder.path("out")), virtualPrint, 9,
         "is no ordinary file"},
        {options, virtualPrint + "\nerror = 51", 3, "line 4 wants a number from 0 to 50 for error"},
        {options, virtualPrint + "\x1b[2J = yes", 3, "\"?[2J\", which"},
        {options, "instrument = virtual\nprofile = /usr/share/color/icc/sRGB.icc", 6, "for CMYK"},
    };
    for (const auto& c : cases) {
        const std::string path = m_folder.write("options", c.options);
        expectFailure(support::run({MEASURE_TOOL, path}, environmentWith(c.settings)), c.exitCode,
                      c.words);
    }
    EXPECT_EQ(support::contentsOf(m_folder.path("definition.it8")), definitionOf({paper}));
}

// One installation is a whole system root.
TEST_F(MeasureTool, IsInstalledWithItsSuite) {
    const support::SuiteRoot root("a root");
    ASSERT_EQ(support::run({CMAKE, "--install", TINTGATE_BINARY_DIR, "--component", "companions",
                            "--prefix", root.path()})
                  .exitCode,
              0);
    EXPECT_EQ(Helper::GetHWBInstallationPath(), root.path());
    __CFBundle* plugIn = nullptr;
    ComGUIModuleInterface** interface = nullptr;
    ComGUIManager manager;
    EXPECT_EQ(manager.RegisterPlugIn(&plugIn), 0);
    EXPECT_EQ(manager.CreateComGUIModuleInterface(plugIn, &interface), 0);
    EXPECT_TRUE(Helper::GetNerovaVerifyPath().FileExists());
    EXPECT_TRUE(Helper::GetNerovaMeasurePath(true).StartsWith(root.path()));
}

} // namespace
