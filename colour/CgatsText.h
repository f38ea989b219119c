// SPDX-License-Identifier: Apache-2.0
// Reading CGATS.17 / IT8 text as it is met in the wild, and writing it as the standard has it.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "colour/DataSet.h"
#include "colour/Failure.h"

namespace colour {

/// Beyond these a text is refused with TooLarge. They bound time and memory under hostile input.
inline constexpr std::size_t maxCgatsBytes = std::size_t{4} << 30;
inline constexpr std::size_t maxCgatsColumns = 4096;
inline constexpr std::size_t maxCgatsPatches = 10'000'000;

/// What a caller needs of a file; the reader skips the rest.
struct CgatsWants {
    bool spectra = true;     ///< False: spectra are kept only if they are the sole colour values.
    bool calculated = false; ///< True: usable spectra take the place of stated colour values.
    std::string condition = {}; ///< "M1": read this one of several that a file has (readCxf).
};

/// In all of this, text is UTF-8, Latin-1 or Windows-1252, or UTF-16 with a byte order mark.

/// True if the bytes could be CGATS text: no NUL, and a known first line, a keyword, or a format.
bool looksLikeCgats(std::string_view bytes);

/// Reads all tables of a text and joins them into one data set (columns of tables with the same
/// rows are joined by id; a table that adds nothing is skipped).
///
/// Rows stay in the text's order, repeated ids included. Scales are decided by whole columns. What
/// had to be assumed or mended is in the set's notes, but a text that breaks off is Damaged:
/// without END_DATA it must hold the stated number of rows, the last one with its line end.
///
/// A text that states another illuminant than D50 or another observer than 2 degrees is read as if
/// `wants.calculated` were true.
///
/// Gives a data set with colour values, device values, or both, all of them finite; which of them a
/// caller needs is the caller's affair. On failure `set` is left as it was.
Failure readCgats(std::string_view bytes, const CgatsWants& wants, DataSet& set);

/// Value of a header keyword (in either case), UTF-8: the quoted text, else the rest of the line.
/// The first line that begins with the keyword counts, KEYWORD lines don't; empty where it has no
/// value.
///
/// The text may be incomplete, as definitions for measuring tools are: the keyword not declared or
/// behind the format, counts that lie or are missing, no END_DATA.
std::optional<std::string> cgatsKeyword(std::string_view bytes, std::string_view keyword);

/// Text of a data set: CGATS.17, LF, ids, device values, XYZ, Lab and spectra where there are any,
/// written so that readCgats gives the same numbers again.
std::string writeCgats(const DataSet& set);

} // namespace colour
