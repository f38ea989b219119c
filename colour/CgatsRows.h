// The rows of one table.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "colour/CgatsColumns.h"
#include "colour/CgatsLines.h"
#include "colour/CgatsText.h"

namespace colour::cgats {

/// What a reader had to assume or mend: each remark once, and so many that a person reads them.
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
    std::vector<std::string> names;
    const CharTable* chars = &blanksSeparate;
    std::optional<unsigned long long> fieldCount;
    std::optional<unsigned long long> setCount;
    bool hasBegin = true; ///< False for a bare list of rows without BEGIN_DATA.
};

/// Reads rows up to END_DATA or the end of the text.
class RowReader {
  public:
    /// `text` is the whole text, `ascii` whether it is ASCII throughout; both outlive the reader.
    RowReader(std::string_view text, bool ascii, const CgatsWants& wants, Notes& notes)
        : m_end(text.data() + text.size()), m_ascii(ascii), m_wants(wants), m_notes(notes) {}

    /// Reads the rows that start at `at`, which is behind END_DATA afterwards.
    Failure read(const char*& at, TableHeader header, Table& table);

  private:
    enum class Form {
        Lines, ///< A row is a line, blanks and tabs in any number part its cells.
        Cells, ///< A row is a line, each separator ends a cell, so that cells can be empty.
        Stream ///< Rows run on over line ends: only the number of cells parts them.
    };

    Form inspectFirstRow();
    std::size_t mostWords() const;
    bool cellsBySpreadsheet(std::string_view row);
    bool followingLinesComplete(const char* at, std::size_t have) const;
    bool namesAreLost(const char* behind, std::size_t found) const;

    bool findRow();
    std::string_view lineAtHand() const;
    bool takeEndOfData();
    template<Form form>
    bool quickRow();
    Failure carefulRow();
    bool cellsBySeparator(std::string_view line);
    bool joinNames();
    Failure severalRows();
    void place(const Word* cells, std::size_t count);
    bool allNumbers(const Word* cells) const;
    double readNumber(std::string_view text);
    bool shortNumber(const char*& at, double& value);
    bool plainNumber(const char*& at, double& value);
    void append();
    std::string textOf(const Word& word) const;

    Failure checkEnd(const char* end);
    Failure dropUnreadableGroups();

    const char* m_end;
    bool m_ascii;
    const CgatsWants& m_wants;
    Notes& m_notes;

    const char* m_begin = nullptr; ///< Where the rows begin.
    const char* m_at = nullptr;
    TableHeader m_header;
    const CharTable* m_chars = &blanksSeparate;
    Layout m_layout;
    DataSet* m_set = nullptr;
    bool m_ended = false; ///< END_DATA was met.

    std::vector<double> m_values; ///< Of the row at hand.
    Word m_id;
    Word m_name;
    std::vector<Word> m_words;
    std::string m_unwrapped; ///< A line that stood in quotes; m_words point into it.

    bool m_hasPoints = false;    ///< A number was written with a decimal point,
    bool m_hasCommas = false;    ///< one with a comma,
    bool m_hasThousands = false; ///< and one that may mean thousands: 1,234.
    bool m_wavelengthsDiffer = false;
    std::vector<std::size_t> m_unreadable; ///< Cells that are no number, by slot.
};

/// The number that a cell holds, with a point or `comma`; a NaN for anything else.
double numberIn(std::string_view text, char comma);

} // namespace colour::cgats
