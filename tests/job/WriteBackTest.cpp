#include <algorithm>
#include <chrono>
#include <climits>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <numeric>
#include <random>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include <wx/datetime.h>

#include "tests/job/JobOnStore.h"
#include "tests/job/Rounds.h"

namespace {

using Keys = std::map<std::string, std::string>;
using testing::HasSubstr;
using testing::Not;

std::string joined(const std::vector<std::string>& words) {
    std::string text;
    for (const std::string& word : words) {
        text += (text.empty() ? "" : ",") + word;
    }
    return text;
}

/// A print of two patches, with numbers that differ wherever one could stand for another.
class WriteBack : public JobOnStore {
  protected:
    WriteBack() {
        for (int i = 0; i < spectralValueCount; ++i) {
            spectral[0].values[i] = 0.1 + i;
            spectral[1].values[i] = 0.2 + i;
        }
        spectral[0].base = 380;
        spectral[0].stepsize = 20;
        spectral[0].length = 3;
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

    /// Of a ticket that no other test has written to.
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

/// What both strips write of the values of a print's patches, below their root.
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
    for (int choice = 0; choice < 16; ++choice) {
        const bool second = (choice & 1) != 0;
        const bool psd = (choice & 2) != 0;
        const bool remeasure = (choice & 4) != 0;
        const bool withSpectra = (choice & 8) != 0;
        SCOPED_TRACE(choice);
        engine->remove(3, job);
        engine->create(3, job);
        const std::string root = second ? "Remote/Measurement2/" : "Remote/Measurement/";
        // What was there before: a number that a remeasure keeps, and a longer array.
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
    // Entries of the results by position. Position 12 has none of the values.
    const int values[] = {0,  1,  2,  3,  4,  5,  6,  7,  14, 12, 19, 20, -1, 27,
                          13, 28, 29, 32, 33, 30, 31, 36, 34, 37, 38, 39, 26};
    const int verdicts[] = {6,  7,  8,  9,  4,  0,  1,  5,  12, 10, 13, 3,  2, 19,
                            11, 20, 21, 24, 25, 22, 23, 28, 26, 27, 30, 31, 18};
    unsigned char approvals[presetValueCount];
    unsigned char decimals[presetValueCount];
    std::iota(std::begin(approvals), std::end(approvals), 100); // Beyond 127 on the way.
    std::iota(std::begin(decimals), std::end(decimals), 200);
    std::memcpy(results.approvals, approvals, sizeof approvals);
    std::memcpy(results.decimals, decimals, sizeof decimals);

    const struct {
        int psd, used, value13;
    } cases[] = {{0, 0, 27}, {0, 1, 27}, {1, 0, 26}, {1, 2, 26}, {1, 1, 27}, {-1, 0, 26}};
    for (const auto& [psd, used, value13] : cases) {
        SCOPED_TRACE(std::to_string(psd) + " " + std::to_string(used));
        print.tolerance.fograPSDPreset = psd;
        print.tolerance.usedForPSDResult[21] = used;
        std::vector<std::string> measured, approved, decimal;
        for (int i = 0; i < 27; ++i) {
            const int value = i == 13 ? value13 : values[i];
            measured.push_back(value < 0 ? "-1.0" : std::to_string(100 + value) + ".5");
            if (psd == 0 || i < 10) {
                const int verdict = psd == 0 ? verdicts[i] : i;
                approved.push_back(std::to_string(100 + verdict));
                decimal.push_back(std::to_string(200 + verdict));
            }
        }
        Keys found = freshKeys();
        const std::string root = "Remote/Measurement/Values/";
        EXPECT_EQ(found[root + "Measured"], joined(measured));
        EXPECT_EQ(found[root + (psd == 0 ? "Approval" : "PSDApproval")], joined(approved));
        EXPECT_EQ(found[root + (psd == 0 ? "Decimal" : "PSDDecimal")], joined(decimal));
    }
}

TEST_F(WriteBack, LeavesOutArraysThatAreNotThere) {
    const struct {
        const char* name;
        int patches, length;
        bool spectra, xyz, lab, cmyk;
        std::string present; ///< One letter for each group of keys that there is.
    } cases[] = {
        {"all", 2, 3, true, true, true, true, "nsxlc"},
        {"no samples", 2, 0, true, true, true, true, "nxlc"},
        {"one sample, less than a patch's values", 2, 1, true, true, true, true, "nsxlc"},
        {"all samples", 2, 36, true, true, true, true, "nsxlc"},
        {"too many samples", 2, 37, true, true, true, true, ""},
        {"negative samples", 2, -1, true, true, true, true, ""},
        {"no patches", 0, 3, true, true, true, true, ""},
        {"negative patches", INT_MIN, 3, true, true, true, true, ""},
        {"more patches than there is memory for", 1'000'001, 3, true, true, true, true, "n"},
        {"no XYZ", 2, 3, true, false, true, true, "nslc"},
        {"no Lab", 2, 3, true, true, false, true, "nsxc"},
        {"no CMYK", 2, 3, true, true, true, false, "nsxl"},
    };
    for (const auto& [name, patches, length, hasSpectra, hasXyz, hasLab, hasCmyk, present] :
         cases) {
        SCOPED_TRACE(name);
        print.measurement.numPatches = patches;
        spectral[0].length = length;
        print.measurement.spectral = hasSpectra ? spectral : nullptr;
        print.measurement.xyz = hasXyz ? xyz : nullptr;
        print.measurement.lab = hasLab ? lab : nullptr;
        print.measurement.cmyk = hasCmyk ? cmyk : nullptr;
        const Keys found = freshKeys();
        std::string groups;
        for (const auto& [key, letter] : Keys{{"Numpatches", "n"},
                                              {"SpectralValues/DValues", "s"},
                                              {"XYZValues/ZValues", "x"},
                                              {"LabValues/LValues", "l"},
                                              {"CMYKValues/KValues", "c"}}) {
            const bool there = found.count("Remote/Measurement/" + key) == 1;
            EXPECT_EQ(there, present.find(letter) != std::string::npos) << key;
        }
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

    /// Writes back with a fresh JDF at hand, and gives what the server then has; "none" for none.
    std::string delivered() {
        std::ofstream(print.jdfLocalFile.utf8_string()) << jdf;
        EXPECT_EQ(copy(), 0);
        std::ostringstream to;
        try {
            engine->getFile("temp/job-7.jdf", to);
        } catch (const store::StoreFailure&) {
            return "none";
        }
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
        {0, 0, 3, false, false, "<tazo:Measurement ", "Sender", "CIE94"},
        {1, 0, 4, true, true, "<tazo:Measurement2 ", "Sender", "CIE2000"},
        {0, -1, 5, true, true, "<tazo:Measurement ", "Receiver", "CIECMC_2_1"},
        {0, 0, 6, true, true, "<tazo:Measurement ", "Sender", "CIE76"},
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
        const auto yes = [](bool value) { return std::string(value ? "\"true\"" : "\"false\""); };
        EXPECT_THAT(text, HasSubstr(element + "Date=\"2"));
        EXPECT_THAT(
            text,
            HasSubstr("Comment=\"Remote confirmation M" + std::to_string(secondStrip + 1) +
                      "\" Approval=\"true\" MaxDeltaE=\"106500000\" TotalPass=" + yes(passed) +
                      " CMMVersion=\"1.1.2.3\" MaxToleranc=\"2500000\" "
                      "TypeOfDeltaE=\"" +
                      formula +
                      "\" AverageDeltaE=\"105500000\" SpectralCount=\"2\" "
                      "PaperWhitePass=" +
                      yes(paperWhite) + " AverageToleranc=\"1750000\">"));
        EXPECT_THAT(text, HasSubstr("<FileSpec URL=\"cid:\""));
        EXPECT_THAT(text, HasSubstr("<tazo:PatchDefinitionData1 "));
        EXPECT_THAT(text, HasSubstr("<" + party + " printdate=\"2"));
        EXPECT_EQ(text, support::contentsOf(print.jdfLocalFile.utf8_string()));
    }
}

TEST_F(WriteBackToJdf, IsNeitherChangedNorUploadedInOtherWorkflows) {
    for (const int workflow : {0, 1, 2, 4}) {
        print.measurementWorkflow = workflow;
        EXPECT_EQ(delivered(), "none");
        EXPECT_EQ(support::contentsOf(print.jdfLocalFile.utf8_string()), jdf);
    }
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

TEST_F(WriteBackToJdf, KilledAtAnyMomentLeavesKeysAndFilesWhole) {
    constexpr int patches = 500;
    const int rounds = roundsOr(15);
    std::vector<double> values(std::size_t{4} * patches);
    std::vector<spectralRow> rows(patches);
    print.measurement.numPatches = patches;
    print.measurement.xyz = print.measurement.lab = print.measurement.cmyk = values.data();
    print.measurement.spectral = rows.data();
    const std::string local = print.jdfLocalFile.utf8_string();

    // All values of a round are the same: an array of two rounds would show. Rounds differ in
    // values, but not in their number of digits. The child says when it begins.
    const auto writeBack = [&](int round) {
        std::fill(values.begin(), values.end(), 0.1 + 1e-5 * round);
        for (spectralRow& row : rows) {
            std::fill(std::begin(row.values), std::end(row.values), 0.1 + 1e-5 * round);
            row.length = spectralValueCount;
        }
        std::ofstream(local) << jdf;
        int ends[2];
        EXPECT_EQ(pipe(ends), 0);
        const pid_t child = fork();
        if (child == 0) {
            connect();
            _exit(write(ends[1], "x", 1) == 1 && copy() == 0 &&
                          processor->SetJobStatus(job, true) == 0
                      ? 0
                      : 1);
        }
        char byte = 0;
        EXPECT_EQ(read(ends[0], &byte, 1), 1);
        close(ends[0]);
        close(ends[1]);
        return child;
    };
    const auto end = [](pid_t child) {
        int status = 0;
        waitpid(child, &status, 0);
        return status;
    };
    const auto sizeOf = [&] { return std::filesystem::file_size(local); };

    set("Workflow/Verify/Active=1");
    disconnect();
    const pid_t whole = writeBack(1);
    const auto began = std::chrono::steady_clock::now();
    ASSERT_EQ(end(whole), 0);
    const std::chrono::duration<double, std::micro> taken =
        std::chrono::steady_clock::now() - began;
    const auto updated = sizeOf();
    const auto keyCounts = [&] {
        engine = store::openStore(address);
        std::map<std::string, int> counts;
        const auto content = engine->content(3, job, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            counts[key] = elements->count();
            std::set<double> different;
            elements->visit([&](int, const store::Value& value) {
                if (const auto* number = std::get_if<double>(&value)) {
                    different.insert(*number);
                }
                return true;
            });
            EXPECT_LE(different.size(), key.ends_with("Measured") ? 27U : 1U) << key;
        }
        return counts;
    };
    const auto counts = keyCounts();
    engine.reset();
    std::mt19937 random(9); // NOLINT: the same moments, as far as that goes
    int cutOff = 0;
    for (int round = 2; round < 2 + rounds && !HasFailure(); ++round) {
        const pid_t child = writeBack(round);
        usleep(random() % static_cast<unsigned>(taken.count()));
        kill(child, SIGKILL);
        cutOff += end(child) == 0 ? 0 : 1;
        EXPECT_TRUE(sizeOf() == jdf.size() || sizeOf() == updated) << sizeOf();
        EXPECT_EQ(keyCounts(), counts);
        std::ostringstream delivered;
        engine->getFile("temp/job-7.jdf", delivered);
        EXPECT_EQ(delivered.str().size(), updated);
        engine.reset();
    }
    EXPECT_GT(cutOff, rounds / 4);
}

TEST_F(WriteBack, AddsErrorsBehindThoseThatAreThere) {
    EXPECT_EQ(processor->WrietErrorToJobTicket(106, job), 0);
    EXPECT_EQ(processor->WrietErrorToJobTicket(-5, job), 0);
    EXPECT_EQ(keys()["Process/ErrorMessage"], "'k_TintgateError: 106,'k_TintgateError: -5");
    EXPECT_EQ(processor->WrietErrorToJobTicket(1, job + 1), -1);

    // Behind what can be read as text: the number goes, the text stays.
    set("Process/ErrorMessage[-1]='a Process/ErrorMessage[1]=5 Process/ErrorMessage[2]='c");
    EXPECT_EQ(processor->WrietErrorToJobTicket(7, job), 0);
    EXPECT_EQ(keys()["Process/ErrorMessage"], "'a,'k_TintgateError: 7,'c");
}

// That nothing stays allocated, and nothing is freed twice, is for the sanitizer to find.
TEST_F(WriteBack, FreesArraysAndLeavesTheCallersPointers) {
    processor->FreeMeasurementData(KZJobDataStruct());
    measurementDataRecord& measurement = print.measurement;
    measurement.spectral = static_cast<spectralRow*>(std::malloc(sizeof(spectralRow)));
    for (double** values :
         {&measurement.xyz, &measurement.lab, &measurement.cmyk, &measurement.reservedValues}) {
        *values = static_cast<double*>(std::malloc(sizeof(double)));
    }
    processor->FreeMeasurementData(print);
    EXPECT_TRUE(measurement.spectral && measurement.xyz && measurement.lab && measurement.cmyk &&
                measurement.reservedValues);
}

} // namespace
