// SPDX-License-Identifier: Apache-2.0
// The measured patches as the job's record holds them.
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

/// Gathers the measurement of a comparison: all its patches in its own order, or with a patch set
/// or a profile those that were compared.
///
/// XYZ 0 to 100, Lab, reflectances 0 to 1, CMYK 0 to 255. Device values that the measurement lacks
/// come from the patch that it was compared with, else they are 0. Spectra of more than 36 values
/// are thinned to 10 nm from 380 to 730, or left out where their axis has no such wavelengths.
/// Throws std::bad_alloc.
MeasuredPatches measuredPatches(const Comparison& comparison);

/// Frees what the record held and puts the patches in its place. deltaEType is the number that the
/// comparison was asked for.
void storeMeasurement(MeasuredPatches patches, int deltaEType, measurementDataRecord& record);

} // namespace analysis
