// SPDX-License-Identifier: Apache-2.0
// The element for one measurement:
//
//     <tazo:Measurement Date="2024-05-31" Time="13:37:00" Comment="Remote confirmation M1"
//       Approval="true" MaxDeltaE="3120000" TotalPass="true" CMMVersion="1.1.2.3"
//       MaxToleranc="5000000" TypeOfDeltaE="CIE2000" AverageDeltaE="1200000"
//       SpectralCount="72" PaperWhitePass="true" AverageToleranc="3000000">
//     <FileSpec URL="cid:" MimeType="application/icc" UserFileName=""
//       DescriptiveName="EmbeddedProfileName"/>
//     <tazo:PatchDefinitionData0 CValue="100000000" KValue="0" MValue="0" YValue="0"/>
//     <tazo:PatchData XValue="1493" YValue="2171" ZValue="5214"/>
//     <tazo:SpectralData0 dvalue0="82000"dvalue1="95000" ... dvalue35="12000"/>
//     </tazo:Measurement>
//
// The opening tag is one line and so is FileSpec. The second strip's element is tazo:Measurement2.
// Tolerances, differences, device values in percent and reflectances are integers in millionths,
// XYZ values in hundredths. Readers of the file expect the misspelt names and the missing blank
// between spectral values (C76).
#pragma once

#include <wx/string.h>

#include "job/JobRecords.h"

/// Data of a measurement other than its values. Texts end at a NUL or at the end of their field.
struct JDFMeasurementHeader {
    char printDate[16] = {}; ///< ISO form, like printTime.
    char printTime[16] = {};
    char measureDate[16] = {}; ///< If both are empty, the time of writing.
    char measureTime[16] = {};
    char deltaEType[16] = {}; ///< "CIELAB" becomes "CIE Lab", in this field too (C79).
    char cmmVersion[16] = {};
    unsigned char secondStrip = 0; ///< 0 first strip, 1 second; others have no element.
    unsigned char party = 0;       ///< Who printed: 1 the sender, 2 the receiver, else nobody.
    bool approval = false;
    bool totalPass = false;
    bool paperWhitePass = false;
    double maxTolerance = 0;
    double maxDeltaE = 0;
    double averageTolerance = 0;
    double averageDeltaE = 0;
    bool writePatchDefinitions = false;
    char profileName[256] = {};                   ///< The first 180 bytes are written.
    measurementDataRecord* measurement = nullptr; ///< Not used here.
};

/// Writes the element into a buffer (see JdfBuffer.h), in pieces: one per line and up to six for a
/// line of spectral values. A piece that would reach the limit is left out and gives -30. Up to and
/// including FileSpec, writing continues after such a piece, and only the result of FileSpec
/// counts. In the patches, the first such piece ends the work.
///
/// Null arrays of the measurement give no lines. Spectra have 36 values whatever their length
/// (C77). The comment is converted to the C library's 8 bits and cut to 180 bytes.
///
/// Returns 0 or -30.
int WriteJDFMeasureData(char* at, char* buffer, char* limit, long* length,
                        measurementDataRecord measurement, JDFMeasurementHeader* header,
                        wxString comment);
