// SPDX-License-Identifier: Apache-2.0
// A program that uses libTintgate to compare a measurement with a target under a tolerance preset.
// With libtintgate-dev installed:
//
//   g++ -std=c++17 compare.cpp $(pkg-config --cflags --libs tintgate) -o compare
//   ./compare target.ti3 measurement.ti3 /usr/share/tintgate/presets/CVP_0001.xml
//
// Prints the average and the largest colour difference and the verdict. Exit status: 0 passed, 1
// not passed, 2 not compared.
#include <clocale>
#include <cstdio>
#include <string>

#include "ExitCodes.h"
#include "job/AnalysisLibrary.h"
#include "job/JobRecords.h"

namespace {

int fail(int status) {
    for (const ExitCodeText& text : exitCodeTexts) {
        if (text.code == status) {
            std::fprintf(stderr, "%s. %s.\n", text.meaning, text.remedy);
        }
    }
    return 2;
}

} // namespace

int main(int count, char** arguments) {
    std::setlocale(LC_CTYPE, ""); // Paths are in the encoding of the user's locale.
    if (count != 4) {
        std::fprintf(stderr, "compare TARGET MEASUREMENT PRESET\n");
        return 2;
    }
    unsigned int major = 0;
    unsigned int minor = 0;
    unsigned int patch = 0;
    getLibVersion(major, minor, patch);

    tolerancePresetParameterRecord preset;
    if (const int status =
            parsePresetParameterXMLFile(stringToWstring(arguments[3]), &preset, false)) {
        return fail(status);
    }
    analyseResultsRecord results;
    std::wstring json; // The whole result, with every patch.
    if (const int status =
            analyzeMeasurements(stringToWstring(arguments[1]), stringToWstring(arguments[2]), L"",
                                preset, &results, &json, nullptr)) {
        return fail(status);
    }
    std::printf("libTintgate %u.%u.%u, %s: average %.2f, largest %.2f, %s\n", major, minor, patch,
                preset.name.utf8_str().data(), results.values[5], results.values[6],
                results.overallPassed ? "passed" : "not passed");
    return results.overallPassed ? 0 : 1;
}
