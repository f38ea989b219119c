// SPDX-License-Identifier: Apache-2.0
// Combines the tables of a text into one data set: joining, scales, and derived values.
#pragma once

#include "colour/CgatsRows.h"

namespace colour::cgats {

/// Information on scales from a header.
enum class ScaleHint {
    None,
    Stated,    ///< From our own writer (TINTGATE_SCALES): scales of a DataSet.
    NeverOfOne ///< A text of ArgyllCMS: device values and XYZ are never 0 to 1.
};

/// Adds another table to the first one: new columns for the same patches, or more patches with the
/// same columns. Any other table is left out.
void joinTable(Table& first, Table&& next, Notes& notes);

/// Converts all values to the scales of a DataSet and derives the values that are not stated.
///
/// A scale is determined from the whole column, never per row: first from values stated in two ways
/// (XYZ and Lab, spectra and Y), then from the column's name, then from the largest value.
Failure complete(Table& table, ScaleHint hint, const CgatsWants& wants, Notes& notes);

} // namespace colour::cgats
