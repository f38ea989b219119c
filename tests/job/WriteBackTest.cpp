// SPDX-License-Identifier: Apache-2.0
#include <climits>
#include <cstring>
#include <fstream>
#include <numeric>
#include <sstream>
#include <string>

#include <gmock/gmock.h>

#include <wx/datetime.h>

#include "tests/job/JobOnStore.h"

namespace {

using Keys = std::map<std::string, std::string>;
using testing::HasSubstr;

/// A print of two patches. All numbers differ, so that mix-ups are detected.
class WriteBack : public JobOnStore {
  protected:
    WriteBack() {
        spectral[0] = {.values = {0.1, 1.1, 2.1, 3.1}, .base = 380, .stepsize = 20, .length = 3};
        spectral[1] = {.values = {1.5, 2.5, 3.5, 4.5}, .base = 400, .stepsize = 10, .length = 4};
        print.measurement.numPatches = 2;
        print.measurement.xyz = xyz;
        print.measurement.lab = lab;
        print.measurement.cmyk = cmyk;
        print.measurement.spectral = spectral;
        print.measurementStatus = 3;
        for (int i = 0; i < resultValueCount; ++i) {
            results.values[i] = 100.5 + i;
        }
    }

    int copy(bool remeasure = false, int id = job) {
        return processor->CopyResulDataToJobTicket(id, print, results, remeasure);
    }

    /// The keys of a new ticket after a write-back.
    Keys freshKeys() {
        engine->remove(3, job);
        engine->create(3, job);
        EXPECT_EQ(copy(), 0);
        return keys();
    }

    double xyz[6] = {11, 12, 13, 14, 15, 16};
    double lab[6] = {21, -22, 23, 24, 25, -26};
    double cmyk[8] = {255, 100, -2.55, 204000, 1.275, 300, 0, 33};
    spectralRow spectral[2] = {};
    KZJobDataStruct print;
    analyseResultsRecord results;
};

/// Keys that both strips write for a print's patches, below their root.
const Keys patchKeys = {
    {"SpectralValues/Stepsize", "20"},
    {"SpectralValues/Base", "380"},
    {"SpectralValues/Length", "3"},
    {"Numpatches", "2"},
    {"SpectralValues/DValues", "0.1,1.1,2.1,1.5,2.5,3.5"},
    {"XYZValues/XValues", "11.0,14.0"},
    {"XYZValues/YValues", "12.0,15.0"},
    {"XYZValues/ZValues", "13.0,16.0"},
    {"LabValues/LValues", "21.0,24.0"},
    {"LabValues/AValues", "-22.0,25.0"},
    {"LabValues/BValues", "23.0,-26.0"},
};
const Keys firstStripCmyk = {
    {"CMYKValues/CValues", "100.0,0.5"},
    {"CMYKValues/MValues", "39.22,117.65"},
    {"CMYKValues/YValues", "-1.0,0.0"},
    {"CMYKValues/KValues", "80000.0,12.94"},
};
const Keys secondStripCmyk = {
    {"CMYKValues/CValues", "100.0,1.0"},
    {"CMYKValues/MValues", "39.0,118.0"},
    {"CMYKValues/YValues", "65535.0,0.0"},
    {"CMYKValues/KValues", "14464.0,13.0"},
};

TEST_F(WriteBack, WritesTheKeysOfItsStripAndNoOther) {
    const wxString firstDay = wxDateTime::Now().FormatISODate();
    const struct {
        bool second, psd, remeasure, withSpectra;
    } cases[] = {
        {false, false, false, true}, {true, true, false, true}, {true, false, true, false}};
    for (const auto& [second, psd, remeasure, withSpectra] : cases) {
        SCOPED_TRACE(testing::Message() << second << psd << remeasure << withSpectra);
        engine->remove(3, job);
        engine->create(3, job);
        const std::string root = second ? "Remote/Measurement2/" : "Remote/Measurement/";
        // Existing values: a number that a remeasure keeps, and a longer array.
        set(root + "Status=9 " + root + "LabValues/LValues=1.0,2.0,3.0,4.0 General/ParentID=5");

        print.secondStrip = second ? 1 : 0;
        print.tolerance.fograPSDPreset = psd ? 1 : 0;
        print.measurement.spectral = withSpectra ? spectral : nullptr;
        results.overallPassed = second;
        EXPECT_EQ(copy(remeasure), 0);

        Keys expected = {
            {"Status", remeasure ? "9" : "4"},
            {"Approval", second ? "1" : "0"},
            {"Comment", second ? "'Remote confirmation M2" : "'Remote confirmation M1"},
            {"LabValues/LValues", "1.0,2.0,3.0,4.0"},
        };
        if (withSpectra) {
            expected.erase("LabValues/LValues");
            expected.insert(patchKeys.begin(), patchKeys.end());
            const Keys& device = second ? secondStripCmyk : firstStripCmyk;
            expected.insert(device.begin(), device.end());
        }
        const std::string ten = "0,0,0,0,0,0,0,0,0,0";
        const std::string all = ten + "," + ten + ",0,0,0,0,0,0,0";
        expected[psd ? "Values/PSDApproval" : "Values/Approval"] = psd ? ten : all;
        expected[psd ? "Values/PSDDecimal" : "Values/Decimal"] = psd ? ten : all;

        Keys found;
        for (const auto& [key, text] : keys()) {
            if (key.rfind(root, 0) == 0) {
                found[key.substr(root.size())] = text;
            } else {
                EXPECT_EQ(key, "General/ParentID");
            }
        }
        const std::string date = found["Date"];
        EXPECT_TRUE(date == "'" + firstDay || date == "'" + wxDateTime::Now().FormatISODate());
        wxDateTime time;
        EXPECT_TRUE(time.ParseISOTime(found["Time"].substr(1))) << found["Time"];
        EXPECT_EQ(found.erase("Date") + found.erase("Time") + found.erase("Values/Measured"), 3U);
        EXPECT_EQ(found, expected);
    }
}

TEST_F(WriteBack, PutsResultsInTheServersOrder) {
    // Entries of the results by position. Position 12 has no value.
    const int values[] = {0,  1,  2,  3,  4,  5,  6,  7,  14, 12, 19, 20, -1, 27,
                          13, 28, 29, 32, 33, 30, 31, 36, 34, 37, 38, 39, 26};
    const int verdicts[] = {6,  7,  8,  9,  4,  0,  1,  5,  12, 10, 13, 3,  2, 19,
                            11, 20, 21, 24, 25, 22, 23, 28, 26, 27, 30, 31, 18};
    unsigned char approvals[presetValueCount];
    unsigned char decimals[presetValueCount];
    std::iota(std::begin(approvals), std::end(approvals), 100); // Some exceed 127.
    std::iota(std::begin(decimals), std::end(decimals), 200);
    std::memcpy(results.approvals, approvals, sizeof approvals);
    std::memcpy(results.decimals, decimals, sizeof decimals);

    const struct {
        int psd, used, value13;
    } cases[] = {{0, 0, 27}, {1, 1, 27}, {1, 2, 26}, {-1, 0, 26}};
    for (const auto& [psd, used, value13] : cases) {
        SCOPED_TRACE(std::to_string(psd) + " " + std::to_string(used));
        print.tolerance.fograPSDPreset = psd;
        print.tolerance.usedForPSDResult[21] = used;
        std::string measured, approved, decimal;
        for (int i = 0; i < 27; ++i) {
            const std::string comma = i == 0 ? "" : ",";
            const int value = i == 13 ? value13 : values[i];
            measured += comma + (value < 0 ? "-1.0" : std::to_string(100 + value) + ".5");
            if (psd == 0 || i < 10) {
                const int verdict = psd == 0 ? verdicts[i] : i;
                approved += comma + std::to_string(100 + verdict);
                decimal += comma + std::to_string(200 + verdict);
            }
        }
        Keys found = freshKeys();
        const std::string root = "Remote/Measurement/Values/";
        EXPECT_EQ(found[root + "Measured"], measured);
        EXPECT_EQ(found[root + (psd == 0 ? "Approval" : "PSDApproval")], approved);
        EXPECT_EQ(found[root + (psd == 0 ? "Decimal" : "PSDDecimal")], decimal);
    }
}

// Invalid counts in a measurement, left by another vendor's library, are rejected.
TEST_F(WriteBack, LeavesOutArraysThatAreNotThere) {
    const Keys groupLetters = {{"CMYKValues/KValues", "c"},
                               {"LabValues/LValues", "l"},
                               {"Numpatches", "n"},
                               {"SpectralValues/DValues", "s"},
                               {"XYZValues/ZValues", "x"}};
    double* const none = nullptr;
    const struct {
        int patches, length;
        double *xyz, *lab, *cmyk;
        std::string present; ///< One letter for each group of keys that is present.
    } cases[] = {
        {2, 0, xyz, lab, cmyk, "clnx"},
        {2, 1, none, none, cmyk, "cns"}, // Fewer samples than values in a row.
        {2, 37, xyz, lab, cmyk, ""},     // More than a row can have.
        {2, -1, xyz, lab, cmyk, ""},
        {0, 3, xyz, lab, cmyk, ""},
        {1'000'001, 3, xyz, lab, cmyk, "n"}, // More than memory allows.
        {2, 3, xyz, lab, none, "lnsx"},
    };
    for (const auto& [patches, length, withXyz, withLab, withCmyk, present] : cases) {
        SCOPED_TRACE(testing::Message() << patches << " patches, " << length << " samples");
        print.measurement.numPatches = patches;
        print.measurement.xyz = withXyz;
        print.measurement.lab = withLab;
        print.measurement.cmyk = withCmyk;
        spectral[0].length = length;
        const Keys found = freshKeys();
        std::string groups;
        for (const auto& [key, letter] : groupLetters) {
            groups += found.count("Remote/Measurement/" + key) == 1 ? letter : "";
        }
        EXPECT_EQ(groups, present);
        EXPECT_EQ(found.count("Remote/Measurement/Values/Measured"), 1U);
    }
}

TEST_F(WriteBack, CountsOnAndReportsTheWriteOfTheTime) {
    print.measurementStatus = INT_MAX;
    EXPECT_EQ(freshKeys()["Remote/Measurement/Status"], std::to_string(INT_MIN));
    EXPECT_EQ(copy(false, job + 1), -1) << "there is no such job";
    set("left=1 Remote/Measurement/Status=1");
    const Keys before = keys();
    EXPECT_EQ(copy(false, -1), 0);
    print.secondStrip = 2;
    print.measurementWorkflow = 3;
    EXPECT_EQ(copy(), 0);
    EXPECT_EQ(keys(), before);
}

class WriteBackToJdf : public WriteBack {
  protected:
    WriteBackToJdf() {
        print.jdfLocalFile = root.path("job.jdf");
        print.jdfServerFile = "/temp/job-7.jdf";
        print.measurementWorkflow = 3;
    }

    /// Writes back with a fresh JDF and returns the server's new version.
    std::string delivered() {
        std::ofstream(print.jdfLocalFile.utf8_string()) << jdf;
        EXPECT_EQ(copy(), 0);
        std::ostringstream to;
        engine->getFile("temp/job-7.jdf", to);
        return to.str();
    }

    const std::string jdf = "<JDF><Sender printdate=\"\"/><Receiver printdate=\"\"/>\n"
                            "<ResourcePool>\n</ResourcePool>\n<ResourceLinkPool>\n"
                            "</ResourceLinkPool>\n</JDF>\n" +
                            std::string(5000, ' ');
};

TEST_F(WriteBackToJdf, TellsThePartiesWhatWasMeasured) {
    print.tolerance.presetValues[0] = 1.75;
    print.tolerance.presetValues[1] = 2.5;
    print.measurement.hasSpectral = 1;
    const struct {
        int secondStrip, jobType, deltaEType;
        bool passed, paperWhite;
        std::string element, party, formula;
    } cases[] = {
        {0, 0, 0, false, true, "<tazo:Measurement ", "Sender", "CIE76"},
        {1, 1, 1, true, false, "<tazo:Measurement2 ", "Receiver", "CIE76"},
        {0, 3, 2, true, true, "<tazo:Measurement ", "Receiver", "CIECMC"},
        {1, 0, 4, true, true, "<tazo:Measurement2 ", "Sender", "CIE2000"},
    };
    for (const auto& [secondStrip, jobType, deltaEType, passed, paperWhite, element, party,
                      formula] : cases) {
        SCOPED_TRACE(deltaEType);
        print.secondStrip = secondStrip;
        print.jobType = jobType;
        print.measurement.deltaEType = deltaEType;
        results.overallPassed = passed;
        results.approvals[4] = paperWhite;
        const std::string text = delivered();
        const auto yes = [](bool value) { return std::string(value ? "true" : "false"); };
        EXPECT_THAT(text, HasSubstr(element + "Date=\"2"));
        EXPECT_THAT(
            text,
            HasSubstr("Comment=\"Remote confirmation M" + std::to_string(secondStrip + 1) +
                      "\" Approval=\"true\" MaxDeltaE=\"106500000\" TotalPass=\"" + yes(passed) +
                      "\" CMMVersion=\"1.1.2.3\" MaxToleranc=\"2500000\" TypeOfDeltaE=\"" +
                      formula +
                      "\" AverageDeltaE=\"105500000\" SpectralCount=\"2\" PaperWhitePass=\"" +
                      yes(paperWhite) + "\" AverageToleranc=\"1750000\">"));
        EXPECT_THAT(text, HasSubstr("<tazo:PatchDefinitionData1 "));
        EXPECT_THAT(text, HasSubstr("<" + party + " printdate=\"2"));
        EXPECT_EQ(text, support::contentsOf(print.jdfLocalFile.utf8_string()));
    }
    print.measurementWorkflow = 2; // The JDF is neither changed nor uploaded.
    EXPECT_NE(delivered(), jdf);
    EXPECT_EQ(support::contentsOf(print.jdfLocalFile.utf8_string()), jdf);
}

TEST_F(WriteBackToJdf, MayFailAndTheTicketIsWrittenAllTheSame) {
    for (const char* serverFile : {"/temp/job-7.jdf", "../outside", ""}) {
        print.jdfServerFile = serverFile;
        print.jdfLocalFile = root.path(*serverFile == '/' ? "missing" : "job.jdf");
        const Keys found = freshKeys();
        EXPECT_EQ(found.count("Remote/Measurement/Time"), 1U);
        EXPECT_EQ(found.count("Remote/Measurement/Values/Decimal"), 1U);
        EXPECT_TRUE(engine->files().empty());
    }
}

TEST_F(WriteBack, AddsErrorsBehindThoseThatAreThere) {
    EXPECT_EQ(processor->WrietErrorToJobTicket(106, job), 0);
    EXPECT_EQ(processor->WrietErrorToJobTicket(-5, job), 0);
    EXPECT_EQ(keys()["Process/ErrorMessage"], "'k_TintgateError: 106,'k_TintgateError: -5");
    EXPECT_EQ(processor->WrietErrorToJobTicket(1, job + 1), -1);

    // Appends after the readable texts: the number is replaced, the text stays.
    set("Process/ErrorMessage[-1]='a Process/ErrorMessage[1]=5 Process/ErrorMessage[2]='c");
    EXPECT_EQ(processor->WrietErrorToJobTicket(7, job), 0);
    EXPECT_EQ(keys()["Process/ErrorMessage"], "'a,'k_TintgateError: 7,'c");
}

} // namespace
