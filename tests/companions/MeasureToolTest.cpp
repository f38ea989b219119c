// SPDX-License-Identifier: Apache-2.0
// Runs of the measuring tool with the virtual instrument, and refusals before the first patch.
#include <algorithm>
#include <chrono>
#include <string>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "MeasureRuns.h"
#include "RunProgram.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "SuiteRoot.h"
#include "Utf16.h"
#include "colour/Difference.h"
#include "colour/Spectra.h"
#include "measure/Helper.h"

namespace {

using namespace measuretool;
using testing::HasSubstr;

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
        // Multi-byte names, and none, in rows that are cut off.
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
        // Filling rows, with their own columns.
        {table("SAMPLE_NAME\tCMYK_K\tCMYK_C\tCMYK_M\tCMYK_Y\tSPOT_1",
               "1\tA1\t5\t100\t0\t0\t0\n2" + white + "3" + white + "END_DATA"),
         "1: 100 0 0 5 0; 2: 0 0 0 0 0; 3: 0 0 0 0 0; "},
        {table("RGB_R\tRGB_G\tRGB_B" + lab, "1\t0\t20\t100\t3\t0\t0\n2" + whiteRgb + "END_DATA"),
         "1: 0 20 100; 2: 100 100 100; "},
        // A strip supplied by a person is complete.
        {"CGATS.17\n" + format("SAMPLE_NAME\t" + cmyk) + begin + "1\tGröße\t100\t0\t0\t0\n" + end,
         "1: 100 0 0 0; "},
        {"", "", 4, "is neither"},
        {head + format(cmyk) + begin + "1\t100", "", 4, "is damaged or cut off"},
        {table("SAMPLE_NAME\t" + cmyk + "\tSPOT_1", "1\tGrün\t0\t0\t0\t0\t10\n" + end), "", 4,
         "row 1 of the definition may have lost"},
        {table("SAMPLE_NAME\tC\tM\tY\tK\tLAB_L", "1\tÄÖÜ\t0\t0\t0\t10\n" + end), "", 4,
         "row 1 of the definition may have lost"},
        {table(cmyk + "\tSPOT_485", "1\t0\t0\t0\t0\t9\n" + end), "", 5, "other colorants"},
        {table(cmyk, "1\t100\t0\t0\t0\n2\t0\t120\t0\t0\n" + end), "", 4,
         "row 2 of the definition has 120 for CMYK_M, which is above 100 percent"},
        // The last name may have been SPOT_485, or a column before other inks.
        {table("Größe\t" + cmyk + "\tLAB_L\tSPOT_4", "1\tx\t0\t0\t0\t0\t50\t20\n" + end), "", 4,
         "list of columns is cut off"},
        {table("Größe\t" + cmyk, "1\tx\t0\t0\t0\t0\n" + end), "", 4, "list of columns is cut off"},
        {table("CMYK_C\tCMYK_M\tCMYK_Y", "1\t0\t0\t0\t100\n" + end), "", 4,
         "more cells than there are column names"},
        {table(cmyk + "\tSPOT_1", "1\t0\t0\t0\t0\t9\n" + end), "", 5, "other colorants"},
    };
    for (const auto& [text, patches, exitCode, words] : cases) {
        SCOPED_TRACE(text);
        if (exitCode != 0) {
            expectFailure(measure(crlf(text), virtualPrint), exitCode, words);
        } else {
            EXPECT_EQ(patchesText(measured(crlf(text), virtualPrint)), patches);
        }
    }
    const std::string two = table(cmyk, "1\t100\t0\t0\t0\n2\t40\t27\t27\t0\n" + end);
    EXPECT_EQ(patchesText(measured(support::utf16(crlf(two), "BE"), virtualPrint)), simple);
}

TEST_F(MeasureTool, SpectraHaveTheColourMeasured) {
    const std::string steps[] = {"0", "50", "100"};
    std::vector<std::string> grid;
    for (int i = 0; i < 81; ++i) {
        grid.push_back(steps[i / 27] + "\t" + steps[i / 9 % 3] + "\t" + steps[i / 3 % 3] + "\t" +
                       steps[i % 3]);
    }
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
    for (const colour::Lab& lab : set.lab) {
        size += colour::deltaE76(lab, {printed.L + 1, printed.a - 2, printed.b + 0.5}) / 4000;
    }
    EXPECT_NEAR(size, 2, 0.06);
    EXPECT_THAT(set.instrumentation, HasSubstr("Virtual")); // Must not pass for a real one.

    const auto last = [&](const std::string& more) {
        return measured(definition, settings + more).lab.back().a;
    };
    EXPECT_EQ(last("spectra = yes\nseed = 1\n"), set.lab.back().a);
    EXPECT_NE(last("seed = 2\n"), set.lab.back().a);
}

TEST_F(MeasureTool, IsCancelledBySignals) {
    const std::string pipe = m_folder.path("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    // The pipe is open for writing, but nobody writes, as on a share with a lost server.
    const int silent = open(pipe.c_str(), O_RDWR | O_CLOEXEC);
    m_folder.write("definition.it8", definitionOf({paper}));
    const std::string options = support::contentsOf(writeOptions());
    std::string pipeOptions = options;
    const std::string definition = m_folder.path("definition.it8");
    pipeOptions.replace(pipeOptions.find(definition), definition.size(), pipe);
    const struct {
        const char* blocked;
        std::string options;
        std::string settings;
    } cases[] = {
        {"instrument", options, virtualPrint + "mishap = hang\n"},
        {"definition", pipeOptions, virtualPrint},
        {"profile", options, "instrument = virtual\nprofile = " + pipe + "\n"},
        {"export", options, "instrument = file\nfile = " + pipe + "\n"},
        {"settings", options, ""},
        {"options", "", virtualPrint},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.blocked);
        support::RunOptions run = environmentWith(c.settings);
        if (c.settings.empty()) {
            run.environment["TINTGATE_MEASURE"] = pipe;
        }
        const std::string path = c.options.empty() ? pipe : m_folder.write("options", c.options);
        const auto start = std::chrono::steady_clock::now();
        expectFailure(
            support::run({"timeout", "--preserve-status", "0.5", MEASURE_TOOL, path}, run), 11,
            "cancelled", !c.options.empty());
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
    }
    close(silent);
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
        {replaced("-o\n" + m_output, "-o\n" + m_folder.path("settings")), virtualPrint, 2,
         "would replace"},
        {replaced("-o\n" + m_output, "-o\n" + m_folder.path("out/../options")), virtualPrint, 2,
         "would replace"},
        {options, "instrument = file\nwait = 9\nfile = out/Measured sample.txt", 2,
         "would replace"},
        {replaced("-o\n" + m_output, "-o\n" + m_folder.path("out")), virtualPrint, 9,
         "is not a regular file"},
        {options, virtualPrint + "\nerror = 51", 3,
         "line 4 requires a number from 0 to 50 for error"},
        {options, "\xEF\xBB\xBF" + virtualPrint + "error = 51", 3, "line 3 requires"},
        {options, virtualPrint + "\x1b[2J\u009b = yes", 3, "\"?[2J?\", which"},
        {options, "instrument = virtual\nprofile = /usr/share/color/icc/sRGB.icc", 6,
         "not a CMYK profile"},
    };
    for (const auto& c : cases) {
        const std::string path = m_folder.write("options", c.options);
        expectFailure(support::run({MEASURE_TOOL, path}, environmentWith(c.settings)), c.exitCode,
                      c.words, c.options == options);
        EXPECT_EQ(support::contentsOf(path), c.options);
        EXPECT_EQ(support::contentsOf(m_folder.path("settings")), c.settings);
    }
    EXPECT_EQ(support::contentsOf(m_folder.path("definition.it8")), definitionOf({paper}));
}

TEST_F(MeasureTool, KeepsItsLogAndNobodyElsesFile) {
    const std::string definition = definitionOf({paper});
    const std::string fails = virtualPrint + "mishap = fail\n";
    const auto logAfter = [&](const std::string& before, const std::string& settings) {
        m_folder.write("out/NerovaMeasure.log", before);
        measure(definition, settings);
        takeResult();
        return m_log;
    };
    const std::string old = "2024-05-01T12:34:56Z Waiting for something\n";
    EXPECT_THAT(logAfter(old, fails),
                testing::MatchesRegex("20[^ ]*Z the instrument failed at patch 1, [^\n]*\n"));
    EXPECT_EQ(logAfter(old, virtualPrint), ""); // Nothing to report.
    for (const std::string& other :
         {std::string("CGATS.17\nand more than a time\n"), old.substr(1)}) {
        EXPECT_EQ(logAfter(other, fails), other);
    }
    // The measurement itself may have this name.
    std::string options = support::contentsOf(writeOptions());
    options.replace(options.find(m_output), m_output.size(), m_logPath);
    support::run({MEASURE_TOOL, m_folder.write("options", options)}, environmentWith(fails));
    EXPECT_FALSE(support::exists(m_logPath));
}

// One installation is a complete system root.
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
