// SPDX-License-Identifier: Apache-2.0
// The boundary to libTintgate: ten functions, linked by name, and their two records. Another
// vendor's library may replace ours, so the order and widths of all members are a contract, even of
// members that nothing here uses (C27).
#pragma once

#include <cstddef>
#include <string>

#include <wx/string.h>

struct KZJobDataStruct;

inline constexpr int presetValueCount = 32;    ///< Entries of a plain tolerance preset.
inline constexpr int psdPresetValueCount = 30; ///< Entries of a preset of the PSD kind.
inline constexpr int resultValueCount = 107;   ///< Entries of analyseResultsRecord::values.

/// A tolerance preset. Numeric members start at zero; copies are independent.
struct tolerancePresetParameterRecord {
    wxString filePath; ///< Local path of the preset's XML file.
    int presetID = 0;
    wxString name;
    int editable = 0;
    int showInClient = 0;
    int usedForDynamicWedge = 0;
    int deltaEMode =
        0; ///< Colour-difference formula, numbered as measurementDataRecord::deltaEType.
    int illuminationCondition = 0;
    int fograPSDPreset = 0; ///< Above 0: judged by the PSD arrays.
    int reserved1 = 0;
    int reserved2 = 0;
    double presetValues[presetValueCount] = {}; ///< Tolerances; 0 is the average, 1 the maximum.
    double psdPresetValues[psdPresetValueCount] = {};
    int usedForResult[presetValueCount] = {}; ///< Not 0: the entry counts for the verdict.
    int decimalPlaces[presetValueCount] = {};
    int usedForPSDResult[psdPresetValueCount] = {};
};

/// The result of an analysis. criteria.md describes every entry.
struct analyseResultsRecord {
    double values[resultValueCount] = {}; ///< -1.0 if the data can't answer.
    bool approvals[presetValueCount] = {};
    bool decimals[presetValueCount] = {};
    bool overallPassed = false;
};

// Sizes and offsets expected by libraries built elsewhere, with a wxString of 48 bytes.
static_assert(sizeof(wxString) == 48);
static_assert(sizeof(tolerancePresetParameterRecord) == 1008);
static_assert(offsetof(tolerancePresetParameterRecord, filePath) == 0);
static_assert(offsetof(tolerancePresetParameterRecord, presetID) == 48);
static_assert(offsetof(tolerancePresetParameterRecord, name) == 56);
static_assert(offsetof(tolerancePresetParameterRecord, editable) == 104);
static_assert(offsetof(tolerancePresetParameterRecord, showInClient) == 108);
static_assert(offsetof(tolerancePresetParameterRecord, usedForDynamicWedge) == 112);
static_assert(offsetof(tolerancePresetParameterRecord, deltaEMode) == 116);
static_assert(offsetof(tolerancePresetParameterRecord, illuminationCondition) == 120);
static_assert(offsetof(tolerancePresetParameterRecord, fograPSDPreset) == 124);
static_assert(offsetof(tolerancePresetParameterRecord, reserved1) == 128);
static_assert(offsetof(tolerancePresetParameterRecord, reserved2) == 132);
static_assert(offsetof(tolerancePresetParameterRecord, presetValues) == 136);
static_assert(offsetof(tolerancePresetParameterRecord, psdPresetValues) == 392);
static_assert(offsetof(tolerancePresetParameterRecord, usedForResult) == 632);
static_assert(offsetof(tolerancePresetParameterRecord, decimalPlaces) == 760);
static_assert(offsetof(tolerancePresetParameterRecord, usedForPSDResult) == 888);
static_assert(sizeof(analyseResultsRecord) == 928);
static_assert(offsetof(analyseResultsRecord, values) == 0);
static_assert(offsetof(analyseResultsRecord, approvals) == 856);
static_assert(offsetof(analyseResultsRecord, decimals) == 888);
static_assert(offsetof(analyseResultsRecord, overallPassed) == 920);

#if defined(TINTGATE_LIBRARY)
#define TINTGATE_API __attribute__((visibility("default")))
#else
#define TINTGATE_API
#endif

// Every integer result is a status: 0 is success, other values are codes of ExitCodes.h. The
// library is not reentrant: make all calls from one thread.

/// Compares target with measurement, each an ICC profile or a CGATS text, under a preset.
///
/// patchSet is empty or names a CGATS text whose CMYK values are used for all calculations. On
/// success, *json is the result as ASCII JSON, *results (if not null) contains the values, and the
/// measurement record of *job (if not null) the measured patches. On failure all three are
/// unchanged.
TINTGATE_API int analyzeMeasurements(std::wstring target, std::wstring measurement,
                                     std::wstring patchSet,
                                     tolerancePresetParameterRecord tolerance,
                                     analyseResultsRecord* results, std::wstring* json,
                                     KZJobDataStruct* job);

/// Reads a preset's XML file into *tolerance, which is unchanged on failure.
///
/// With keepJobChoice, presetID and deltaEMode keep the job's values and the rest comes from the
/// file. Without it, the formula comes from the file too.
TINTGATE_API int parsePresetParameterXMLFile(std::wstring path,
                                             tolerancePresetParameterRecord* tolerance,
                                             bool keepJobChoice);

/// 0 if the path names a CGATS text or ICC profile that the other functions can use.
TINTGATE_API int validateInputFile(std::wstring path);

/// Writes the Lab values that a CMYK profile gives for the device values of a CGATS text, absolute
/// colorimetric (D50, 2 degrees). On every failure, an existing output file is kept.
TINTGATE_API int writeLabFromReferencesAndICCProfile(std::wstring reference, std::wstring profile,
                                                     std::wstring output);

/// The meta file of a job as ASCII JSON. Reads no value array of the job, since these may be freed.
TINTGATE_API std::wstring getJsonMetaFileString(KZJobDataStruct* job);

/// The instrument's display name from the names file next to the presets, or else "Instrument N".
TINTGATE_API wxString GetInstrumentNameFromID(unsigned int deviceID);

/// Reads the instrument's display name from the DEVICE line of a definition file. On failure, *name
/// is unchanged.
TINTGATE_API int getDeviceNameFromIt8ControlStripFile(wxString path, wxString* name);

/// Version of the library, not of the tool.
TINTGATE_API void getLibVersion(unsigned int& major, unsigned int& minor, unsigned int& patch);

/// Converts multibyte text of the process's locale to wide text. Bytes that are not valid UTF-8
/// become U+DC80 to U+DCFF, so that wstringToString restores the same bytes.
TINTGATE_API std::wstring stringToWstring(const std::string& text);

/// The inverse of stringToWstring.
TINTGATE_API std::string wstringToString(const std::wstring& text);
