// The library through its ten functions, on real data and against other programs.
#include "job/AnalysisLibrary.h"

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <regex>

#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ExitCodes.h"
#include "RunProgram.h"
#include "ScratchFolder.h"
#include "job/JobRecords.h"

namespace {

using support::ScratchFolder;
using testing::HasSubstr;
using testing::Not;

const std::string sets = "/usr/share/color/icc/";
const std::string profile = sets + "ghostscript/default_cmyk.icc";

tolerancePresetParameterRecord presetOf(int formula) {
    tolerancePresetParameterRecord preset;
    preset.deltaEMode = formula;
    preset.presetValues[0] = 4;
    preset.presetValues[1] = 8;
    preset.usedForResult[0] = preset.usedForResult[1] = 1;
    preset.decimalPlaces[0] = preset.decimalPlaces[1] = 1;
    preset.name = wxString(L"Paper \u00e4 \"7\"");
    return preset;
}

struct Analysis {
    int status;
    std::string json;
    analyseResultsRecord results;
};

Analysis analyse(const std::string& target, const std::string& measurement,
                 const std::string& patchSet = "", int formula = 0,
                 KZJobDataStruct* job = nullptr) {
    Analysis analysis{};
    std::wstring json;
    analysis.status = analyzeMeasurements(stringToWstring(target), stringToWstring(measurement),
                                          stringToWstring(patchSet), presetOf(formula),
                                          &analysis.results, &json, job);
    analysis.json = wstringToString(json);
    return analysis;
}

/// A CGATS text of columns and rows.
std::string chart(const std::string& columns, const std::string& rows) {
    return "CGATS.17\nBEGIN_DATA_FORMAT\n" + columns + "\nEND_DATA_FORMAT\nBEGIN_DATA\n" + rows +
           "END_DATA\n";
}

void expectSound(const std::string& schema, const std::vector<std::string>& documents) {
    std::vector<std::string> command = {"python3", TINTGATE_SOURCE_DIR "/tests/analysis/audit.py",
                                        TINTGATE_SOURCE_DIR "/docs/" + schema};
    command.insert(command.end(), documents.begin(), documents.end());
    const support::Outcome outcome = support::run(command);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
}

TEST(Library, ShowsTenFunctionsAndNoMore) {
    const support::Outcome outcome =
        support::run({"nm", "-DC", "--defined-only", TINTGATE_BINARY_DIR "/lib/libTintgate.so"});
    ASSERT_EQ(outcome.exitCode, 0) << outcome.error;
    std::vector<std::string> names;
    const std::regex line(" ([A-Z]) ([A-Za-z0-9]+)[^\n]*\n");
    for (std::sregex_iterator it(outcome.output.begin(), outcome.output.end(), line), end;
         it != end; ++it)
        names.push_back((*it)[2]);
    EXPECT_THAT(names,
                testing::UnorderedElementsAre(
                    "analyzeMeasurements", "parsePresetParameterXMLFile", "validateInputFile",
                    "writeLabFromReferencesAndICCProfile", "getJsonMetaFileString",
                    "GetInstrumentNameFromID", "getDeviceNameFromIt8ControlStripFile",
                    "getLibVersion", "stringToWstring", "wstringToString"));
    EXPECT_EQ(std::count(outcome.output.begin(), outcome.output.end(), '\n'), 10);
}

// ArgyllCMS pairs by sample id and we by device values: in one chart that is the same.
TEST(Library, AgreesWithColverifyToSixDecimals) {
    const std::vector<const char*> charts[] = {
        {"FOGRA28L", "FOGRA29L", "FOGRA30L"},                // 1,485 patches
        {"FOGRA39L", "FOGRA40L", "TR003", "TR005", "TR006"}, // 1,617
    };
    std::vector<std::vector<std::string>> pairs;
    for (const auto& conditions : charts)
        for (const char* target : conditions)
            for (const char* measurement : conditions)
                if (target != measurement)
                    pairs.push_back({sets + target + ".ti3", sets + measurement + ".ti3"});
    for (const auto& pair : pairs)
        for (const int formula : {0, 4}) {
            std::vector<std::string> command = {"colverify"};
            if (formula == 4)
                command.push_back("-k");
            command.insert(command.end(), pair.begin(), pair.end());
            const support::Outcome peer = support::run(command);
            const Analysis analysis = analyse(pair[0], pair[1], "", formula);
            ASSERT_EQ(analysis.status, 0);
            char figures[80];
            std::snprintf(figures, sizeof figures, "peak = %.6f, avg = %.6f\n",
                          analysis.results.values[6], analysis.results.values[5]);
            EXPECT_THAT(peer.output, HasSubstr(figures)) << testing::PrintToString(pair);
        }

    const Analysis analysis = analyse(sets + "FOGRA39L.ti3", sets + "FOGRA40L.ti3", "", 4);
    EXPECT_THAT(analysis.json, HasSubstr("\"value\":3.932947,\"rounded\":3.9"));
    EXPECT_THAT(analysis.json, HasSubstr("\"value\":7.626293,\"rounded\":7.6"));
    EXPECT_TRUE(analysis.results.overallPassed);
    EXPECT_TRUE(analysis.results.approvals[1]);
}

TEST(Library, WritesSoundResults) {
    const ScratchFolder scratch;
    const std::string strip = scratch.write(
        "strip \xff.txt", chart("SAMPLE_NAME CMYK_C CMYK_M CMYK_Y CMYK_K",
                                "Cyan 100 0 0 0\n\"Gr\xc3\xa4y\" 40 27 27 0\nOdd 13 0 0 77\n"));
    const std::string bare = scratch.write("bare.txt", chart("LAB_L LAB_A LAB_B", "50 0 0\n"));
    const struct {
        std::string target, measurement, patchSet;
        int formula;
        const char* shows;
    } cases[] = {
        {sets + "FOGRA39L.ti3", sets + "FOGRA40L.ti3", "", 0, "\"target\": \"own\""},
        {sets + "FOGRA39L.ti3", sets + "TR002.ti3", "", 5, "\"patchesUnpaired\""},
        {profile, sets + "FOGRA39L.ti3", "", 2, "\"selection\": \"measurement\""},
        {sets + "FOGRA39L.ti3", profile, "", 3, "\"measurement\": \"profile\""},
        {profile, profile, strip, 4, "\"Gr\\u00e4y\""},
        {sets + "FOGRA39L.ti3", profile, strip, 0, "\"unpairedPatchSet\": 1"},
        {bare, bare, "", 0, "\"pairedByOrder\""},
        {bare, sets + "TR002.ti3", "", 0, "\"deviceChannels\": [\"CMYK_C\","},
    };
    std::vector<std::string> documents;
    for (const auto& c : cases) {
        const Analysis analysis = analyse(c.target, c.measurement, c.patchSet, c.formula);
        ASSERT_EQ(analysis.status, 0) << c.shows;
        EXPECT_THAT(analysis.json, HasSubstr(c.shows));
        documents.push_back(
            scratch.write("result" + std::to_string(documents.size()) + ".json", analysis.json));
    }
    expectSound("result.schema.json", documents);
}

TEST(Library, WarnsOfConditionsThatDiffer) {
    const ScratchFolder scratch;
    const auto set = [&](const char* name, const char* condition) {
        return scratch.write(name, std::string("CGATS.17\nKEYWORD \"MEASUREMENT_SOURCE\"\n"
                                               "MEASUREMENT_SOURCE \"MeasurementCondition=") +
                                       condition +
                                       "\"\nBEGIN_DATA_FORMAT\nSAMPLE_ID LAB_L LAB_A LAB_B\n"
                                       "END_DATA_FORMAT\nBEGIN_DATA\n1 50 0 0\nEND_DATA\n");
    };
    const std::string m0 = set("m0.txt", "M0");
    const std::string m1 = set("m1.txt", "M1");
    EXPECT_THAT(analyse(m0, m1).json, HasSubstr("measurement conditions: M0 and M1."));
    EXPECT_THAT(analyse(m0, m0).json, Not(HasSubstr("measurementConditionsDiffer")));
}

// A job whose ticket has no device values comes with zeros in their place.
TEST(Library, TakesNoNoticeOfDeviceValuesThatWereNeverFilledIn) {
    const ScratchFolder scratch;
    const std::string columns = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    const std::string full =
        scratch.write("full", chart(columns, "1 0 0 0 0 95 0 0\n2 100 0 0 0 55 -36 -50\n"));
    const std::string zeros =
        scratch.write("zeros", chart(columns, "2 0 0 0 0 55 -36 -50\n1 0 0 0 0 94 0 0\n"));
    for (const auto& [target, measurement] : {std::pair(full, zeros), std::pair(zeros, full)}) {
        const Analysis analysis = analyse(target, measurement);
        EXPECT_THAT(analysis.json, HasSubstr("deviceValuesIgnored"));
        EXPECT_EQ(analysis.results.values[6], 1);
        EXPECT_EQ(analysis.results.values[4], 1); // paper
        EXPECT_EQ(analysis.results.values[0], 0); // solid cyan
    }
    EXPECT_THAT(analyse(zeros, zeros).json, HasSubstr("\"measurement\": \"deviceValues\""));
}

TEST(Library, GivesOneCodeForOneCause) {
    const ScratchFolder scratch;
    const std::string lab =
        scratch.write("lab.txt", chart("SAMPLE_ID LAB_L LAB_A LAB_B", "1 50 0 0\n"));
    const std::string inks =
        scratch.write("inks.txt", chart("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K", "1 9 9 9 9\n"));
    const std::string both = scratch.write(
        "both.txt", chart("CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B", "1 9 9 9 50 0 0\n"));
    const std::string noise = scratch.write("noise", std::string("\0\1\2\3", 4));
    const std::string rgbProfile = sets + "ghostscript/srgb.icc";
    const std::string fogra = sets + "FOGRA39L.ti3";
    const struct {
        std::string target, measurement, patchSet;
        int status;
    } cases[] = {
        {scratch.path("none"), lab, "", exitInputMissing},
        {lab, scratch.path(), "", exitInputUnreadable},
        {lab, noise, "", exitInputNotRecognised},
        {fogra, inks, "", exitNoColourValues},
        {profile, lab, "", exitNoDeviceValues},
        {profile, profile, "", exitNoDeviceValues},
        {lab, lab, lab, exitNoDeviceValues},
        {lab, lab, profile, exitPatchSetNotText},
        {fogra, both, "", exitNothingToPair},
        {rgbProfile, fogra, "", exitProfileWrongColourSpace},
    };
    for (const auto& c : cases) {
        analyseResultsRecord results;
        results.values[0] = 7;
        std::wstring json = L"before";
        KZJobDataStruct job;
        job.measurement.numPatches = 7;
        EXPECT_EQ(analyzeMeasurements(stringToWstring(c.target), stringToWstring(c.measurement),
                                      stringToWstring(c.patchSet), presetOf(0), &results, &json,
                                      &job),
                  c.status)
            << c.target << " " << c.measurement << " " << c.patchSet;
        EXPECT_EQ(results.values[0], 7);
        EXPECT_EQ(json, L"before");
        EXPECT_EQ(job.measurement.numPatches, 7);
    }
    EXPECT_EQ(analyzeMeasurements(stringToWstring(lab), stringToWstring(lab), L"", presetOf(0),
                                  nullptr, nullptr, nullptr),
              0);

    const std::string rgb = scratch.write("rgb.txt", chart("RGB_R RGB_G RGB_B", "1 2 3\n"));
    EXPECT_EQ(validateInputFile(stringToWstring(lab)), 0);
    EXPECT_EQ(validateInputFile(stringToWstring(inks)), 0);
    EXPECT_EQ(validateInputFile(stringToWstring(profile)), 0);
    EXPECT_EQ(validateInputFile(stringToWstring(rgb)), exitNoColourValues);
    EXPECT_EQ(validateInputFile(stringToWstring(rgbProfile)), exitProfileWrongColourSpace);
    EXPECT_EQ(validateInputFile(L"-Help"), exitInputMissing);
}

/// A job whose arrays hold something that is to be freed.
struct MeasuredJob : KZJobDataStruct {
    MeasuredJob() {
        measurement.xyz = static_cast<double*>(std::malloc(24));
        measurement.cmyk = static_cast<double*>(std::malloc(32));
        measurement.reservedValues = static_cast<double*>(std::malloc(8));
    }
    ~MeasuredJob() {
        for (void* array :
             std::initializer_list<void*>{measurement.spectral, measurement.xyz, measurement.lab,
                                          measurement.cmyk, measurement.reservedValues})
            std::free(array);
    }
};

TEST(Library, StoresTheMeasurementIntoTheJob) {
    const ScratchFolder scratch;
    const std::string target =
        scratch.write("target.txt", chart("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B",
                                          "1 100 0 0 0 55 -36 -50\n2 0 0 0 40 66 0 0\n"));
    // Rows in another order, one of them without a counterpart; ids alone, or inks too.
    const std::string spectral = "SPECTRAL_400 SPECTRAL_500 SPECTRAL_600 SPECTRAL_700";
    const std::string byId = scratch.write(
        "id.txt", chart("SAMPLE_ID XYZ_X XYZ_Y XYZ_Z LAB_L LAB_A LAB_B",
                        "2 30 35 28 66 0 0\n9 80 84 70 94 0 -2\n1 16 23 52 55 -36 -50\n"));
    MeasuredJob job;
    ASSERT_EQ(analyse(target, byId, "", 5, &job).status, 0);
    const measurementDataRecord& record = job.measurement;
    EXPECT_EQ(record.numPatches, 3);
    EXPECT_EQ(record.deltaEType, 5);
    EXPECT_EQ(record.hasSpectral, 0);
    EXPECT_EQ(record.spectral, nullptr);
    EXPECT_EQ(record.reservedValues, nullptr);
    using Values = std::vector<double>;
    EXPECT_EQ(Values(record.xyz, record.xyz + 9), (Values{30, 35, 28, 80, 84, 70, 16, 23, 52}));
    EXPECT_EQ(Values(record.lab, record.lab + 6), (Values{66, 0, 0, 94, 0, -2}));
    const Values scaled = {0, 0, 0, 102, 0, 0, 0, 0, 255, 0, 0, 0};
    for (std::size_t i = 0; i < scaled.size(); ++i)
        EXPECT_NEAR(record.cmyk[i], scaled[i], 1e-9) << i;

    std::string columns = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    std::string row = "1 100 0 0 0 55 -36 -50";
    for (int nm = 380; nm <= 780; nm += 5) {
        columns += " SPECTRAL_" + std::to_string(nm);
        row += " 0." + std::to_string(nm);
    }
    const std::string fine = scratch.write("fine.txt", chart(columns, row + "\n"));
    ASSERT_EQ(analyse(target, fine, "", 0, &job).status, 0);
    EXPECT_EQ(record.numPatches, 1);
    ASSERT_EQ(record.hasSpectral, 1);
    EXPECT_EQ(record.spectral[0].base, 380);
    EXPECT_EQ(record.spectral[0].stepsize, 10);
    EXPECT_EQ(record.spectral[0].length, 36);
    EXPECT_EQ(record.spectral[0].values[35], 0.730);

    ASSERT_EQ(analyse(target, profile, "", 0, &job).status, 0);
    EXPECT_EQ(record.numPatches, 2);
    EXPECT_EQ(record.hasSpectral, 0);
    EXPECT_NEAR(record.cmyk[0], 255, 1e-9);
    EXPECT_NEAR(record.xyz[1], 100 * std::pow((record.lab[0] + 16) / 116, 3), 1e-6);
}

TEST(Library, MetaTellsOfTheJobButNotItsPassword) {
    const ScratchFolder scratch;
    KZJobDataStruct job;
    const std::string empty =
        scratch.write("empty.json", wstringToString(getJsonMetaFileString(&job)));
    job.title = wxString(L"\u00dcber \"alles\"\n\U0001F3A8");
    job.password = "s3cret";
    job.userName = "anna";
    job.secondStrip = 2; // Whatever is not 0 is the second.
    job.parentID = 5;
    job.tempDir = wxString(stringToWstring("/tmp/JobID_7\xff"));
    job.tolerance.deltaEMode = 4;
    const std::string text = wstringToString(getJsonMetaFileString(&job));
    EXPECT_THAT(text, Not(HasSubstr("s3cret")));
    EXPECT_THAT(text, HasSubstr(R"("title": "\u00dcber \"alles\"\n\ud83c\udfa8")"));
    EXPECT_THAT(text, HasSubstr(R"("result": "/tmp/JobID_7\ufffd/output.json")"));
    EXPECT_THAT(text, HasSubstr(R"("strip": 2)"));
    EXPECT_THAT(text, HasSubstr(R"("formula": "CIE2000")"));
    expectSound("meta.schema.json", {empty, scratch.write("meta.json", text)});
    EXPECT_EQ(getJsonMetaFileString(nullptr), L"");
}

TEST(Library, WritesTheLabThatAProfileGives) {
    const ScratchFolder scratch;
    const auto write = [&](const std::string& reference, const std::string& icc) {
        return writeLabFromReferencesAndICCProfile(stringToWstring(reference), stringToWstring(icc),
                                                   stringToWstring(scratch.path("lab \xff.txt")));
    };
    const std::string lab = scratch.write("lab \xff.txt", "before");
    const std::string colours = scratch.write("c.txt", chart("LAB_L LAB_A LAB_B", "50 0 0\n"));
    EXPECT_EQ(write(scratch.path("none"), profile), exitInputMissing);
    EXPECT_EQ(write(profile, profile), exitPatchSetNotText);
    EXPECT_EQ(write(colours, profile), exitNoDeviceValues);
    EXPECT_EQ(write(sets + "FOGRA39L.ti3", colours), exitProfileDamaged);
    EXPECT_EQ(write(sets + "FOGRA39L.ti3", sets + "sRGB.icc"), exitProfileWrongColourSpace);
    EXPECT_EQ(support::contentsOf(lab), "before");

    ASSERT_EQ(write(sets + "FOGRA39L.ti3", profile), 0);
    const Analysis analysis = analyse(lab, profile);
    ASSERT_EQ(analysis.status, 0);
    EXPECT_LT(analysis.results.values[6], 1e-4);
    EXPECT_THAT(analysis.json, HasSubstr("\"paired\": 1617"));
}

TEST(Library, NamesInstruments) {
    const ScratchFolder scratch;
    EXPECT_EQ(GetInstrumentNameFromID(33), "Instrument 33");
    EXPECT_EQ(GetInstrumentNameFromID(4294967295u), "Instrument 4294967295");
    setenv("TINTGATE_INSTRUMENTS",
           scratch.write("names", "# own names\n33 = Gro\xc3\x9f = A \r\n7=\nx = y\n").c_str(), 1);
    EXPECT_EQ(GetInstrumentNameFromID(33), wxString(L"Gro\u00df = A"));
    EXPECT_EQ(GetInstrumentNameFromID(7), "Instrument 7");

    const struct {
        const char* definition;
        int status;
        wxString name;
    } cases[] = {
        // As the measuring road writes it: no KEYWORD line, a count below the rows, no line end.
        {"CGATS.17\r\nORIGINATOR \"x\"\r\nBEGIN_DATA_FORMAT\r\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y "
         "CMYK_K"
         "\r\nEND_DATA_FORMAT\r\nDEVICE 33\r\nKEYWORD DEVICEMODE\r\nDEVICEMODE 0\r\n"
         "NUMBER_OF_SETS\t1\r\nBEGIN_DATA\r\n1 0 0 0 0\r\n2 9 9 9 9\r\nEND_DATA",
         0, wxString(L"Gro\u00df = A")},
        {"CGATS.17\r\nKEYWORD\tDEVICE\r\nDEVICE\t28\r\n", 0, "Instrument 28"},
        {"CGATS.17\r\nKEYWORD DEVICEMODE\r\nDEVICEMODE 0\r\n", exitInputDamaged, "before"},
        {"CGATS.17\r\nDEVICE some\r\n", exitValueNotNumeric, "before"},
    };
    for (const auto& c : cases) {
        wxString name = "before";
        const std::string path = scratch.write("d.it8", c.definition);
        EXPECT_EQ(getDeviceNameFromIt8ControlStripFile(path, &name), c.status) << c.definition;
        EXPECT_EQ(name, c.name) << c.definition;
    }
    unsetenv("TINTGATE_INSTRUMENTS");
    wxString name;
    EXPECT_EQ(getDeviceNameFromIt8ControlStripFile("/no/such", &name), exitInputMissing);
}

} // namespace
