// SPDX-License-Identifier: Apache-2.0
// Exports the patches of a result for a spreadsheet or a script.
#pragma once

#include <string>
#include <string_view>

#include "report/Result.h"

namespace report {

/// A line with the column names and one line for each patch, in the result's order: id, name, the
/// device values under their channels' names, target_L, target_a, target_b, measured_L, measured_a,
/// measured_b, difference, and the id and name on the sheet, measured_id and measured_name. The
/// page's own export has the same columns.
///
/// UTF-8 with line feeds; cells are quoted if necessary (RFC 4180). An apostrophe precedes text
/// that a spreadsheet would interpret as a formula. Missing numbers are empty cells.
std::string patchesCsv(const Result& result);

/// A cell of text, as above. Commas and line ends are the caller's.
void appendCsvText(std::string& csv, std::string_view text);

/// A cell with a number, shortest, without an exponent; empty if it is not finite.
void appendCsvNumber(std::string& csv, double value);

} // namespace report
