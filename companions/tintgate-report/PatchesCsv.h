// SPDX-License-Identifier: Apache-2.0
// The patches of a result for a spreadsheet or a script.
#pragma once

#include <string>
#include <string_view>

#include "report/Result.h"

namespace report {

/// A line for the names of the columns and one for each patch, in the result's order: id, name, the
/// device values under their channels' names, target_L, target_a, target_b, measured_L, measured_a,
/// measured_b, difference, and the id and name on the sheet,
/// measured_id and measured_name. These are the columns of the page's own export.
///
/// UTF-8, lines end with a line feed, cells are quoted where they need to be (RFC 4180). A text
/// that a spreadsheet would run as a formula gets an apostrophe in front. No number is an empty
/// cell.
std::string patchesCsv(const Result& result);

/// A cell of text, as above. Commas and line ends are the caller's.
void appendCsvText(std::string& csv, std::string_view text);

/// A cell with a number, shortest, without an exponent; empty if it is not finite.
void appendCsvNumber(std::string& csv, double value);

} // namespace report
