// SPDX-License-Identifier: Apache-2.0
// Tables of definitions, whose lines the writer may have cut.
#pragma once

#include <cstddef>
#include <span>
#include <string>

namespace measuretool {

/// The lines of one table, without their line ends.
struct TableLines {
    std::string& names;          ///< The one line that names the columns.
    std::span<std::string> rows; ///< Blank lines and comments may be among them.
    std::size_t fieldCount = 0;  ///< As NUMBER_OF_FIELDS states it; 0 if nothing does.
    bool isWritten = true;       ///< False for a strip as it is, which no writer has cut.
};

/// The writer ends each line after 511 bytes, and earlier by one byte for each byte that its
/// characters have beyond their first. If any line may have been cut like this, only ids, names and
/// device values stay in the table, one tab between two of them: what a cut may have damaged after
/// these is not needed. Otherwise only the names of references go.
///
/// A table without device values keeps its references: by them a reader recognises it.
///
/// Throws Failure (BadDefinition) if a cut may have reached an id, a device value or the name of
/// their column, or if the table's columns can't be told apart. Also throws if rows have cells
/// that no column's name belongs to.
void dropCutCells(const TableLines& table);

} // namespace measuretool
