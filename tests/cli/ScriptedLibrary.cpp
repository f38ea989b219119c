// SPDX-License-Identifier: Apache-2.0
// Replaces libTintgate, as another vendor's library could. It writes each call to the file that
// CALLS names and answers according to the environment: VALIDATE, LAB, PARSE and ANALYZE are
// statuses, JSON is the result's text.

#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

#include "job/AnalysisLibrary.h"

namespace {

std::string setting(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? "" : value;
}

int answer(const char* name, const std::string& call, const std::vector<std::wstring>& paths,
           const std::string& more = {}) {
    std::ofstream calls(setting("CALLS"), std::ios::app);
    calls << call;
    for (const std::wstring& path : paths) {
        calls << " [" << wstringToString(path) << "]";
    }
    calls << more << "\n";
    return std::atoi(setting(name).c_str());
}

} // namespace

int analyzeMeasurements(std::wstring target, std::wstring measurement, std::wstring patchSet,
                        tolerancePresetParameterRecord tolerance, analyseResultsRecord* results,
                        std::wstring* json, KZJobDataStruct* job) {
    *json = wxString::FromUTF8(setting("JSON")).ToStdWstring();
    return answer("ANALYZE", "analyze", {target, measurement, patchSet},
                  " under " + tolerance.name.ToStdString() +
                      (results == nullptr && job == nullptr ? "" : ", with a record"));
}

int parsePresetParameterXMLFile(std::wstring path, tolerancePresetParameterRecord* tolerance,
                                bool keepJobChoice) {
    tolerance->name = "parsed";
    return answer("PARSE", "parse", {path}, keepJobChoice ? " true" : " false");
}

int validateInputFile(std::wstring path) {
    return answer("VALIDATE", "validate", {path});
}

int writeLabFromReferencesAndICCProfile(std::wstring reference, std::wstring profile,
                                        std::wstring output) {
    return answer("LAB", "lab", {reference, profile, output});
}

std::wstring getJsonMetaFileString(KZJobDataStruct*) {
    return L"{}";
}

wxString GetInstrumentNameFromID(unsigned int) {
    return {};
}

int getDeviceNameFromIt8ControlStripFile(wxString, wxString*) {
    return 1;
}

void getLibVersion(unsigned int& major, unsigned int& minor, unsigned int& patch) {
    major = 7;
    minor = 8;
    patch = 9;
}

// One character per byte: the tool must not depend on the intermediate form of these texts.
std::wstring stringToWstring(const std::string& text) {
    return wxString::From8BitData(text.data(), text.size()).ToStdWstring();
}

std::string wstringToString(const std::wstring& text) {
    return {text.begin(), text.end()};
}
