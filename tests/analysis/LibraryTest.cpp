// SPDX-License-Identifier: Apache-2.0
#include "LibraryTest.h"

#include <cmath>
#include <filesystem>

#include <gmock/gmock.h>

#include "ExitCodes.h"
#include "RunProgram.h"

namespace {

using testing::DoubleNear;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

const std::string sets = "/usr/share/color/icc/";
const std::string fogra = sets + "FOGRA39L.ti3";
const std::string profile = sets + "ghostscript/default_cmyk.icc";
const std::string labNames = "LAB_L LAB_A LAB_B";
const std::string inksAndLab = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";

class Library : public LibraryTest {
  protected:
    Library() {
        preset.presetValues[0] = 4;
        preset.usedForResult[0] = 1;
        preset.decimalPlaces[0] = 1;
        preset.name = wxString(L"Paper \u00e4 \"7\"");
    }

    void expectSound(const std::string& schema, const std::vector<std::string>& texts) const {
        std::vector<std::string> command = {"python3",
                                            TINTGATE_SOURCE_DIR "/tests/analysis/audit.py",
                                            TINTGATE_SOURCE_DIR "/docs/" + schema};
        for (const std::string& text : texts) {
            command.push_back(scratch.write(std::to_string(command.size()) + ".json", text));
        }
        const support::Outcome outcome = support::run(command);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
    }
};

// ArgyllCMS pairs by sample id, this library by device values. In a single chart both are the same.
TEST_F(Library, AgreesWithColverifyToSixDecimals) {
    for (const auto& [target, measurement] :
         {std::pair{"FOGRA28L.ti3", "FOGRA30L.ti3"}, std::pair{"TR006.ti3", "FOGRA39L.ti3"}}) {
        for (const int formula : {0, 4}) {
            const support::Outcome peer = support::run(
                {"colverify", formula == 4 ? "-k" : "-v", sets + target, sets + measurement});
            preset.deltaEMode = formula;
            ASSERT_EQ(analyse(sets + target, sets + measurement), 0);
            char figures[80];
            std::snprintf(figures, sizeof figures, "peak = %.6f, avg = %.6f\n", results.values[6],
                          results.values[5]);
            EXPECT_THAT(peer.output, HasSubstr(figures)) << target << measurement;
        }
    }
}

TEST_F(Library, WritesSoundResults) {
    const std::string strip = scratch.path("strip \xff.txt"); // not valid in any system text
    std::filesystem::rename(chart("SAMPLE_NAME CMYK_C CMYK_M CMYK_Y CMYK_K",
                                  "Cyan 100 0 0 0\n\"Gr\xc3\xa4y\" 40 27 27 0\nOdd 13 0 0 77\n"),
                            strip);
    std::string zeros, ones; // 20 rows: the 19th is the 95th percentile
    for (int i = 0; i < 20; ++i) {
        zeros += "50 0 0\n";
        ones += std::to_string(50 + i * 0.1) + " 0 0\n";
    }
    const std::string source = "CGATS.17\nMEASUREMENT_SOURCE \"MeasurementCondition=";
    const std::string m0 = chart(labNames, zeros, source + "M0\"\n");
    const std::string m1 = chart(labNames, ones, source + "M1\"\n");
    const std::string few =
        chart(inksAndLab, "1 100 0 0 0 55 -36 -50\n2 40 27 27 0 60 0 0\n3 0 0 0 0 95 0 -2\n");
    const struct {
        std::string target, measurement, patchSet;
        int formula;
        const char* shows;
    } cases[] = {
        {fogra, sets + "TR002.ti3", "", 5, "\"unpairedTarget\": 755"},
        {sets + "TR002.ti3", fogra, "", 5, "\"patchesUnpaired\""},
        {profile, few, "", 2, "\"selection\": \"measurement\""},
        {profile, // has no fifth ink
         chart(inksAndLab + " SPOT_1", "1 100 0 0 0 55 -36 -50 0\n2 0 0 0 0 60 50 50 100\n"), "", 2,
         "\"unpairedMeasurement\": 1"},
        {few, profile, "", 3, "\"measurement\": \"profile\""},
        {profile, profile, strip, 4, "\"Gr\\u00e4y\""},
        {profile, profile, strip, 4, "\"sameFile\""},
        {few, profile, strip, 0, "\"unpairedPatchSet\": 1"},
        {m0, m1, "", 0, "\"pairedByOrder\""},
        {m0, m1, "", 0, "measurement conditions: M0 and M1."},
        {m0, few, "", 0, "\"deviceChannels\": [\"CMYK_C\","},
    };
    std::vector<std::string> texts;
    for (const auto& c : cases) {
        preset.deltaEMode = c.formula;
        EXPECT_EQ(analyse(c.target, c.measurement, c.patchSet, nullptr), 0);
        EXPECT_THAT(json, HasSubstr(c.shows));
        texts.push_back(json);
    }
    expectSound("result.schema.json", texts);
}

// If the ticket of a job has no device values, its strip has zeros instead.
TEST_F(Library, TakesNoNoticeOfDeviceValuesThatWereNeverFilledIn) {
    const std::string full = chart(inksAndLab, "1 0 0 0 0 95 0 0\n2 100 0 0 0 55 -36 -50\n");
    const std::string zeros = chart(inksAndLab, "2 0 0 0 0 55 -36 -50\n1 0 0 0 0 94 0 0\n");
    for (const auto& [target, measurement] : {std::pair(full, zeros), std::pair(zeros, full)}) {
        analyse(target, measurement);
        EXPECT_THAT(json, HasSubstr("deviceValuesIgnored"));
        EXPECT_EQ(results.values[4], 1); // paper
        EXPECT_EQ(results.values[0], 0); // solid cyan
    }
    analyse(zeros, zeros, "", nullptr);
    EXPECT_THAT(json, HasSubstr("\"measurement\": \"deviceValues\""));
}

TEST_F(Library, GivesOneCodeForOneCause) {
    const std::string lab = chart(labNames, "50 0 0\n");
    const std::string inks = chart("C M Y K", "9 9 9 9\n");
    const std::string other = chart(inksAndLab, "1 1 9 9 9 50 0 0\n");
    const std::string rgbProfile = sets + "ghostscript/srgb.icc";
    const std::string sameLab = scratch.path("copy");
    const std::string linkToLab = scratch.path("link");
    const std::string anotherProfile = scratch.path("copy.icc");
    std::filesystem::copy_file(lab, sameLab);
    std::filesystem::create_hard_link(lab, linkToLab);
    std::filesystem::copy_file(profile, anotherProfile);
    const struct {
        std::string target, measurement, patchSet;
        int status;
    } cases[] = {
        {scratch.path("none"), lab, "", exitInputMissing},
        {fogra, inks, "", exitNoColourValues},
        {profile, lab, "", exitNoDeviceValues},
        {profile, anotherProfile, "", exitNoDeviceValues},
        {lab, sameLab, lab, exitNoDeviceValues},
        {lab, sameLab, profile, exitPatchSetNotText},
        {lab, lab, "", exitTargetIsMeasurement},
        {lab, linkToLab, "", exitTargetIsMeasurement},
        {fogra, other, "", exitNothingToPair},
        {rgbProfile, fogra, "", exitProfileWrongColourSpace},
    };
    results.values[0] = 7;
    json = "before";
    record.numPatches = 7;
    for (const auto& c : cases) {
        EXPECT_EQ(analyse(c.target, c.measurement, c.patchSet), c.status)
            << c.target << " " << c.measurement << " " << c.patchSet;
        EXPECT_TRUE(results.values[0] == 7 && json == "before" && record.numPatches == 7);
    }
    EXPECT_EQ(analyzeMeasurements(stringToWstring(lab), stringToWstring(lab), L"", preset, nullptr,
                                  nullptr, nullptr),
              0);
    const std::string rgb = chart("RGB_R RGB_G RGB_B", "1 2 3\n");
    for (const std::string& path : {lab, inks, profile}) {
        EXPECT_EQ(validateInputFile(stringToWstring(path)), 0) << path;
    }
    EXPECT_EQ(validateInputFile(stringToWstring(rgb)), exitNoColourValues);
    EXPECT_EQ(validateInputFile(stringToWstring(rgbProfile)), exitProfileWrongColourSpace);
}

TEST_F(Library, StoresTheMeasurementIntoTheJob) {
    const std::string target = chart(inksAndLab, "1 100 0 0 0 55 -36 -50\n2 0 0 0 40 66 0 0\n");
    // Rows in another order, one without a counterpart, and no inks.
    const std::string byId =
        chart("SAMPLE_ID XYZ_X XYZ_Y XYZ_Z LAB_L LAB_A LAB_B",
              "2 30 35 28 66 0 0\n9 80 84 70 94 0 -2\n1 16 23 52 55 -36 -50\n");
    record.reservedValues = static_cast<double*>(std::malloc(8)); // to be freed
    preset.deltaEMode = 5;
    ASSERT_EQ(analyse(target, byId), 0);
    EXPECT_EQ(record.numPatches, 3);
    EXPECT_EQ(record.deltaEType, 5);
    EXPECT_EQ(record.spectral, nullptr);
    EXPECT_EQ(record.reservedValues, nullptr);
    const auto values = [](const double* array, std::size_t count) {
        return std::vector<double>(array, array + count);
    };
    EXPECT_THAT(values(record.xyz, 9), ElementsAre(30, 35, 28, 80, 84, 70, 16, 23, 52));
    EXPECT_THAT(values(record.lab, 6), ElementsAre(66, 0, 0, 94, 0, -2));
    EXPECT_THAT(values(record.cmyk, 12), ElementsAre(0, 0, 0, DoubleNear(102, 1e-9), 0, 0, 0, 0,
                                                     DoubleNear(255, 1e-9), 0, 0, 0));

    std::string columns = inksAndLab;
    std::string row = "1 100 0 0 0 55 -36 -50";
    for (int nm = 380; nm <= 780; nm += 5) {
        columns += " SPECTRAL_" + std::to_string(nm);
        row += " 0." + std::to_string(nm);
    }
    ASSERT_EQ(analyse(target, chart(columns, row + "\n")), 0);
    ASSERT_EQ(record.hasSpectral, 1);
    const spectralRow& spectrum = record.spectral[0];
    EXPECT_TRUE(spectrum.base == 380 && spectrum.stepsize == 10 && spectrum.length == 36);
    EXPECT_EQ(spectrum.values[35], 0.730);

    ASSERT_EQ(analyse(target, profile), 0);
    EXPECT_EQ(record.numPatches, 2);
    EXPECT_EQ(record.hasSpectral, 0);
    EXPECT_NEAR(record.cmyk[0], 255, 1e-9);
    EXPECT_NEAR(record.xyz[1], 100 * std::pow((record.lab[0] + 16) / 116, 3), 1e-6);
}

TEST_F(Library, StoresEachReadingOfAMean) {
    std::string text = support::contentsOf(TINTGATE_SOURCE_DIR "/presets/CVP_0001.xml");
    text.insert(text.find("<criteria>"), "<repeats>mean</repeats>");
    preset.filePath = wxString(stringToWstring(scratch.write("mean.xml", text)));
    const std::string target = chart(inksAndLab, "1 0 0 0 40 66 0 0\n2 100 0 0 0 55 -36 -50\n");
    const std::string twice =
        chart("SAMPLE_ID LAB_L LAB_A LAB_B", "2 54 -36 -50\n2 56 -36 -50\n1 66 0 0\n");
    ASSERT_EQ(analyse(target, twice), 0);
    EXPECT_EQ(results.values[5], results.values[6] / 2); // two patches, one without a difference
    EXPECT_NEAR(results.values[0], 0, 0.02);             // the mean is taken in XYZ
    ASSERT_EQ(record.numPatches, 3);
    EXPECT_EQ(record.lab[0], 54);
    EXPECT_EQ(record.lab[3], 56);
    for (const int reading : {0, 1}) {
        EXPECT_NEAR(record.cmyk[4 * reading], 255, 1e-9);
    }
    EXPECT_NEAR(record.cmyk[11], 102, 1e-9);
}

TEST_F(Library, MetaTellsOfTheJobButNotItsPassword) {
    const std::string empty = wstringToString(getJsonMetaFileString(&job));
    job.title = wxString(L"\u00dcber \"alles\"\n\U0001F3A8");
    job.password = "s3cret";
    job.secondStrip = 2; // Any number except 0 means the second strip.
    job.tempDir = wxString(stringToWstring("/tmp/JobID_7\xff"));
    const std::string text = wstringToString(getJsonMetaFileString(&job));
    EXPECT_THAT(text, Not(HasSubstr("s3cret")));
    EXPECT_THAT(text, HasSubstr(R"("title": "\u00dcber \"alles\"\n\ud83c\udfa8")"));
    EXPECT_THAT(text, HasSubstr(R"("result": "/tmp/JobID_7\ufffd/output.json")"));
    EXPECT_THAT(text, HasSubstr(R"("strip": 2)"));
    expectSound("meta.schema.json", {empty, text});
}

TEST_F(Library, WritesTheLabThatAProfileGives) {
    const std::string lab = scratch.write("lab \xff.txt", "CGATS.17 before\n");
    const std::string colours = chart(labNames, "50 0 0\n");
    const std::string reference = scratch.path("fogra.ti3");
    std::filesystem::copy_file(fogra, reference);
    const std::string linkToReference = scratch.path("link");
    std::filesystem::create_symlink(reference, linkToReference);
    const std::string preset = scratch.write("preset.xml", "<?xml version=\"1.0\"?>\n<preset/>\n");
    const std::string cut = scratch.write("cut.icc", support::contentsOf(profile).substr(0, 999));
    const std::string sevenInks = "7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7";
    const std::string further =
        chart("SAMPLE_ID " + sevenInks, "1 0 0 0 0 0 0 0\n2 0 0 0 0 0 0 0.6\n");
    const std::string unusedInks =
        chart("SAMPLE_ID " + sevenInks, "1 0 0 0 0 0.5 0 0\n2 0 0 0 9 0 0 0.4\n");
    const auto write = [](const std::string& chart, const std::string& icc,
                          const std::string& output) {
        return writeLabFromReferencesAndICCProfile(stringToWstring(chart), stringToWstring(icc),
                                                   stringToWstring(output));
    };
    const struct {
        std::string reference, profile, output;
        int status;
    } cases[] = {
        {scratch.path("none"), profile, lab, exitInputMissing},
        {colours, profile, lab, exitNoDeviceValues},
        {further, profile, lab, exitNoDeviceValues},
        {unusedInks, profile, scratch.path("four inks"), 0},
        {profile, profile, lab, exitReferenceNotText},
        {preset, profile, lab, exitReferenceNotText},
        {reference, scratch.path("none"), lab, exitInputMissing},
        {reference, colours, lab, exitNotAProfile},
        {reference, preset, lab, exitNotAProfile},
        {reference, cut, lab, exitProfileDamaged},
        {reference, cut, cut, exitOutputIsInput},
        {reference, profile, reference, exitOutputIsInput},
        {reference, profile, linkToReference, exitOutputIsInput},
        {reference, profile, preset, exitOutputNotOurs},
        {reference, profile, cut, exitOutputNotOurs},
        {reference, profile, lab, 0},
        {reference, profile, colours, 0},
        {reference, profile, scratch.path("new"), 0},
        {reference, profile, scratch.write("empty", ""), 0},
    };
    for (const auto& [chart, icc, output, status] : cases) {
        const bool exists = std::filesystem::exists(output);
        const std::string before = exists ? support::contentsOf(output) : "";
        EXPECT_EQ(write(chart, icc, output), status) << chart << icc << output;
        if (status == 0) {
            EXPECT_THAT(support::contentsOf(output), testing::StartsWith("CGATS.17"));
        } else {
            EXPECT_EQ(support::contentsOf(output), before);
        }
    }
    // Devices are always accepted as the output, even if they are also an input.
    std::filesystem::create_symlink("/dev/null", scratch.path("null"));
    EXPECT_EQ(write(scratch.path("null"), profile, scratch.path("null")), exitReferenceNotText);
    EXPECT_EQ(write(reference, profile, scratch.path("null")), 0);
    ASSERT_EQ(analyse(lab, profile), 0);
    EXPECT_LT(results.values[6], 1e-4);
    EXPECT_THAT(json, HasSubstr("\"paired\": 1617"));
}

// Names of inks are for people and must not affect the result: all pairs have the same differences.
TEST_F(Library, NamesInksFromWhereTheNamesCanBeTrusted) {
    const auto inkChart = [&](const std::string& columns, const std::string& header) {
        return chart(columns + " " + labNames,
                     "100 0 0 0 0 0 0 55 -36 -50\n0 0 0 0 100 0 0 65 50 60\n"
                     "0 0 0 0 0 0 0 95 0 -2\n0 0 0 0 0 0 100 25 40 -50\n",
                     "CGATS.17\n" + header);
    };
    const std::string plus = "PLUS_1_COLOR Red|87|0|0|1|2|50|50|1\n"; // an exporter's defaults
    const std::string process = "CMYK_C CMYK_M CMYK_Y CMYK_K ";
    const std::string numbered = inkChart("7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7", plus);
    const std::string letters =
        inkChart("PC7_1 PC7_2 PC7_3 PC7_4 PC7_5 PC7_6 PC7_7", "COLOR_REP \"CMYKOGV\"\n");
    const std::string spots = inkChart(process + "SPOT_5 SPOT_Gold SPOT_485", "");
    const std::string columns = inkChart(process + "CMYKOGV_O CMYKOGV_G CMYK_7", "");
    const std::string text = support::contentsOf(TINTGATE_SOURCE_DIR "/presets/CVP_0001.xml");
    const std::string end = "</psd>";
    const auto presetFile = [&](const char* inks) {
        const std::string element = *inks == '\0' ? "" : "<inks>" + std::string(inks) + "</inks>";
        return scratch.write("inks" + std::to_string(++charts),
                             std::string(text).insert(text.find(end) + end.size(), element));
    };
    const std::string none = presetFile("");
    const std::string two = presetFile("Grün, Deep Sea");
    const std::string four = presetFile("A, B, D, E");
    const struct {
        std::string target, measurement, preset, shows;
    } cases[] = {
        {numbered, numbered, none, R"("Channel 5","Channel 6","Channel 7"])"},
        {numbered, numbered, two, R"("SPOT_Gr\u00fcn","SPOT_Deep Sea","Channel 7"])"},
        {numbered, numbered, four, R"("SPOT_A","SPOT_B","SPOT_D"])"},
        {letters, numbered, four, R"("SPOT_Orange","SPOT_Green","SPOT_Violet"])"},
        {numbered, letters, four, R"("SPOT_Orange","SPOT_Green","SPOT_Violet"])"},
        {spots, numbered, none, R"("Channel 5","SPOT_Gold","SPOT_485"])"},
        {spots, letters, none, R"("SPOT_Orange","SPOT_Gold","SPOT_485"])"},
        {columns, numbered, two, R"("CMYKOGV_O","CMYKOGV_G","Channel 7"])"},
    };
    std::vector<std::string> texts;
    for (const auto& c : cases) {
        preset = {};
        ASSERT_EQ(parsePresetParameterXMLFile(stringToWstring(c.preset), &preset, false), 0);
        ASSERT_EQ(analyse(c.target, c.measurement, "", nullptr), 0);
        EXPECT_THAT(json, HasSubstr(R"("CMYK_C","CMYK_M","CMYK_Y","CMYK_K",)" + c.shows));
        EXPECT_THAT(json, HasSubstr("\"measurement\": \"deviceValues\""));
        EXPECT_THAT(json, HasSubstr("\"paired\": 4,"));
        EXPECT_EQ(results.values[0], 0);
        texts.push_back(json);
    }
    EXPECT_THAT(texts[2], HasSubstr(R"("inks": ["A","B","D","E"])"));
    expectSound("result.schema.json", texts);
}

TEST_F(Library, NamesInstruments) {
    setenv("TINTGATE_INSTRUMENTS",
           scratch
               .write("names", "\xEF\xBB\xBF"
                               "12 = First\n# own names\n33 = Gro\xc3\x9f = A \r\n7=\nx = y\n")
               .c_str(),
           1);
    EXPECT_EQ(GetInstrumentNameFromID(7), "Instrument 7");
    EXPECT_EQ(GetInstrumentNameFromID(12), "First"); // This line follows a byte order mark.
    EXPECT_EQ(GetInstrumentNameFromID(4294967295u), "Instrument 4294967295");
    const auto nameIn = [&](const char* definition, wxString* name) {
        return getDeviceNameFromIt8ControlStripFile(scratch.write("d", definition), name);
    };
    wxString name = "before";
    EXPECT_EQ(nameIn("CGATS.17\r\nKEYWORD DEVICEMODE\r\nDEVICEMODE 0\r\n", &name),
              exitInputDamaged);
    EXPECT_EQ(name, "before");
    // As the measuring code writes it: no KEYWORD line, after the format, no line end.
    EXPECT_EQ(nameIn("CGATS.17\r\nBEGIN_DATA_FORMAT\r\nSAMPLE_ID\r\nEND_DATA_FORMAT\r\n"
                     "DEVICE 33\r\nBEGIN_DATA\r\n1\r\nEND_DATA",
                     &name),
              0);
    EXPECT_EQ(name, wxString(L"Gro\u00df = A"));
    unsetenv("TINTGATE_INSTRUMENTS");
}

} // namespace
