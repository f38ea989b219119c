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

/// What a reader had to assume or mend: each remark once, and no more than a person reads.
class Notes {
  public:
    void add(std::string note);
    std::vector<std::string> take() { return std::move(m_notes); }

  private:
    std::vector<std::string> m_notes;
};

/// One table as the file has it: scales are not decided, nothing is derived.
struct Table {
    DataSet set; ///< Rows and columns alone; no header texts.
    SpectralUnit unit = SpectralUnit::Unstated;
    bool unevenSpectra = false;
    TableKind kind = TableKind::Patches;
};

/// What the header said of the rows.
struct TableHeader {
    std::vector<std::string> names; ///< One at least.
    const CharTable* chars = &blanksSeparate;
    std::optional<unsigned long long> fieldCount;
    std::optional<unsigned long long> setCount;
    bool hasBegin = true; ///< False for a bare list of rows without BEGIN_DATA.
};

/// Reads the rows of one table, up to END_DATA or the end of the text.
class RowReader {
  public:
    /// `text` is the whole text, `ascii` whether it is ASCII throughout. All arguments outlive the
    /// reader.
    RowReader(std::string_view text, bool ascii, const TableHeader& header, const CgatsWants& wants,
              Notes& notes);

    /// Reads the rows that start at `at`, which is behind END_DATA afterwards.
    Failure read(const char*& at, Table& table);

  private:
    enum class Form {
        Lines, ///< A row is a line, blanks and tabs in any number part its cells.
        Cells, ///< A row is a line, each separator ends a cell, so that cells can be empty.
        Stream ///< Rows run on over line ends: only the number of cells parts them.
    };

    // The first row settles how the others are read.
    Form inspectFirstRow();
    Form formOfWords(const char* behind);
    std::size_t mostWords() const;
    bool cellsBySpreadsheet(std::string_view row);
    bool completedByNextLines(const char* at);
    bool namesAreLost(const char* behind) const;
    void useNames(const std::vector<std::string>& names, const std::vector<double>& firstRow);
    void reserveRows();

    // Each row.
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

    // All rows together.
    Failure checkEnd();
    std::size_t unreadableIn(const Group& group) const;
    Failure dropUnreadableGroups();

    const char* m_end;
    bool m_ascii;
    const TableHeader& m_header;
    const CgatsWants& m_wants;
    Notes& m_notes;

    const char* m_begin = nullptr; ///< Where the rows begin.
    const char* m_at = nullptr;    ///< The row at hand, or behind the last one.
    bool m_ended = false;          ///< END_DATA was met.
    const CharTable* m_chars;
    NumberReader m_numbers;
    Layout m_layout;
    DataSet m_set;
    std::vector<std::size_t> m_unreadable; ///< Cells that are no number, by slot.
    bool m_wavelengthsDiffer = false;

    // The row at hand.
    std::vector<double> m_values;
    Word m_id;
    Word m_name;
    std::vector<Word> m_words;
    std::string m_unwrapped; ///< A line that stood in quotes; m_words point into it.
};

} // namespace colour::cgats
