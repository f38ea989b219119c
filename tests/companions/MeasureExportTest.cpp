// SPDX-License-Identifier: Apache-2.0
// Runs of the measuring tool with exports of an instrument's own software.
#include <chrono>
#include <filesystem>
#include <fstream>
#include <regex>
#include <string>
#include <thread>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "MeasureRuns.h"
#include "Utf16.h"

namespace {

using namespace measuretool;

TEST_F(MeasureTool, HandsOverAnExportOfThesePatches) {
    const std::string definition = crlf(
        head + format(cmyk + "\tSAMPLE_NAME") + "DEVICE 33\nILLUMINATION_CONDITION 1\n" + begin +
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
        {"numbers with zeros",
         made + "0001 100 0 0 0 55 -37 -50\n0002 40 27 27 0 60 1 2\n" + whites + end},
        {"in another order", made + whites + two + end},
        {"numbered anew, rounded",
         made + "11 100 0 0 0 55 -37 -50\n12 39.6 27.4 27 0 60 1 2\n" + whites + end},
        {"ids that are names here",
         labels + "A4 95 0 -3\nA1 55 -37 -50\nA2 60 1 2\nA3 95 0 -2\n" + end},
        {"two too few", made + two + end, 8, "2 patches, but 4"},
        {"another patch", made + "1 100 0 0 0 55 -37 -50\n2 40 27 29 0 60 1 2\n" + whites + end, 8,
         "patch 2 should be 40 27 27 0, and row 2 is 40 27 29 0"},
        {"another patch among rounded ones",
         made +
             "1 99.6 0 0 0 55 -37 -50\n2 40 27 29 0 60 1 2\n3 0 0 0 0.4 9 0 0\n4 0 0 0 0 9 0 0\n" +
             end,
         8, "patch 2 should be 40 27 27 0, and row 2 is 40 27 29 0"},
        {"another patch in another order",
         made + "2 40 27 29 0 60 1 2\n" + whites + "1 100 0 0 0 55 -37 -50\n" + end, 8,
         "no patch 2, which is 40 27 27 0, and row 1, which is 40 27 29 0, was not requested"},
        {"another patch among rounded ones in another order",
         made + "2 40 27 29 0 60 1 2\n" + whites + "1 99.7 0 0 0 55 -37 -50\n" + end, 8,
         "no patch 2, which is 40 27 27 0, and row 1, which is 40 27 29 0, was not requested"},
        {"rounded and in another order",
         made + "2 40.4 27 27 0 60 1 2\n" + whites + "1 100 0 0 0 55 -37 -50\n" + end, 8,
         "in another order and their device values are rounded"},
        {"other ids", labels + "4 95 0 -3\n1 55 -37 -50\n2 60 1 2\n5 95 0 -2\n" + end, 8,
         "there is no patch 3"},
        {"ids that any strip has", labels + "4 95 0 -3\n1 55 -37 -50\n2 60 1 2\n3 95 0 -2\n" + end,
         8, "only the ids 1 to 4 identify the patches"},
        {"another condition",
         made.substr(0, made.find("M1")) + "M2" + made.substr(made.find("M1") + 2) + two + whites +
             end,
         12, "was measured under M2, but the job requires M1"},
        {"no colours", head + format(cmyk) + rows + end, 7, "has no measured colours"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const bool wide = std::string(c.what) == "in another order";
        m_folder.write("export.txt", wide ? support::utf16(c.text, "LE") : c.text);
        // A relative path is relative to the settings file.
        const std::string settings = "instrument = file\nfile = export.txt\n";
        if (c.exitCode != 0) {
            expectFailure(measure(definition, settings), c.exitCode, c.words);
            continue;
        }
        const colour::DataSet set = measured(definition, settings);
        EXPECT_EQ(patchesText(set), "1: 100 0 0 0; 2: 40 27 27 0; 3: 0 0 0 0; 4: 0 0 0 0; ");
        std::vector<double> b;
        for (const colour::Lab& measuredLab : set.lab) {
            b.push_back(measuredLab.b);
        }
        EXPECT_THAT(b, testing::ElementsAre(-50, 2, -2, -3));
        const bool states = c.text.starts_with(made);
        EXPECT_EQ(set.conditions.measurement, states ? "M1" : "");
        EXPECT_EQ(m_log.find("does not state its measurement condition") == m_log.npos, states);
    }
    // From an export with several conditions, takes the one that the job requires.
    const auto object = [](const char* cyan, const char* condition, const char* L) {
        return std::string("<Object Id='1'><DeviceColorValues><ColorCMYK><Cyan>") + cyan +
               "</Cyan><Magenta>0</Magenta><Yellow>0</Yellow><Black>0</Black></ColorCMYK>"
               "</DeviceColorValues><ColorValues><ColorCIELab ColorSpecification='" +
               condition + "'><L>" + L +
               "</L><A>1</A><B>2</B></ColorCIELab></ColorValues></Object>";
    };
    const auto measuredUnder = [](const char* id, const char* light) {
        return std::string("<ColorSpecification Id='") + id +
               "'><MeasurementSpec><Device><DeviceIllumination>" + light +
               "</DeviceIllumination></Device></MeasurementSpec></ColorSpecification>";
    };
    m_folder.write("export.cxf", "<CxF xmlns='http://colorexchangeformat.com/CxF3-core'><Resources>"
                                 "<ObjectCollection>" +
                                     object("100", "m0", "55") + object("100", "m2", "56") +
                                     "</ObjectCollection><ColorSpecificationCollection>" +
                                     measuredUnder("m0", "M0_Incandescent") +
                                     measuredUnder("m2", "M2_UVExcluded") +
                                     "</ColorSpecificationCollection></Resources></CxF>");
    for (const auto& [number, L] : {std::pair{"2", 56}, std::pair{"0", 55}}) {
        const std::string one = crlf(head + format(cmyk) + "DEVICE 33\nILLUMINATION_CONDITION " +
                                     number + "\n" + begin + "1\t100\t0\t0\t0\n" + end);
        const colour::DataSet set = measured(one, "instrument = file\nfile = export.cxf\n");
        EXPECT_EQ(set.lab[0].L, L);
        EXPECT_EQ(set.conditions.measurement, std::string("M") + number);
    }
    // Permitted by the settings, or not specified by the definition.
    m_folder.write("export.txt",
                   labels + "0004 95 0 -3\n0001 55 -37 -50\n0002 60 1 2\n3 95 0 -2\n" + end);
    EXPECT_EQ(measured(definition, "instrument = file\nfile = export.txt\nmatch = ids\n").lab[3].b,
              -3);
    const std::string anyCondition =
        std::regex_replace(definition, std::regex("CONDITION 1"), "CONDITION -1");
    m_folder.write("export.txt",
                   std::regex_replace(made, std::regex("M1"), "M3") + two + whites + end);
    EXPECT_EQ(measured(anyCondition, "instrument = file\nfile = export.txt\n").patchCount, 4u);
    expectFailure(measure(definition, "instrument = file\nfile = missing\n"), 7, "does not exist");
    expectFailure(measure(definition, "instrument = file\nfile = missing/export\nwait = 600\n"), 7,
                  "missing, the folder of the export, can't be used: No such file");
}

TEST_F(MeasureTool, WaitsForANewExport) {
    const std::string definition = definitionOf({"100\t0\t0\t0"});
    const std::string names = "CGATS.17\n" + format(cmyk + "\tLAB_L\tLAB_A\tLAB_B") + begin;
    const std::string wrong = names + "1 99 0 0 0 33 0 0\nEND_DATA\n";
    const std::string path = m_folder.write("export.txt", names + "1 100 0 0 0 11 0 0\nEND_DATA\n");
    const std::string settings = "instrument = file\nfile = export.txt\n";
    const auto after = [](int time, auto act) {
        return std::jthread([=] {
            std::this_thread::sleep_for(std::chrono::milliseconds(time));
            act();
        });
    };
    expectFailure(measure(definition, settings + "wait = 1\n"), 7, "was not exported in time");
    {
        // First another strip, then a slow program whose file pauses before it is complete.
        const auto first = after(200, [=, this] { m_folder.write("export.txt", wrong); });
        const auto second = after(1500, [=] {
            std::ofstream file(path);
            file << names << std::flush;
            std::this_thread::sleep_for(std::chrono::milliseconds(700));
            file << "1 100 0 0 0 22 0 0\nEND_DATA\n";
        });
        EXPECT_EQ(measured(definition, settings + "wait = 60\n").lab.at(0).L, 22);
        EXPECT_THAT(m_log,
                    testing::ContainsRegex("Waiting for .*export.txt, until 2.*\n.*Not "
                                           "accepted: .*patch 1, which is 100 0 0 0, and row "
                                           "1, which is 99 0 0 0, was not requested\n$"));
    }
    {
        const auto other = after(200, [=, this] { m_folder.write("export.txt", wrong + "\n"); });
        expectFailure(measure(definition, settings + "wait = 2\n"), 8,
                      "was not requested; no other export arrived in time");
    }
    // The time limit also works while a read of the export blocks.
    const std::string pipe = m_folder.path("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    const int silent = open(pipe.c_str(), O_RDWR | O_CLOEXEC);
    const auto blocked = after(200, [=] { std::filesystem::rename(pipe, path); });
    expectFailure(measure(definition, settings + "wait = 2\n"), 7, "was not exported in time");
    close(silent);
}

} // namespace
