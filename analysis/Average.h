// SPDX-License-Identifier: Apache-2.0
// One measurement made of several of the same chart.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "colour/DataSet.h"

namespace analysis {

/// How far the readings of one patch lie apart: colour differences (CIEDE2000) of each from the
/// mean of all.
struct PatchSpread {
    double mean = 0;
    double largest = 0;
    std::size_t furthest = 0; ///< Which of the measurements has the largest.
};

struct Average {
    colour::DataSet mean;            ///< Rows, labels and device values are those of the first.
    std::vector<PatchSpread> spread; ///< One a row.
    bool hasSpectra = false;         ///< All measurements have spectra on the same wavelengths.
};

/// Averages measurements, patch by patch: Lab and XYZ in XYZ, spectra in reflectance if all of them
/// have the same wavelengths, otherwise these are left out. Rows go together by device values, else
/// by labels, as in a comparison; a chart that repeats patches keeps all its rows.
///
/// Gives an empty text, or a sentence that says why they can't be averaged: rows without a
/// counterpart, no way to tell rows apart, or other conditions of measurement, illuminant or
/// observer. REQUIRES: two sets at least, all with colours.
std::string average(const std::vector<colour::DataSet>& sets, Average& result);

} // namespace analysis
