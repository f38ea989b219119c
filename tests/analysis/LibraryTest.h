// SPDX-License-Identifier: Apache-2.0
// Calls the library's functions with texts that a test writes.
#pragma once

#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/AnalysisLibrary.h"
#include "job/JobRecords.h"

class LibraryTest : public testing::Test {
  protected:
    ~LibraryTest() override {
        for (double* array : {record.xyz, record.lab, record.cmyk}) {
            std::free(array);
        }
        std::free(record.spectral);
    }

    /// Writes a CGATS text of columns and rows.
    std::string chart(const std::string& columns, const std::string& rows,
                      const std::string& header = "CGATS.17\n") {
        return scratch.write(std::to_string(++charts), header + "BEGIN_DATA_FORMAT\n" + columns +
                                                           "\nEND_DATA_FORMAT\nBEGIN_DATA\n" +
                                                           rows + "END_DATA\n");
    }

    /// Compares with the preset. The members hold the results.
    int analyse(const std::string& target, const std::string& measurement,
                const std::string& patchSet = "") {
        return analyse(target, measurement, patchSet, &job);
    }
    int analyse(const std::string& target, const std::string& measurement,
                const std::string& patchSet, KZJobDataStruct* job) {
        std::wstring text = stringToWstring(json);
        const int status =
            analyzeMeasurements(stringToWstring(target), stringToWstring(measurement),
                                stringToWstring(patchSet), preset, &results, &text, job);
        json = wstringToString(text);
        return status;
    }

    const support::ScratchFolder scratch;
    int charts = 0;
    tolerancePresetParameterRecord preset;
    std::string json;
    analyseResultsRecord results;
    KZJobDataStruct job;
    measurementDataRecord& record = job.measurement;
};
