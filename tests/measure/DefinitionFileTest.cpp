// SPDX-License-Identifier: Apache-2.0
// Definitions, byte for byte. "|" means the end of a line: "\n" in a strip, "\r\n" in the expected
// text.
#include <filesystem>
#include <set>
#include <string>
#include <tuple>
#include <utility>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "Utf16.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

std::string lines(std::string text, const std::string& end = "\r\n") {
    for (std::size_t at = 0; (at = text.find('|', at)) != text.npos; at += end.size()) {
        text.replace(at, 1, end);
    }
    return text;
}

const std::string head = "CGATS.17|ORIGINATOR \"Nerova Verify\"|";
const std::string lowRes = "KEYWORD LOWRES|LOWRES 0|KEYWORD ILLUMINATION_CONDITION|"
                           "ILLUMINATION_CONDITION 2|";
const std::string noDevice = head + "END_DATA_FORMAT|DEVICE 5|" + lowRes;
const std::string dynamic = "KEYWORD FORCE_LAB_CALCULATION|FORCE_LAB_CALCULATION 1|";
const std::string oneColumn = "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS 1|";

const std::string cmykWhite = "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00|";
const std::string rgbWhite = "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00|";

class DefinitionFile : public testing::Test {
  protected:
    DefinitionFile() {
        setenv("TMPDIR", m_folder.path().c_str(), 1);
        m_job.deviceID = 5;
        m_job.illuminationMode = 2;
    }

    /// Writes the definition of a strip. Returns whether it was written.
    bool define(const std::string& strip) {
        const std::string path = m_folder.write("strip.it8", lines(strip, "\n"));
        const wxString result =
            KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(path, &m_job);
        EXPECT_TRUE(result.empty() || result == m_definition);
        return !result.empty();
    }

    void expect(const std::string& strip, const std::string& definition) {
        EXPECT_TRUE(define(strip)) << strip;
        EXPECT_EQ(support::contentsOf(m_definition), lines(definition));
    }

    const support::ScratchFolder m_folder;
    const std::string m_definition = m_folder.path("NMPatchSetDefinition.it8");
    const std::string m_dcf = m_folder.path("NMPatchSetDefinition.dcf");
    KZJobDataStruct m_job;
};

TEST_F(DefinitionFile, TakesTheRowsOfAFixedStrip) {
    m_folder.write("NMPatchSetDefinition.it8", std::string(5000, 'x'));
    m_job.secondStrip = 1;
    m_job.useDynstrip = 1; // For the first strip only.
    m_job.deviceID = 21;
    // The character of two bytes shortens the second row.
    const std::string body =
        "ORIGINATOR \"me\"\t|KEYWORD \"DEVICE\"|DEVICE 21 \t|NUMBER_OF_FIELDS 8|"
        "NUMBER_OF_STRIPS 3|BORDER_PATCHES 1|VERTICAL_MEAS 0|NUMBER_OF_SETS 100|"
        "BEGIN_DATA_FORMAT|"
        "SAMPLE_ID\tCMYK_C|END_DATA_FORMAT||BEGIN_DATA|1\t0\t0\t0\t0|2\tä\t0|END_DATA|behind\t|";
    const std::string definition =
        head +
        "NUMBER_OF_FIELDS 8|BEGIN_DATA_FORMAT|SAMPLE_ID\tCMYK_C"
        "|END_DATA_FORMAT|KEYWORD\tDEVICE|DEVICE 21 |KEYWORD ZEBRA_RULER_MODE|ZEBRA_RULER_MODE 1|" +
        lowRes +
        "KEYWORD VERTICAL_MEAS|VERTICAL_MEAS 0|KEYWORD BORDER_PATCHES|BORDER_PATCHES 1|"
        "KEYWORD NUMBER_OF_STRIPS|NUMBER_OF_STRIPS 3|KEYWORD NUMBER_OF_SETS|NUMBER_OF_SETS 100|"
        "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS";
    const std::string rows = "|BEGIN_DATA|1\t0\t0\t0\t0|2|END_DATA|behind||";
    expect(body, definition + "\t33" + rows);
    expect("NUMBER_OF_COLS 40 |" + body, definition + " 40 " + rows);
}

TEST_F(DefinitionFile, IsUtf8WhateverTheStripIs) {
    const std::string strip = "DEVICE 21|NUMBER_OF_STRIPS 1|NUMBER_OF_COLS 1|BEGIN_DATA_FORMAT|"
                              "SAMPLE_ID|END_DATA_FORMAT|BEGIN_DATA|Grün|END_DATA|";
    ASSERT_TRUE(define(strip));
    const std::string expected = support::contentsOf(m_definition);
    for (const char* order : {"LE", "BE"}) {
        m_folder.write("strip.it8", support::utf16(lines(strip), order));
        EXPECT_EQ(KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(
                      m_folder.path("strip.it8"), &m_job),
                  m_definition);
        EXPECT_EQ(support::contentsOf(m_definition), expected);
    }
}

TEST_F(DefinitionFile, TellsEachInstrumentWhatItNeeds) {
    const std::string mode = "KEYWORD DEVICEMODE|DEVICEMODE 0|KEYWORD POSITIONING|POSITIONING 0|"
                             "KEYWORD MEASURINGTYPE|MEASURINGTYPE 2|"
                             "KEYWORD APERTURESIZE|APERTURESIZE ";
    const std::pair<std::string, std::set<int>> needs[] = {
        {mode + "6|", {33}},
        {mode + "2|", {28, 29, 31, 32, 43}},
        {"KEYWORD ZEBRA_RULER_MODE|ZEBRA_RULER_MODE 1|", {21, 22, 48, 49, 50}}};
    for (int device = 20; device <= 51; ++device) {
        std::string wanted;
        for (const auto& [lines, devices] : needs) {
            wanted += devices.contains(device) ? lines : "";
        }
        m_job.deviceID = device;
        expect("NUMBER_OF_COLS 1", head + "END_DATA_FORMAT|DEVICE " + std::to_string(device) + "|" +
                                       wanted + lowRes + oneColumn);
    }
}

TEST_F(DefinitionFile, FillsADynamicStrip) {
    m_job.useDynstrip = 1;
    const std::tuple<std::string, int, std::string, std::string> cases[] = {
        {"CMYK_C", 83, "END_DATA|behind|", cmykWhite},
        {"RGB_R RGB_B", 99, "END_DATA|", cmykWhite},
        {"RGB_R\tRGB_G\tRGB_B", 101, "END_DATA|", rgbWhite},
        {"RGB_R\tRGB_G\tRGB_B", 98, "", rgbWhite}, // The empty line after it counts as a row.
    };
    for (const auto& [fields, count, end, white] : cases) {
        std::string rows;
        for (int row = 1; row <= count; ++row) {
            rows += std::to_string(row) + " x|";
        }
        std::string filled = rows + (end.empty() ? "|" : "");
        for (int row = count + (end.empty() ? 2 : 1); row <= 100; ++row) {
            filled += std::to_string(row) + white;
        }
        expect("DEVICE 21|NUMBER_OF_STRIPS 5|NUMBER_OF_COLS\t20|NUMBER_OF_SETS 83|"
               "BEGIN_DATA_FORMAT|" +
                   fields + "|END_DATA_FORMAT|BEGIN_DATA|" + rows + end,
               head + "BEGIN_DATA_FORMAT|" + fields +
                   "|END_DATA_FORMAT|KEYWORD\tDEVICE|DEVICE 21|" + lowRes + dynamic +
                   "KEYWORD NUMBER_OF_STRIPS|NUMBER_OF_STRIPS 5|"
                   "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS\t20|"
                   "KEYWORD NUMBER_OF_SETS|NUMBER_OF_SETS\t100|BEGIN_DATA|" +
                   filled + "END_DATA");
    }
}

TEST_F(DefinitionFile, LeavesOutWhatIsMissing) {
    const std::pair<std::string, std::string> cases[] = {
        {"NUMBER_OF_COLS 1|BEGIN_DATA|1|END_DATA|", noDevice + oneColumn},
        // BEGIN_DATA before the format is ignored.
        {"NUMBER_OF_COLS 1|BEGIN_DATA|0|END_DATA_FORMAT|BEGIN_DATA|1",
         noDevice + oneColumn + "BEGIN_DATA|1||"},
        // Strips may have any encoding, definitions are UTF-8: this line loses two bytes.
        {"\xef\xbb\xbf€ BORDER_PATCHES 1\rNUMBER_OF_COLS 1\r",
         noDevice + "KEYWORD BORDER_PATCHES|€ BORDER_PATCHES|" + oneColumn},
    };
    for (const auto& [strip, definition] : cases) {
        expect(strip, definition);
    }
}

TEST_F(DefinitionFile, EndsWhereTheSizeIsUnknown) {
    const std::pair<int, std::string> failures[] = {
        {0, "NUMBER_OF_STRIPS 0|NUMBER_OF_SETS 100|"},
        {0, "NUMBER_OF_STRIPS3|NUMBER_OF_SETS 100|"}, // The number must follow a separator.
        {0, "NUMBER_OF_STRIPS 1|NUMBER_OF_SETS 1000001|"},
        {1, "NUMBER_OF_STRIPS 9223372036854775807|NUMBER_OF_COLS 9223372036854775807|"},
        {1, "NUMBER_OF_STRIPS -3|NUMBER_OF_SETS 9|"},
    };
    for (const auto& [useDynstrip, strip] : failures) {
        m_job.useDynstrip = useDynstrip;
        EXPECT_FALSE(define(strip + "iSis_INFO|")) << strip;
        EXPECT_FALSE(support::exists(m_dcf));
    }
    // The lines up to the failure remain.
    EXPECT_EQ(support::contentsOf(m_definition),
              lines(noDevice + dynamic + "KEYWORD NUMBER_OF_STRIPS|NUMBER_OF_STRIPS -3|"));
    const std::string missing = m_folder.path("missing");
    EXPECT_EQ(KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(missing, &m_job), "");
}

TEST_F(DefinitionFile, GivesSomeInstrumentsAHeadOfItsOwn) {
    const std::pair<const char*, const char*> cases[] = {
        {"NUMBER_OF_COLS 1|File_Format=Other|", "the server's own"},
        {"NUMBER_OF_COLS 1|#iSis_INFO\t|NUMBER_OF_FIELDS|x", "NUMBER_OF_COLS 1|#iSis_INFO|"},
        {"File_Format=BARBIERI||NUMBER_OF_COLS 1|SAMPLE_NAME x",
         "File_Format=BARBIERI||NUMBER_OF_COLS 1|"},
        {"iSis_INFO|NUMBER_OF_COLS 1|", "iSis_INFO|NUMBER_OF_COLS 1||"},
    };
    for (const auto& [strip, expected] : cases) {
        m_folder.write("NMPatchSetDefinition.dcf", "the server's own");
        EXPECT_TRUE(define(strip));
        EXPECT_EQ(support::contentsOf(m_dcf), lines(expected)) << strip;
    }
}

// An old definition may be a symbolic link; the file that it points to must not change.
TEST_F(DefinitionFile, TakesThePlaceOfALink) {
    const std::string other = m_folder.write("other", "kept");
    std::filesystem::create_symlink(other, m_definition);
    EXPECT_TRUE(define("NUMBER_OF_COLS 1"));
    EXPECT_EQ(support::contentsOf(other), "kept");
}

} // namespace
