// Stands in the place of libTintgate, as another vendor's library could. It writes each call to the
// file that CALLS names, and answers as the environment says: VALIDATE, LAB, PARSE and ANALYZE are
// statuses, JSON is the result's text.

#include <cstdlib>
#include <fstream>
#include <string>

#include "job/AnalysisLibrary.h"

namespace {

std::string setting(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? "" : value;
}

int answer(const char* name, const std::string& call) {
    std::ofstream(setting("CALLS"), std::ios::app) << call << "\n";
    return std::atoi(setting(name).c_str());
}

std::string bytes(const std::wstring& text) {
    return wstringToString(text);
}

} // namespace

int analyzeMeasurements(std::wstring target, std::wstring measurement, std::wstring patchSet,
                        tolerancePresetParameterRecord tolerance, analyseResultsRecord* results,
                        std::wstring* json, KZJobDataStruct* job) {
    *json = stringToWstring(setting("JSON"));
    return answer("ANALYZE", "analyze [" + bytes(target) + "] [" + bytes(measurement) + "] [" +
                                 bytes(patchSet) + "] under " + tolerance.name.ToStdString() +
                                 (results == nullptr && job == nullptr ? "" : ", with a record"));
}

int parsePresetParameterXMLFile(std::wstring path, tolerancePresetParameterRecord* tolerance,
                                bool keepJobChoice) {
    tolerance->name = "parsed";
    return answer("PARSE", "parse [" + bytes(path) + "] " + (keepJobChoice ? "true" : "false"));
}

int validateInputFile(std::wstring path) {
    return answer("VALIDATE", "validate [" + bytes(path) + "]");
}

int writeLabFromReferencesAndICCProfile(std::wstring reference, std::wstring profile,
                                        std::wstring output) {
    return answer("LAB", "lab [" + bytes(reference) + "] [" + bytes(profile) + "] [" +
                             bytes(output) + "]");
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

// UTF-8 becomes characters, as it must; any other byte is set apart in a way of this library's own.
std::wstring stringToWstring(const std::string& text) {
    const wxString valid = wxString::FromUTF8(text.data(), text.size());
    if (!valid.empty() || text.empty()) {
        return valid.ToStdWstring();
    }
    std::wstring wide;
    for (const unsigned char byte : text) {
        wide += static_cast<wchar_t>(0xE000 + byte);
    }
    return wide;
}

std::string wstringToString(const std::wstring& text) {
    if (text.empty() || text[0] < 0xE000 || text[0] > 0xE0FF) {
        return wxString(text).utf8_string();
    }
    std::string narrow;
    for (const wchar_t unit : text) {
        narrow += static_cast<char>(unit - 0xE000);
    }
    return narrow;
}
