// SPDX-License-Identifier: Apache-2.0
// The measured patches as stored in the job's record.
#pragma once

#include "analysis/Comparison.h"
#include "base/Malloc.h"
#include "job/JobRecords.h"

namespace analysis {

/// The arrays of a record before it takes them over.
struct MeasuredPatches {
    int count = 0;
    base::Malloced<double[]> xyz;
    base::Malloced<double[]> lab;
    base::Malloced<double[]> cmyk;
    base::Malloced<spectralRow[]> spectral; ///< Null without spectra that fit.
};

/// Collects the measurement of a comparison: all its patches in its order. With a patch set or a
/// profile, only the compared patches.
///
/// XYZ 0 to 100, Lab, reflectances 0 to 1, CMYK 0 to 255. Device values that the measurement lacks
/// come from the patch that it was compared with, otherwise they are 0. Spectra of more than 36
/// values are reduced to 10 nm from 380 to 730, or left out if their axis lacks these wavelengths.
/// Throws std::bad_alloc.
MeasuredPatches measuredPatches(const Comparison& comparison);

/// Frees the arrays of the record and replaces them with the patches. deltaEType is the number that
/// the comparison was requested with.
void storeMeasurement(MeasuredPatches patches, int deltaEType, measurementDataRecord& record);

} // namespace analysis
