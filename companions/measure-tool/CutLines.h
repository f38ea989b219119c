// SPDX-License-Identifier: Apache-2.0
// Repairs tables of definitions that may have cut lines.
#pragma once

#include <cstddef>
#include <span>
#include <string>

namespace measuretool {

/// The lines of one table, without their line ends.
struct TableLines {
    std::string& names;          ///< The line with the column names.
    std::span<std::string> rows; ///< May include blank lines and comments.
    std::size_t fieldCount = 0;  ///< From NUMBER_OF_FIELDS; 0 if absent.
    bool isWritten = true; ///< False for a strip in its original form, which no writer has cut.
};

/// The writer cuts each line after 511 bytes, and one byte earlier for each continuation byte of
/// its characters. If any line may have been cut like this, only ids, names and device values stay
/// in the table, separated by one tab: the cells that a cut may have damaged are not needed.
/// Otherwise only the names of references are replaced.
///
/// A table without device values keeps its references, because a reader recognises it by them.
///
/// Throws Failure (BadDefinition) if a cut may have reached an id, a device value or their column's
/// name, if the columns can't be separated, or if rows have cells without a column name.
void dropCutCells(const TableLines& table);

} // namespace measuretool
