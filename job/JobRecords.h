// SPDX-License-Identifier: Apache-2.0
// The data of one job. The records cross the boundary to libTintgate (see AnalysisLibrary.h): the
// order and widths of all members are a contract (C27).
#pragma once

#include <cstddef>

#include <wx/string.h>

#include "job/AnalysisLibrary.h"

inline constexpr int spectralValueCount = 36; ///< Capacity of a spectral row: 380 to 730 nm by 10.

/// Reflectances of one patch, 0 to 1.
struct spectralRow {
    double values[spectralValueCount];
    int base;     ///< First wavelength in nm.
    int stepsize; ///< Wavelength interval in nm.
    int length;   ///< Used entries of values.
};

/// One measurement or reference data set.
///
/// The arrays come from malloc and have numPatches rows each. Copies of the record share them, and
/// destruction does not free them: the owner of the job does, with free.
struct measurementDataRecord {
    wxString reservedText1;
    wxString reservedText2;
    wxString reservedText3;
    wxString reservedText4;
    int numPatches = 0;
    int reservedInt1 = 0;
    int reservedInt2 = 0;
    int reservedInt3 = 0;
    int hasSpectral = 0;             ///< 1 if spectral contains all rows.
    double* xyz = nullptr;           ///< X, Y, Z of each patch, 0 to 100.
    double* lab = nullptr;           ///< L*, a*, b* of each patch.
    spectralRow* spectral = nullptr; ///< Null if there are no spectra.
    double* cmyk = nullptr;          ///< C, M, Y, K of each patch: percent if loaded from the
                                     ///< ticket, 0 to 255 if stored by the library's analysis.
    double* reservedValues = nullptr;
    int reservedInt4 = 0;
    int reservedInt5 = 0;
    int deltaEType = 0; ///< 2 CIECMC, 3 CIE94, 4 CIE2000, 5 CIECMC_2_1, any other CIE76.
};

/// One job, created once per run.
///
/// A copy has its own texts but shares childJobIDs and the measurement's arrays. Destruction frees
/// no pointer.
struct KZJobDataStruct {
    wxString reservedText;
    int inlineVerifyJob = 0; ///< 1: output job of sub type 96 with an inline instrument.
    int jobID = 0;
    int jobType = 0;     ///< 0 not measured, 1 sub type 80, 81 or 86, 2 measured once, 3 more often
                         ///< or with a profile as reference.
    int secondStrip = 0; ///< 0 first control strip, 1 second.
    int parentID = 0;
    int useDynstrip = 0;
    int deviceID = 0;           ///< Measuring instrument; 0 is unknown.
    int nestedStrip = 0;        ///< 1 if a nesting control strip was fetched.
    int* childJobIDs = nullptr; ///< From malloc; freed by the owner of the job.
    int childJobCount = 0;
    int presetID = 0;
    int measurementWorkflow = 0;
    int measurementStatus = 0; ///< Number of measurements so far.
    int illuminationMode = 0;
    wxString serverHost;
    wxString userName;
    wxString password;
    wxString title;
    wxString serverName;
    wxString workflowName;
    wxString tempDir; ///< The job's folder.
    wxString instrumentName;
    wxString language;
    wxString controlStripFile;
    wxString dynstripFile;
    wxString presetFile; ///< Name without a folder, such as CVP_0007.xml.
    wxString referenceFile;
    wxString presetLocalFile;
    wxString reservedPath;
    wxString sampleFile;
    wxString psdAssessment;
    wxString paperName;
    wxString jdfLocalFile;
    wxString jdfServerFile; ///< A path on the server.
    measurementDataRecord measurement;
    tolerancePresetParameterRecord tolerance;
    double measuredValues[presetValueCount] = {}; ///< For an inline job; all -1.0 if absent.
};

// As in AnalysisLibrary.h.
static_assert(sizeof(spectralRow) == 304);
static_assert(offsetof(spectralRow, values) == 0);
static_assert(offsetof(spectralRow, base) == 288);
static_assert(offsetof(spectralRow, stepsize) == 292);
static_assert(offsetof(spectralRow, length) == 296);
static_assert(sizeof(measurementDataRecord) == 272);
static_assert(offsetof(measurementDataRecord, reservedText1) == 0);
static_assert(offsetof(measurementDataRecord, reservedText4) == 144);
static_assert(offsetof(measurementDataRecord, numPatches) == 192);
static_assert(offsetof(measurementDataRecord, reservedInt1) == 196);
static_assert(offsetof(measurementDataRecord, reservedInt3) == 204);
static_assert(offsetof(measurementDataRecord, hasSpectral) == 208);
static_assert(offsetof(measurementDataRecord, xyz) == 216);
static_assert(offsetof(measurementDataRecord, lab) == 224);
static_assert(offsetof(measurementDataRecord, spectral) == 232);
static_assert(offsetof(measurementDataRecord, cmyk) == 240);
static_assert(offsetof(measurementDataRecord, reservedValues) == 248);
static_assert(offsetof(measurementDataRecord, reservedInt4) == 256);
static_assert(offsetof(measurementDataRecord, reservedInt5) == 260);
static_assert(offsetof(measurementDataRecord, deltaEType) == 264);
static_assert(sizeof(KZJobDataStruct) == 2608);
static_assert(offsetof(KZJobDataStruct, reservedText) == 0);
static_assert(offsetof(KZJobDataStruct, inlineVerifyJob) == 48);
static_assert(offsetof(KZJobDataStruct, jobID) == 52);
static_assert(offsetof(KZJobDataStruct, jobType) == 56);
static_assert(offsetof(KZJobDataStruct, secondStrip) == 60);
static_assert(offsetof(KZJobDataStruct, parentID) == 64);
static_assert(offsetof(KZJobDataStruct, useDynstrip) == 68);
static_assert(offsetof(KZJobDataStruct, deviceID) == 72);
static_assert(offsetof(KZJobDataStruct, nestedStrip) == 76);
static_assert(offsetof(KZJobDataStruct, childJobIDs) == 80);
static_assert(offsetof(KZJobDataStruct, childJobCount) == 88);
static_assert(offsetof(KZJobDataStruct, presetID) == 92);
static_assert(offsetof(KZJobDataStruct, measurementWorkflow) == 96);
static_assert(offsetof(KZJobDataStruct, measurementStatus) == 100);
static_assert(offsetof(KZJobDataStruct, illuminationMode) == 104);
static_assert(offsetof(KZJobDataStruct, serverHost) == 112);
static_assert(offsetof(KZJobDataStruct, userName) == 160);
static_assert(offsetof(KZJobDataStruct, password) == 208);
static_assert(offsetof(KZJobDataStruct, title) == 256);
static_assert(offsetof(KZJobDataStruct, serverName) == 304);
static_assert(offsetof(KZJobDataStruct, workflowName) == 352);
static_assert(offsetof(KZJobDataStruct, tempDir) == 400);
static_assert(offsetof(KZJobDataStruct, instrumentName) == 448);
static_assert(offsetof(KZJobDataStruct, language) == 496);
static_assert(offsetof(KZJobDataStruct, controlStripFile) == 544);
static_assert(offsetof(KZJobDataStruct, dynstripFile) == 592);
static_assert(offsetof(KZJobDataStruct, presetFile) == 640);
static_assert(offsetof(KZJobDataStruct, referenceFile) == 688);
static_assert(offsetof(KZJobDataStruct, presetLocalFile) == 736);
static_assert(offsetof(KZJobDataStruct, reservedPath) == 784);
static_assert(offsetof(KZJobDataStruct, sampleFile) == 832);
static_assert(offsetof(KZJobDataStruct, psdAssessment) == 880);
static_assert(offsetof(KZJobDataStruct, paperName) == 928);
static_assert(offsetof(KZJobDataStruct, jdfLocalFile) == 976);
static_assert(offsetof(KZJobDataStruct, jdfServerFile) == 1024);
static_assert(offsetof(KZJobDataStruct, measurement) == 1072);
static_assert(offsetof(KZJobDataStruct, tolerance) == 1344);
static_assert(offsetof(KZJobDataStruct, measuredValues) == 2352);
