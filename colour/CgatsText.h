// SPDX-License-Identifier: Apache-2.0
// Reads CGATS.17 / IT8 text as found in practice, and writes it as the standard specifies.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "colour/DataSet.h"
#include "colour/Failure.h"

namespace colour {

/// A text above these limits is TooLarge. They bound time and memory for hostile input.
inline constexpr std::size_t maxCgatsBytes = std::size_t{4} << 30;
inline constexpr std::size_t maxCgatsColumns = 4096;
inline constexpr std::size_t maxCgatsPatches = 10'000'000;

/// The data that a caller needs; the reader skips the rest.
struct CgatsWants {
    bool spectra = true;        ///< False: keep spectra only if they are the only colour values.
    bool singleInks = false;    ///< True: spectra of paper and single inks are enough.
    bool calculated = false;    ///< True: usable spectra replace stated colour values.
    std::string condition = {}; ///< "M1": read this condition if a file has several (readCxf).
};

/// In these functions, text is UTF-8, Latin-1, Windows-1252, or UTF-16 with a byte order mark.

/// True if the bytes may be CGATS text: no NUL, and a known first line, a keyword, or a format.
bool looksLikeCgats(std::string_view bytes);

/// Reads all tables of a text and joins them into one data set. Columns of tables with the same
/// rows are joined by id; a table that adds nothing is skipped.
///
/// Rows keep the text's order, including repeated ids. Scales are determined from whole columns.
/// The set's notes list assumptions and repairs. A truncated text is Damaged: without END_DATA it
/// must have the stated number of rows, and the last row must have its line end.
///
/// If a text states an illuminant other than D50 or an observer other than 2 degrees, it is read as
/// if `wants.calculated` were true.
///
/// The data set has colour values, device values, or both, all of them finite. The caller checks
/// whether it has what it needs. On failure, `set` is unchanged.
Failure readCgats(std::string_view bytes, const CgatsWants& wants, DataSet& set);

/// Value of a header keyword (upper or lower case), in UTF-8: the quoted text, or else the rest of
/// the line. The first line that starts with the keyword counts; KEYWORD lines do not. Empty if the
/// keyword has no value.
///
/// The text may be incomplete, like definitions for measuring tools: an undeclared keyword, or one
/// after the format; wrong or missing counts; no END_DATA.
std::optional<std::string> cgatsKeyword(std::string_view bytes, std::string_view keyword);

/// Text of a data set: CGATS.17 with LF, ids, device values, and any XYZ, Lab and spectra, so that
/// readCgats returns the same numbers.
std::string writeCgats(const DataSet& set);

} // namespace colour
