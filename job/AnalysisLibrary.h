// SPDX-License-Identifier: Apache-2.0
// The boundary to libTintgate: ten functions, linked by name, and the two records that exist for
// them. Another vendor's library may stand in the place of ours, so the order and the widths of all
// members are a contract, those of members that nothing here touches included (C27).
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
    int usedForResult[presetValueCount] = {}; ///< Not 0: the entry takes part in the verdict.
    int decimalPlaces[presetValueCount] = {};
    int usedForPSDResult[psdPresetValueCount] = {};
};

/// What an analysis says. criteria.md describes every entry.
struct analyseResultsRecord {
    double values[resultValueCount] = {}; ///< -1.0 where the data can't answer.
    bool approvals[presetValueCount] = {};
    bool decimals[presetValueCount] = {};
    bool overallPassed = false;
};

// Sizes and offsets as libraries built elsewhere know them, with a wxString of 48 bytes.
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

// Every integer result is a status: 0 is success, anything else a code of ExitCodes.h. The
// library is not reentrant: all calls come from one thread.

/// Compares target with measurement, each an ICC profile or a CGATS text, under a preset.
///
/// patchSet may be empty; else it names a CGATS text whose CMYK values serve all calculations.
/// On success *json holds the result as ASCII JSON, *results (where not null) the values, and the
/// measurement record of *job (where not null) the measured patches. On failure all three are left
/// as they were.
TINTGATE_API int analyzeMeasurements(std::wstring target, std::wstring measurement,
                                     std::wstring patchSet,
                                     tolerancePresetParameterRecord tolerance,
                                     analyseResultsRecord* results, std::wstring* json,
                                     KZJobDataStruct* job);

/// Reads a preset's XML file into *tolerance, which is left as it was on failure.
///
/// With keepJobChoice the presetID and the deltaEMode that the job has chosen stay, and all else
/// comes from the file; without it the formula comes from the file too.
TINTGATE_API int parsePresetParameterXMLFile(std::wstring path,
                                             tolerancePresetParameterRecord* tolerance,
                                             bool keepJobChoice);

/// 0 if the path names a CGATS text or ICC profile that the other functions can use.
TINTGATE_API int validateInputFile(std::wstring path);

/// Writes the Lab values that a CMYK profile gives for the device values of a CGATS text, absolute
/// colorimetric (D50, 2 degrees). An existing output file survives every failure.
TINTGATE_API int writeLabFromReferencesAndICCProfile(std::wstring reference, std::wstring profile,
                                                     std::wstring output);

/// The meta file of a job as ASCII JSON. Reads no value array of the job: they may be gone by then.
TINTGATE_API std::wstring getJsonMetaFileString(KZJobDataStruct* job);

/// The instrument's display name: from the names file beside the presets, else "Instrument N".
TINTGATE_API wxString GetInstrumentNameFromID(unsigned int deviceID);

/// Reads the instrument's display name from the DEVICE line of a definition file. *name is left as
/// it was on failure.
TINTGATE_API int getDeviceNameFromIt8ControlStripFile(wxString path, wxString* name);

/// Version of the library, not of the tool.
TINTGATE_API void getLibVersion(unsigned int& major, unsigned int& minor, unsigned int& patch);

/// Multibyte text of the process's locale to wide text. Bytes that are no valid UTF-8 become U+DC80
/// to U+DCFF, so that wstringToString gives back the same bytes whatever they were.
TINTGATE_API std::wstring stringToWstring(const std::string& text);

/// The reverse of stringToWstring.
TINTGATE_API std::string wstringToString(const std::wstring& text);
