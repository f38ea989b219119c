// All that is known of one job. The records cross the boundary to libTintgate (see
// AnalysisLibrary.h): the order and the widths of all members are a contract.
#pragma once

#include <wx/string.h>

#include "job/AnalysisLibrary.h"

inline constexpr int spectralValueCount = 36; ///< Room of one spectral row: 380 to 730 nm by 10.

/// Reflectances of one patch, 0 to 1.
struct spectralRow {
    double values[spectralValueCount];
    int base;     ///< First wavelength in nm.
    int stepsize; ///< Distance of the wavelengths in nm.
    int length;   ///< Used entries of values.
};

/// One measurement or reference data set.
///
/// The arrays come from malloc and hold numPatches rows each. A copy of the record shares them;
/// destruction frees nothing: the owner of the job does, with free.
struct measurementDataRecord {
    wxString reservedText1;
    wxString reservedText2;
    wxString reservedText3;
    wxString reservedText4;
    int numPatches = 0;
    int reservedInt1 = 0;
    int reservedInt2 = 0;
    int reservedInt3 = 0;
    int hasSpectral = 0;             ///< 1 when spectral holds all rows.
    double* xyz = nullptr;           ///< X, Y, Z of each patch, 0 to 100.
    double* lab = nullptr;           ///< L*, a*, b* of each patch.
    spectralRow* spectral = nullptr; ///< Null when there are no spectra.
    double* cmyk = nullptr;          ///< C, M, Y, K of each patch; references 0 to 100, measured
                                     ///< values 0 to 255.
    double* reservedValues = nullptr;
    int reservedInt4 = 0;
    int reservedInt5 = 0;
    int deltaEType = 0; ///< 2 CIECMC, 3 CIE94, 4 CIE2000, 5 CIECMC_2_1, any other CIE76.
};

/// One job, built once per run.
///
/// A copy has its own texts and shares childJobIDs and the arrays of measurement. Destruction frees
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
    int deviceID = 0;            ///< Measuring instrument; 0 is unknown.
    int nestedStrip = 0;         ///< 1 when a nesting control strip was fetched.
    int* childJobIDs = nullptr;  ///< From malloc; freed by the owner of the job.
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
    double measuredValues[presetValueCount] = {}; ///< Of an inline job; all -1.0 when absent.
};
