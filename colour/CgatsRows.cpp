// SPDX-License-Identifier: Apache-2.0
// Rows of a table.
//
//     BEGIN_DATA
//     1  A1  0    0  0  0   95.00  0.00  -2.00        one row, one line: nearly always
//     2  "Cyan solid"  100  0  0  0  55.0 -37.0 -50.0  quoted, with blanks inside
//     3  Light cyan  50  0  0  0   75,4 -18,1 -25,9    not quoted, decimal commas
//     END_DATA
//
// Nearly all rows take the fast path: one pass over the bytes, with numbers stored directly in the
// row's values. A row that does not fit is parsed again more carefully.
#include "colour/CgatsRows.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace colour::cgats {

namespace {

constexpr std::size_t mostNotes = 50;

/// Maximum number of words after a line's columns: names with many blanks.
constexpr std::size_t surplusWords = 64;

std::string counted(std::size_t number, const char* what) {
    return std::to_string(number) + ' ' + what;
}

} // namespace

void Notes::add(std::string note) {
    if (m_notes.size() < mostNotes &&
        std::find(m_notes.begin(), m_notes.end(), note) == m_notes.end()) {
        m_notes.push_back(std::move(note));
    }
}

RowReader::RowReader(std::string_view text, bool ascii, const TableHeader& header,
                     const CgatsWants& wants, Notes& notes)
    : m_end(text.data() + text.size()), m_ascii(ascii), m_header(header), m_wants(wants),
      m_notes(notes), m_chars(header.chars), m_numbers(*header.chars) {}

Failure RowReader::read(const char*& at, Table& table) {
    m_begin = m_at = at;
    useNames(m_header.names, {});
    const Form form = findRow() ? inspectFirstRow() : Form::Lines;
    if (m_layout.columns.size() > maxCgatsColumns) {
        return Failure::TooLarge;
    }
    for (const std::string& note : m_layout.notes) {
        m_notes.add(note);
    }
    m_set.deviceSpace = m_layout.deviceSpace;
    m_set.channels = m_layout.channels;
    m_set.axis = m_layout.axis;
    reserveRows();

    Failure failure = readRows(form);
    if (failure == Failure::None) {
        failure = checkEnd();
    }
    if (failure == Failure::None && m_numbers.isAmbiguous()) {
        failure = Failure::NotNumeric;
    }
    if (failure == Failure::None) {
        failure = dropUnreadableGroups();
    }
    if (failure != Failure::None) {
        return failure;
    }
    if (m_numbers.sawCommas()) {
        m_notes.add("Commas are read as decimal points.");
    }
    at = m_at;
    table.set = std::move(m_set);
    table.unit = m_layout.unit;
    table.unevenSpectra = m_layout.unevenSpectra || m_wavelengthsDiffer;
    table.kind = m_layout.kind;
    return Failure::None;
}

void RowReader::useNames(const std::vector<std::string>& names,
                         const std::vector<double>& firstRow) {
    m_layout = layoutOf(names, firstRow, m_wants.spectra);
    m_values.assign(m_layout.valueCount, 0);
    m_unreadable.assign(m_layout.valueCount, 0);
}

/// Reserves the stated number of rows. A cell takes at least two bytes, so a wrong count can't
/// request more than the text can contain.
void RowReader::reserveRows() {
    const std::size_t room =
        static_cast<std::size_t>(m_end - m_at) / (2 * m_layout.columns.size()) + 1;
    if (!m_header.setCount || *m_header.setCount > std::min(room, maxCgatsPatches)) {
        return;
    }
    const auto rows = static_cast<std::size_t>(*m_header.setCount);
    m_set.device.reserve(rows * m_layout.device.count);
    m_set.spectra.reserve(rows * m_layout.spectra.count);
    m_set.xyz.reserve(m_layout.xyz.count > 0 ? rows : 0);
    m_set.lab.reserve(m_layout.lab.count > 0 ? rows : 0);
    m_set.ids.reserve(m_layout.hasIds ? rows : 0);
    m_set.names.reserve(m_layout.hasNames ? rows : 0);
}

Failure RowReader::readRows(Form form) {
    while (!m_ended && findRow()) {
        if (m_set.patchCount == maxCgatsPatches) {
            return Failure::TooLarge;
        }
        const bool quick = form == Form::Lines   ? quickRow<Form::Lines>()
                           : form == Form::Cells ? quickRow<Form::Cells>()
                                                 : quickRow<Form::Stream>();
        if (quick) {
            append();
            continue;
        }
        if (form == Form::Stream) {
            return Failure::Damaged;
        }
        if (const Failure failure = carefulRow(); failure != Failure::None) {
            return failure;
        }
    }
    return Failure::None;
}

/// Moves to the next line that is not blank or a comment. False at END_DATA and at the end.
bool RowReader::findRow() {
    while (true) {
        while (m_at != m_end && !m_chars->isPlain(*m_at)) {
            ++m_at;
        }
        if (m_at == m_end) {
            return false;
        }
        if (*m_at != '#') {
            break;
        }
        m_at = lineEndOf(m_at, m_end);
    }
    return !takeEndOfData();
}

/// The whole line, including separators before an empty first cell.
std::string_view RowReader::lineAtHand() const {
    const char* start = m_at;
    while (start != m_begin && m_chars->isBlank(start[-1])) {
        --start;
    }
    return {start, static_cast<std::size_t>(lineEndOf(m_at, m_end) - start)};
}

bool RowReader::takeEndOfData() {
    if (*m_at != 'E' && *m_at != 'e' && *m_at != '"') {
        return false;
    }
    const char* after = m_at;
    const Word word = takeWord(after, m_end, *m_chars);
    if (!sameWord(word.text, "END_DATA")) {
        return false;
    }
    if (word.quoted) { // alone in its line; otherwise it is an id
        after = skipBlanks(after, m_end, *m_chars);
        if (after != m_end && !m_chars->isLineEnd(*after)) {
            return false;
        }
    }
    m_at = lineEndOf(after, m_end);
    m_ended = true;
    return true;
}

/// Determines from the first row the cells' separator, their number, and whether lines matter.
RowReader::Form RowReader::inspectFirstRow() {
    const std::string_view line = lineAtHand();
    const std::string_view row = unwrapLine(line, m_unwrapped) ? m_unwrapped : line;
    Form form = Form::Cells;
    if (!cellsBySeparator(row) && !cellsBySpreadsheet(row)) {
        if (!splitWords(row, *m_chars, mostWords(),
                        m_words)) { // the inspected text has only whole rows
            m_words.resize(m_words.size() - m_words.size() % m_layout.columns.size());
        }
        form = formOfWords(line.data() + line.size());
    }
    std::vector<std::string> names = m_header.names;
    if (form == Form::Lines && m_words.size() > names.size() &&
        namesAreLost(line.data() + line.size())) {
        m_notes.add("There are " + counted(names.size(), "column names for rows of ") +
                    counted(m_words.size(), "cells: the cells after the named ones are skipped."));
        names.resize(m_words.size());
    }
    std::vector<double> numbers; // for SPECTRAL_NM
    for (const Word& word : m_words) {
        const double number = numberIn(word.text, m_chars->decimalComma());
        numbers.push_back(std::isnan(number) ? 0 : number);
    }
    useNames(names, numbers);
    m_numbers = NumberReader(*m_chars);
    return form;
}

/// Form of a table whose first row, in m_words, is separated by any number of blanks.
RowReader::Form RowReader::formOfWords(const char* behind) {
    const std::size_t width = m_layout.columns.size();
    const std::size_t found = m_words.size();
    if (found < width && completedByNextLines(behind)) {
        m_notes.add("Rows continue over several lines.");
        return Form::Stream;
    }
    if (m_header.fieldCount != found && holdSeveralRows()) {
        m_notes.add("Some lines contain several rows.");
        return Form::Stream;
    }
    return Form::Lines;
}

/// Maximum number of words in a line; longer lines are invalid.
std::size_t RowReader::mostWords() const {
    return std::max(2 * m_layout.columns.size(), maxCgatsColumns) + surplusWords;
}

/// True if semicolons or commas, but not blanks, give a whole row, although not used by the names.
bool RowReader::cellsBySpreadsheet(std::string_view row) {
    splitWords(row, *m_chars, mostWords(), m_words);
    if (m_chars != &blanksSeparate || m_words.size() >= m_layout.columns.size()) {
        return false;
    }
    for (const CharTable* chars : {&semicolonsSeparate, &commasSeparate}) {
        m_chars = chars;
        if (cellsBySeparator(row)) {
            return true;
        }
    }
    m_chars = &blanksSeparate;
    return false;
}

/// True if the lines from `at` on complete m_words to exactly one row, at a line end.
bool RowReader::completedByNextLines(const char* at) {
    const std::size_t width = m_layout.columns.size();
    const std::size_t have = m_words.size();
    std::vector<Word> words;
    while (m_words.size() < width) {
        while (at != m_end && !m_chars->isPlain(*at)) {
            ++at;
        }
        const std::string_view line(at, static_cast<std::size_t>(lineEndOf(at, m_end) - at));
        const bool fits = splitWords(line, *m_chars, width, words);
        if (at == m_end || !fits || (!words.empty() && sameWord(words[0].text, "END_DATA"))) {
            break;
        }
        m_words.insert(m_words.end(), words.begin(), words.end());
        at = line.data() + line.size();
    }
    if (m_words.size() == width) {
        return true;
    }
    m_words.resize(have);
    return false;
}

/// True if a first row with more cells than names belongs to columns with lost names: the header
/// counts them, or the next row has as many and no name with blanks explains it.
bool RowReader::namesAreLost(const char* behind) const {
    if (!allNumbers(m_words.data()) || m_header.fieldCount == m_layout.columns.size()) {
        return false;
    }
    if (m_header.fieldCount == m_words.size()) {
        return true;
    }
    const char* next = behind;
    while (next != m_end && !m_chars->isPlain(*next)) {
        ++next;
    }
    std::vector<Word> words;
    splitWords({next, static_cast<std::size_t>(lineEndOf(next, m_end) - next)}, *m_chars,
               mostWords(), words);
    return words.size() == m_words.size() && joinedNames().empty();
}

/// Moves to the first character of the next cell, or to the place of a missing one.
template<RowReader::Form form>
inline const char* RowReader::toCell(const char* at, bool isFirst) const {
    const CharTable& chars = *m_chars;
    if constexpr (form == Form::Cells) {
        const auto skip = [&] {
            while (at != m_end && chars.isBlank(*at) && *at != chars.cellSeparator()) {
                ++at;
            }
        };
        skip();
        if (!isFirst && at != m_end && *at == chars.cellSeparator()) {
            ++at;
            skip();
        }
        return at;
    }
    at = skipBlanks(at, m_end, chars);
    if constexpr (form == Form::Stream) {
        while (at != m_end && (!chars.isPlain(*at) || *at == '#')) {
            at = *at == '#' ? lineEndOf(at, m_end) : at + 1;
        }
    }
    return at;
}

/// Reads the current row in one pass. False if it needs careful parsing or, in a stream, is
/// incomplete; then nothing has moved.
template<RowReader::Form form>
bool RowReader::quickRow() {
    const CharTable& chars = *m_chars;
    const char* at = m_at;
    bool isFirst = true;
    if (form == Form::Cells && at != m_begin && at[-1] == chars.cellSeparator()) {
        return false; // the first cell is empty
    }
    for (const Column& column : m_layout.columns) {
        at = toCell<form>(at, isFirst);
        isFirst = false;
        if (at == m_end || !chars.isPlain(*at) || *at == '#') {
            return false;
        }
        switch (column.kind) {
        case Column::Skip:
            takeWord(at, m_end, chars);
            break;
        case Column::Number:
            if (!quickNumber<form>(at, column.slot)) {
                return false;
            }
            break;
        case Column::Id:
            m_id = takeWord(at, m_end, chars);
            break;
        case Column::Name:
            m_name = takeWord(at, m_end, chars);
            break;
        }
    }
    if constexpr (form != Form::Stream) {
        at = skipBlanks(at, m_end, chars);
        if (at != m_end && *at == '#') {
            at = lineEndOf(at, m_end);
        }
        if (at != m_end && !chars.isLineEnd(*at)) {
            return false;
        }
    }
    m_at = at;
    return true;
}

/// A stream can't be parsed again by lines, so text in place of a number is final.
template<RowReader::Form form>
inline bool RowReader::quickNumber(const char*& at, std::size_t slot) {
    if (m_numbers.readPlain(at, m_end, m_values[slot])) {
        return true;
    }
    const Word word = takeWord(at, m_end, *m_chars);
    const double value = m_numbers.read(word.text);
    if (std::isnan(value)) {
        if (form != Form::Stream || sameWord(word.text, "END_DATA")) {
            return false;
        }
        ++m_unreadable[slot];
    }
    m_values[slot] = value;
    return true;
}

/// Tries all ways to read the current line as rows: cells between strict separators, words, several
/// rows, a name with blanks, a remark after the last cell, missing last cells.
Failure RowReader::carefulRow() {
    const std::string_view line = lineAtHand();
    m_at = line.data() + line.size();
    const std::string_view row = unwrapLine(line, m_unwrapped) ? m_unwrapped : line;
    const std::size_t width = m_layout.columns.size();

    if (cellsBySeparator(row)) {
        place(m_words.data());
        append();
        return Failure::None;
    }
    if (!splitWords(row, *m_chars, mostWords(), m_words)) {
        return Failure::Damaged;
    }
    if (!m_words.empty() && sameWord(m_words.back().text, "END_DATA")) {
        m_words.pop_back();
        m_ended = true;
    }
    if (m_words.size() < width) {
        // Only cells that are not needed may be missing at the end of a row.
        const bool needed = std::any_of(
            m_layout.columns.begin() + static_cast<std::ptrdiff_t>(m_words.size()),
            m_layout.columns.end(), [](const Column& c) { return c.kind == Column::Number; });
        if (needed || m_words.empty()) {
            return Failure::Damaged;
        }
        m_words.resize(width);
    } else if (m_words.size() > width) {
        if (holdSeveralRows()) {
            return appendSeveralRows();
        }
        if (std::vector<Word> joined = joinedNames(); !joined.empty()) {
            m_words = std::move(joined);
            m_notes.add("Names with blanks are not quoted.");
        } else {
            const bool remark = std::isnan(numberIn(m_words[width].text, '.'));
            if (!remark || !allNumbers(m_words.data())) {
                return Failure::Damaged;
            }
            m_notes.add("Words after the last cell of a row are skipped.");
        }
    }
    place(m_words.data());
    append();
    return Failure::None;
}

/// Splits the row by its strict separator. True if this gives one cell per column.
bool RowReader::cellsBySeparator(std::string_view row) {
    const std::size_t width = m_layout.columns.size();
    if (row.find(m_chars->cellSeparator()) == std::string_view::npos) {
        return false;
    }
    if (!splitCells(row, *m_chars, width + maxCgatsColumns, m_words)) {
        return false;
    }
    while (m_words.size() > width && m_words.back().text.empty()) {
        m_words.pop_back();
    }
    return m_words.size() == width;
}

/// The cells of a row with more words than columns, if a name or id contains blanks. Empty
/// otherwise: all numbers must fit, and a name can't consist of numbers only.
std::vector<Word> RowReader::joinedNames() const {
    const auto surplus = static_cast<std::ptrdiff_t>(m_words.size() - m_layout.columns.size());
    for (const Column::Kind kind : {Column::Name, Column::Id}) {
        const auto column = std::find_if(m_layout.columns.begin(), m_layout.columns.end(),
                                         [&](const Column& c) { return c.kind == kind; });
        if (column == m_layout.columns.end()) {
            continue;
        }
        const auto first = m_words.begin() + (column - m_layout.columns.begin());
        const auto last = first + surplus;
        if (std::none_of(first, last + 1,
                         [](const Word& word) { return std::isnan(numberIn(word.text, ',')); })) {
            continue;
        }
        std::vector<Word> joined(m_words.begin(), first + 1);
        const char* const start = first->text.data();
        const char* const end = last->text.data() + last->text.size();
        joined.back().text = {start, static_cast<std::size_t>(end - start)};
        joined.insert(joined.end(), last + 1, m_words.end());
        if (allNumbers(joined.data())) {
            return joined;
        }
    }
    return {};
}

/// True if the words form two or more rows.
bool RowReader::holdSeveralRows() const {
    const std::size_t width = m_layout.columns.size();
    bool numbers = m_words.size() >= 2 * width && m_words.size() % width == 0;
    for (std::size_t first = 0; numbers && first < m_words.size(); first += width) {
        numbers = allNumbers(m_words.data() + first);
    }
    return numbers;
}

Failure RowReader::appendSeveralRows() {
    for (std::size_t first = 0; first < m_words.size(); first += m_layout.columns.size()) {
        if (m_set.patchCount == maxCgatsPatches) {
            return Failure::TooLarge;
        }
        place(m_words.data() + first);
        append();
    }
    m_notes.add("Some lines contain several rows.");
    return Failure::None;
}

/// True if every number cell is a number. REQUIRES: a word for every column.
bool RowReader::allNumbers(const Word* cells) const {
    for (const Column& column : m_layout.columns) {
        if (column.kind == Column::Number &&
            std::isnan(numberIn(cells->text, m_chars->decimalComma()))) {
            return false;
        }
        ++cells;
    }
    return true;
}

/// Stores cells in the row's values. Invalid numbers are counted; the whole table decides whether
/// they invalidate a group of columns.
void RowReader::place(const Word* cells) {
    for (const Column& column : m_layout.columns) {
        const Word& cell = *cells++;
        if (column.kind == Column::Id) {
            m_id = cell;
        } else if (column.kind == Column::Name) {
            m_name = cell;
        } else if (column.kind == Column::Number) {
            m_values[column.slot] = m_numbers.read(cell.text);
            m_unreadable[column.slot] += std::isnan(m_values[column.slot]) ? 1 : 0;
        }
    }
}

std::string RowReader::textOf(const Word& word) const {
    if (word.doubledQuotes) {
        return toUtf8(wordText(word));
    }
    return m_ascii ? std::string(word.text) : toUtf8(word.text);
}

void RowReader::append() {
    DataSet& set = m_set;
    const double* const values = m_values.data();
    const auto add = [&](std::vector<double>& target, const Group& group) {
        target.insert(target.end(), values + group.first, values + group.first + group.count);
    };
    ++set.patchCount;
    if (m_layout.hasIds) {
        set.ids.push_back(textOf(m_id));
    }
    if (m_layout.hasNames) {
        set.names.push_back(textOf(m_name));
    }
    if (m_layout.device.count > 0) {
        add(set.device, m_layout.device);
    }
    if (m_layout.xyz.count > 0) {
        const double* const xyz = values + m_layout.xyz.first;
        set.xyz.push_back({xyz[0], xyz[1], xyz[2]});
    }
    if (m_layout.lab.count > 0) {
        const double* const lab = values + m_layout.lab.first;
        set.lab.push_back({lab[0], lab[1], lab[2]});
    }
    if (m_layout.spectra.count > 0) {
        add(set.spectra, m_layout.spectra);
    }
    if (m_layout.wavelengths.count > 0 && !m_wavelengthsDiffer) {
        m_wavelengthsDiffer =
            !std::equal(m_layout.statedWavelengths.begin(), m_layout.statedWavelengths.end(),
                        values + m_layout.wavelengths.first);
    }
}

/// Checks the rows against the header's counts. A wrong count is noted, and the actual rows are
/// used. But missing rows at the end mean a truncated text.
Failure RowReader::checkEnd() {
    const std::size_t rows = m_set.patchCount;
    if (!m_ended && m_header.hasBegin) {
        const bool lineIsWhole = m_end[-1] == '\n' || m_end[-1] == '\r';
        if (m_header.setCount != rows || !lineIsWhole) {
            return Failure::Damaged;
        }
        m_notes.add("END_DATA is missing, but the number of rows is as stated.");
    }
    if (m_header.setCount && *m_header.setCount != rows) {
        m_notes.add("NUMBER_OF_SETS is " + std::to_string(*m_header.setCount) + ", but there are " +
                    counted(rows, "rows, which are used."));
    }
    if (m_header.fieldCount && *m_header.fieldCount != m_layout.columns.size()) {
        m_notes.add("NUMBER_OF_FIELDS is " + std::to_string(*m_header.fieldCount) +
                    ", but there are " + counted(m_layout.columns.size(), "columns."));
    }
    return Failure::None;
}

std::size_t RowReader::unreadableIn(const Group& group) const {
    std::size_t sum = 0;
    for (std::size_t slot = group.first; slot < group.first + group.count; ++slot) {
        sum += m_unreadable[slot];
    }
    return sum;
}

/// A group of columns without any number counts as absent. A group with some numbers can't be used,
/// and leaving it out would hide an error.
Failure RowReader::dropUnreadableGroups() {
    DataSet& set = m_set;
    const auto dropDevice = [&] {
        set.device.clear();
        set.channels.clear();
        set.deviceSpace = DeviceSpace::None;
    };
    const auto dropSpectra = [&] {
        set.spectra.clear();
        set.axis = {};
    };
    bool dropped = false;
    std::size_t left = std::accumulate(m_unreadable.begin(), m_unreadable.end(), std::size_t{0});
    const auto drop = [&](const Group& group, const char* name, auto clear) {
        const std::size_t unreadable = unreadableIn(group);
        if (unreadable == 0 || unreadable != group.count * set.patchCount) {
            return;
        }
        m_notes.add(std::string(name) + " columns contain no numbers.");
        left -= unreadable;
        dropped = true;
        clear();
    };
    drop(m_layout.device, "The device", dropDevice);
    drop(m_layout.xyz, "The XYZ", [&] { set.xyz.clear(); });
    drop(m_layout.lab, "The Lab", [&] { set.lab.clear(); });
    drop(m_layout.spectra, "The spectral", dropSpectra);
    if (m_wavelengthsDiffer || unreadableIn(m_layout.wavelengths) > 0) {
        left -= unreadableIn(m_layout.wavelengths);
        m_wavelengthsDiffer = true;
        dropSpectra();
        m_notes.add("The rows state different wavelengths: the spectra are left out.");
    }
    const bool isEmpty =
        set.device.empty() && set.xyz.empty() && set.lab.empty() && set.spectra.empty();
    return left > 0 || (dropped && isEmpty) ? Failure::NotNumeric : Failure::None;
}

} // namespace colour::cgats
