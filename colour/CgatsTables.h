// SPDX-License-Identifier: Apache-2.0
// From the tables of a text to one data set: joining, scales, and values worked out from others.
#pragma once

#include "colour/CgatsRows.h"

namespace colour::cgats {

/// What a header tells of the scales.
enum class ScaleHint {
    None,
    Stated,    ///< By our own writer (TINTGATE_SCALES): as in a DataSet.
    NeverOfOne ///< A text of ArgyllCMS: device values and XYZ are never 0 to 1.
};

/// Takes a further table into the first one: new columns for the same patches, or more patches of
/// the same columns. A table that is neither is left out.
void joinTable(Table& first, Table&& next, Notes& notes);

/// Brings all values to the scales of a DataSet and works out the ones that are not stated.
///
/// A scale is decided by the whole column, never row by row: first by what is stated in two ways
/// (XYZ and Lab, spectra and Y), then by a name that tells it, then by the largest value.
Failure complete(Table& table, ScaleHint hint, const CgatsWants& wants, Notes& notes);

} // namespace colour::cgats
