// SPDX-License-Identifier: Apache-2.0
// The rows of one table.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "colour/CgatsColumns.h"
#include "colour/CgatsLines.h"
#include "colour/CgatsNumbers.h"
#include "colour/CgatsText.h"

namespace colour::cgats {

/// Assumptions and repairs of a reader: each remark once, and only as many as a person reads.
class Notes {
  public:
    void add(std::string note);
    std::vector<std::string> take() { return std::move(m_notes); }

  private:
    std::vector<std::string> m_notes;
};

/// One table as in the file: scales are not determined and nothing is derived yet.
struct Table {
    DataSet set; ///< Only rows and columns; no header texts.
    SpectralUnit unit = SpectralUnit::Unstated;
    bool unevenSpectra = false;
    TableKind kind = TableKind::Patches;
};

/// Information on the rows from the header.
struct TableHeader {
    std::vector<std::string> names; ///< At least one.
    const CharTable* chars = &blanksSeparate;
    std::optional<unsigned long long> fieldCount;
    std::optional<unsigned long long> setCount;
    bool hasBegin = true; ///< False for a bare list of rows without BEGIN_DATA.
};

/// Reads the rows of one table, up to END_DATA or the end of the text.
class RowReader {
  public:
    /// `text` is the whole text. `ascii` is true if all of it is ASCII. All arguments must outlive
    /// the reader.
    RowReader(std::string_view text, bool ascii, const TableHeader& header, const CgatsWants& wants,
              Notes& notes);

    /// Reads the rows that start at `at` and moves `at` past END_DATA.
    Failure read(const char*& at, Table& table);

  private:
    enum class Form {
        Lines, ///< A row is a line; any number of blanks and tabs separates cells.
        Cells, ///< A row is a line; each separator ends a cell, so cells can be empty.
        Stream ///< Rows ignore line ends; only the number of cells separates them.
    };

    // Based on the first row.
    Form inspectFirstRow();
    Form formOfWords(const char* behind);
    std::size_t mostWords() const;
    bool cellsBySpreadsheet(std::string_view row);
    bool completedByNextLines(const char* at);
    bool namesAreLost(const char* behind) const;
    void useNames(const std::vector<std::string>& names, const std::vector<double>& firstRow);
    void reserveRows();

    // For each row.
    Failure readRows(Form form);
    bool findRow();
    bool takeEndOfData();
    std::string_view lineAtHand() const;
    template<Form form>
    const char* toCell(const char* at, bool isFirst) const;
    template<Form form>
    bool quickRow();
    template<Form form>
    bool quickNumber(const char*& at, std::size_t slot);
    Failure carefulRow();
    bool cellsBySeparator(std::string_view row);
    std::vector<Word> joinedNames() const;
    bool holdSeveralRows() const;
    Failure appendSeveralRows();
    bool allNumbers(const Word* cells) const;
    void place(const Word* cells);
    std::string textOf(const Word& word) const;
    void append();

    // After all rows.
    Failure checkEnd();
    std::size_t unreadableIn(const Group& group) const;
    Failure dropUnreadableGroups();

    const char* m_end;
    bool m_ascii;
    const TableHeader& m_header;
    const CgatsWants& m_wants;
    Notes& m_notes;

    const char* m_begin = nullptr; ///< Start of the rows.
    const char* m_at = nullptr;    ///< The current row, or the end of the last one.
    bool m_ended = false;          ///< END_DATA was found.
    const CharTable* m_chars;
    NumberReader m_numbers;
    Layout m_layout;
    DataSet m_set;
    std::vector<std::size_t> m_unreadable; ///< Cells that are not numbers, by slot.
    bool m_wavelengthsDiffer = false;

    // The current row.
    std::vector<double> m_values;
    Word m_id;
    Word m_name;
    std::vector<Word> m_words;
    std::string m_unwrapped; ///< An unquoted line; m_words point into it.
};

} // namespace colour::cgats
