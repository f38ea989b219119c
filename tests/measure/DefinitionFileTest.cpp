// Definitions to the byte. "|" stands for the end of a line: "\r\n" in what is expected.
#include <filesystem>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

namespace fs = std::filesystem;

std::string lines(const std::string& text, const std::string& end = "\r\n") {
    std::string ended;
    for (const char character : text) {
        ended += character == '|' ? end : std::string(1, character);
    }
    return ended;
}

const std::string head = "CGATS.17|ORIGINATOR \"Nerova Verify\"|";
const std::string lowRes = "KEYWORD LOWRES|LOWRES 0|KEYWORD ILLUMINATION_CONDITION|"
                           "ILLUMINATION_CONDITION 2|";
const std::string noDevice = head + "END_DATA_FORMAT|DEVICE 5|" + lowRes;
const std::string dynamic = "KEYWORD FORCE_LAB_CALCULATION|FORCE_LAB_CALCULATION 1|";

const std::string cmykFields =
    "SAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLAB_L\tLAB_A\tLAB_B\tXYZ_X\tXYZ_Y\tXYZ_Z";
const std::string rgbFields =
    "SAMPLE_ID\tRGB_R\tRGB_G\tRGB_B\tLAB_L\tLAB_A\tLAB_B\tXYZ_X\tXYZ_Y\tXYZ_Z";
const std::string cmykWhite = "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00|";
const std::string rgbWhite = "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00|";

class DefinitionFile : public testing::Test {
  protected:
    DefinitionFile() {
        setenv("TMPDIR", m_folder.path().c_str(), 1);
        m_job.deviceID = 5;
        m_job.illuminationMode = 2;
    }

    /// Of a strip, or "none" where the result is empty. The file is read whatever the result.
    std::string define(const std::string& strip) {
        const std::string path = m_folder.write("strip.it8", strip);
        const wxString result =
            KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(path, &m_job);
        EXPECT_EQ(result, result.empty() ? "" : m_definition);
        m_failed = result.empty();
        return support::contentsOf(m_definition);
    }

    void expect(const std::string& strip, const std::string& definition) {
        EXPECT_EQ(define(strip), lines(definition));
        EXPECT_FALSE(m_failed) << strip;
        if (strip.find("DEVICE 21") != strip.npos) {
            wxString name;
            EXPECT_EQ(getDeviceNameFromIt8ControlStripFile(m_definition, &name), 0);
            EXPECT_EQ(name, GetInstrumentNameFromID(21));
        }
    }
    const support::ScratchFolder m_folder;
    const std::string m_definition = m_folder.path("NMPatchSetDefinition.it8");
    const std::string m_dcf = m_folder.path("NMPatchSetDefinition.dcf");
    KZJobDataStruct m_job;
    bool m_failed = false;
};

TEST_F(DefinitionFile, TakesTheRowsOfAFixedStrip) {
    m_folder.write("NMPatchSetDefinition.it8", std::string(5000, 'x'));
    m_job.secondStrip = 1;
    m_job.useDynstrip = 1; // Of the first strip alone.
    m_job.deviceID = 21;
    // The second row has one byte too many, so that it loses its end.
    const std::string body = lines(
        "ORIGINATOR \"me\"\t|KEYWORD \"DEVICE\"|DEVICE 21 \t|NUMBER_OF_FIELDS 11|"
        "NUMBER_OF_STRIPS 3|BORDER_PATCHES 1|VERTICAL_MEAS 0|NUMBER_OF_SETS 100|"
        "BEGIN_DATA_FORMAT|" +
            cmykFields + "|END_DATA_FORMAT||BEGIN_DATA|1\t0\t0\t0\t0|2\tä\t0|END_DATA|behind\t|",
        "\n");
    const auto definition = [](const std::string& size) {
        return head + "NUMBER_OF_FIELDS 11|BEGIN_DATA_FORMAT|" + cmykFields +
               "|END_DATA_FORMAT|KEYWORD\tDEVICE|DEVICE 21 |"
               "KEYWORD ZEBRA_RULER_MODE|ZEBRA_RULER_MODE 1|" +
               lowRes +
               "KEYWORD VERTICAL_MEAS|VERTICAL_MEAS 0|"
               "KEYWORD BORDER_PATCHES|BORDER_PATCHES 1|KEYWORD NUMBER_OF_STRIPS|"
               "NUMBER_OF_STRIPS 3|KEYWORD NUMBER_OF_SETS|NUMBER_OF_SETS 100|"
               "KEYWORD NUMBER_OF_COLS|" +
               size + "|BEGIN_DATA|1\t0\t0\t0\t0|2|END_DATA|behind||";
    };
    expect(body, definition("NUMBER_OF_COLS\t33"));
    expect("NUMBER_OF_COLS 40 \r\n" + body, definition("NUMBER_OF_COLS 40 "));
}

TEST_F(DefinitionFile, TellsEachInstrumentWhatItNeeds) {
    const std::string mode = "KEYWORD DEVICEMODE|DEVICEMODE 0|KEYWORD POSITIONING|POSITIONING 0|"
                             "KEYWORD MEASURINGTYPE|MEASURINGTYPE 2|";
    const std::string aperture = "KEYWORD APERTURESIZE|APERTURESIZE ";
    const std::string zebra = "KEYWORD ZEBRA_RULER_MODE|ZEBRA_RULER_MODE 1|";
    const std::pair<std::string, std::set<int>> needs[] = {
        {mode + aperture + "6|", {33}},
        {mode + aperture + "2|", {28, 29, 31, 32, 43}},
        {zebra, {21, 22, 48, 49, 50}}};
    for (int device = -1; device <= 60; ++device) {
        std::string wanted;
        for (const auto& [lines, devices] : needs) {
            wanted += devices.contains(device) ? lines : "";
        }
        m_job.deviceID = device;
        expect("NUMBER_OF_COLS", head + "END_DATA_FORMAT|DEVICE " + std::to_string(device) + "|" +
                                     wanted + lowRes + "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS|");
    }
    // Without a KEYWORD line the analysis still finds it.
    wxString name;
    EXPECT_EQ(getDeviceNameFromIt8ControlStripFile(m_definition, &name), 0);
    EXPECT_EQ(name, GetInstrumentNameFromID(60));
}

TEST_F(DefinitionFile, FillsADynamicStrip) {
    m_job.useDynstrip = 1;
    const auto rows = [](int from, int to, const std::string& rest) {
        std::string text;
        for (int row = from; row <= to; ++row) {
            text += std::to_string(row) + rest;
        }
        return text;
    };
    const std::string start = "DEVICE 21\nNUMBER_OF_STRIPS 5\nNUMBER_OF_COLS\t20\n"
                              "NUMBER_OF_SETS 83\nBEGIN_DATA_FORMAT\n";
    const auto definition = [](const std::string& fields) {
        return head + "BEGIN_DATA_FORMAT|" + fields +
               "|END_DATA_FORMAT|KEYWORD\tDEVICE|DEVICE 21|" + lowRes + dynamic +
               "KEYWORD NUMBER_OF_STRIPS|NUMBER_OF_STRIPS 5|"
               "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS\t20|"
               "KEYWORD NUMBER_OF_SETS|NUMBER_OF_SETS\t100|BEGIN_DATA|";
    };
    const std::string format = "\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    expect(start + cmykFields + format + rows(1, 83, " x\n") + "END_DATA\nbehind\n",
           definition(cmykFields) + rows(1, 83, " x|") + rows(84, 100, cmykWhite) + "END_DATA");
    expect(start + rgbFields + format + rows(1, 98, " x\n") + "END_DATA\n",
           definition(rgbFields) + rows(1, 98, " x|") + rows(99, 100, rgbWhite) + "END_DATA");
    expect(start + "RGB_R RGB_B" + format + rows(1, 99, " x\n") + "END_DATA\n",
           definition("RGB_R RGB_B") + rows(1, 99, " x|") + "100" + cmykWhite + "END_DATA");
    expect(start + rgbFields + format + rows(1, 101, " x\n") + "END_DATA\n",
           definition(rgbFields) + rows(1, 101, " x|") + "END_DATA");
    // Without an end the empty line behind the last one counts as a row.
    expect(start + rgbFields + format + rows(1, 98, " x\n"),
           definition(rgbFields) + rows(1, 98, " x|") + "|100" + rgbWhite + "END_DATA");
}

TEST_F(DefinitionFile, LeavesOutWhatIsMissing) {
    const std::string size = "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS 1|";
    const std::string before = "NUMBER_OF_COLS 1\n";
    expect(before, noDevice + size);
    expect(before + "BEGIN_DATA\n1\nEND_DATA\n", noDevice + size);
    expect(before + "END_DATA_FORMAT\n1\nEND_DATA\n", noDevice + size);
    expect(before + "BEGIN_DATA_FORMAT",
           head + "BEGIN_DATA_FORMAT||END_DATA_FORMAT|DEVICE 5|" + lowRes + size);
    // What stands in front of the format is no data.
    expect(before + "BEGIN_DATA\n0\nEND_DATA_FORMAT\nBEGIN_DATA\n1",
           noDevice + size + "BEGIN_DATA|1||");
    m_job.useDynstrip = 1;
    expect("NUMBER_OF_STRIPS 1\nNUMBER_OF_COLS 2",
           noDevice + dynamic +
               "KEYWORD NUMBER_OF_STRIPS|NUMBER_OF_STRIPS 1|KEYWORD NUMBER_OF_COLS|"
               "NUMBER_OF_COLS 2|KEYWORD NUMBER_OF_SETS|NUMBER_OF_SETS\t2|1" +
               cmykWhite + "2" + cmykWhite + "END_DATA");
}

TEST_F(DefinitionFile, EndsWhereTheSizeIsUnknown) {
    const struct {
        int useDynstrip;
        std::vector<std::string> strip; ///< Lines that reach the definition.
    } failures[] = {
        {0, {"NUMBER_OF_STRIPS 3"}},
        {0, {"NUMBER_OF_SETS 100"}},
        {0, {"NUMBER_OF_STRIPS 0", "NUMBER_OF_SETS 100"}},
        {0, {"NUMBER_OF_STRIPS 3 ", "NUMBER_OF_SETS 100"}}, // No whole number.
        {0, {"NUMBER_OF_STRIPS3", "NUMBER_OF_SETS 100"}},   // It starts behind a separator.
        {0, {"NUMBER_OF_STRIPS 3", "NUMBER_OF_SETS 1e2"}},
        {0, {"NUMBER_OF_STRIPS 1", "NUMBER_OF_SETS 1000001"}},
        {1, {"NUMBER_OF_STRIPS 3"}},
        {1, {"NUMBER_OF_STRIPS -3", "NUMBER_OF_COLS -3"}},
        {1, {"NUMBER_OF_STRIPS 1001", "NUMBER_OF_COLS 1000"}},
        {1, {"NUMBER_OF_STRIPS 9223372036854775807", "NUMBER_OF_COLS 9223372036854775807"}},
        // The first line with the word counts, and this one has no number.
        {1, {"NUMBER_OF_STRIPS KEYWORD\nNUMBER_OF_STRIPS 5", "NUMBER_OF_COLS 20"}},
    };
    for (const auto& failure : failures) {
        m_job.useDynstrip = failure.useDynstrip;
        std::string strip;
        std::string definition = noDevice + (m_job.useDynstrip == 1 ? dynamic : "");
        for (const std::string& line : failure.strip) {
            strip += line + "\n";
            definition += "KEYWORD " + line.substr(0, line.find_first_of(" 3")) + "|" +
                          line.substr(0, line.find('\n')) + "|";
        }
        EXPECT_EQ(define(strip + "iSis_INFO\n"), lines(definition));
        EXPECT_TRUE(m_failed) << strip;
        EXPECT_FALSE(support::exists(m_dcf));
    }
    fs::remove(m_definition);
    const std::string missing = m_folder.path("missing");
    EXPECT_EQ(KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(missing, &m_job), "");
    EXPECT_FALSE(support::exists(m_definition));
}

TEST_F(DefinitionFile, GivesSomeInstrumentsAHeadOfItsOwn) {
    const struct {
        const char* strip;
        const char* expected; ///< Null: the old one stays.
    } cases[] = {
        {"NUMBER_OF_COLS 1\nFile_Format=Other\n", nullptr},
        {"NUMBER_OF_COLS 1\n#iSis_INFO\t\nNUMBER_OF_FIELDS\nx", "NUMBER_OF_COLS 1|#iSis_INFO|"},
        {"File_Format=BARBIERI\n\nNUMBER_OF_COLS 1\nSAMPLE_NAME x",
         "File_Format=BARBIERI||NUMBER_OF_COLS 1|"},
        {"BEGIN_DATA_FORMAT\niSis_INFO\nNUMBER_OF_COLS 1", ""},
        {"iSis_INFO\nNUMBER_OF_COLS 1\n", "iSis_INFO|NUMBER_OF_COLS 1||"},
    };
    for (const auto& [strip, expected] : cases) {
        m_folder.write("NMPatchSetDefinition.dcf", "the server's own");
        define(strip);
        EXPECT_EQ(support::contentsOf(m_dcf),
                  expected == nullptr ? "the server's own" : lines(expected))
            << strip;
    }
}

TEST_F(DefinitionFile, ReadsWhatThereIsAndWritesUtf8) {
    const std::string size = "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS 1|";
    const std::string euro = noDevice + "KEYWORD BORDER_PATCHES|€ BORDER_PATCHES|" + size;
    expect("\xef\xbb\xbf€ BORDER_PATCHES 1\rNUMBER_OF_COLS 1\r", euro); // Short by two bytes.
    const std::u16string utf16 = u"\ufeff€ BORDER_PATCHES 1\r\nNUMBER_OF_COLS 1\r\n";
    expect({reinterpret_cast<const char*>(utf16.data()), 2 * utf16.size()}, euro);
    expect("\xe4 BORDER_PATCHES\nNUMBER_OF_COLS 1",
           noDevice + "KEYWORD BORDER_PATCHES|ä BORDER_PATCHE|" + size);
}

TEST_F(DefinitionFile, StandsBesideItsStrip) {
    KZVerifyJobProcessor processor;
    const std::string strip = "NUMBER_OF_COLS 7\n";
    const std::string expected = lines(noDevice + "KEYWORD NUMBER_OF_COLS|NUMBER_OF_COLS 7|");
    const auto define = [&](const std::string& path) {
        return wstringToString(
            processor.WriteTemporaryMeasurementDefinitionFile(stringToWstring(path), &m_job)
                .ToStdWstring());
    };
    // Without a folder, and in one whose name is not valid UTF-8.
    const std::string folder = m_folder.makeFolder("J\xf6rg.d");
    fs::current_path(folder);
    m_folder.write("J\xf6rg.d/strip", strip);
    EXPECT_EQ(define("strip"), "NMPatchSetDefinition.it8");
    EXPECT_EQ(support::contentsOf("NMPatchSetDefinition.it8"), expected);
    fs::remove("NMPatchSetDefinition.it8");
    EXPECT_EQ(define(folder + "/strip"), folder + "/NMPatchSetDefinition.it8");
    EXPECT_EQ(support::contentsOf("NMPatchSetDefinition.it8"), expected);
    fs::current_path("/");
    // A strip of the definition's own name gives way.
    m_folder.write("NMPatchSetDefinition.it8", strip);
    EXPECT_EQ(define(m_definition), m_definition);
    EXPECT_EQ(support::contentsOf(m_definition), expected);
    // The path is given whether or not it can be written to.
    fs::remove(m_definition);
    m_folder.makeFolder("NMPatchSetDefinition.it8/x");
    EXPECT_EQ(define(m_folder.write("strip", strip)), m_definition);
}

} // namespace
