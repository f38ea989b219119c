// Rows of a table.
//
//     BEGIN_DATA
//     1  A1  0    0  0  0   95.00  0.00  -2.00        one row, one line: nearly always
//     2  "Cyan solid"  100  0  0  0  55.0 -37.0 -50.0  quoted, with blanks inside
//     3  Light cyan  50  0  0  0   75,4 -18,1 -25,9    not quoted, decimal commas
//     END_DATA
//
// Nearly all rows take the quick way: one pass over the bytes, numbers straight into the row's
// values. A row that does not come out even is looked at once more, with care.
#include "colour/CgatsRows.h"

#include <algorithm>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstring>
#include <limits>

namespace colour::cgats {

namespace {

constexpr std::size_t mostNotes = 50;

/// Words of a line beyond its columns that are still looked at: names with many blanks.
constexpr std::size_t surplusWords = 64;

/// Digits that fit an unsigned 64-bit number, whatever they are.
constexpr std::size_t mostDigits = 18;

/// Up to here every whole number is a double, so that one division gives the nearest double.
constexpr std::uint64_t largestExact = std::uint64_t{1} << 53;

constexpr double powersOfTen[mostDigits + 1] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,
                                                1e7,  1e8,  1e9,  1e10, 1e11, 1e12, 1e13,
                                                1e14, 1e15, 1e16, 1e17, 1e18};

constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

bool isDigit(char c) {
    return static_cast<unsigned char>(c - '0') < 10;
}

/// True for 1,234 and 12,345: where points are in use too, nobody can say what the comma is.
bool meansThousands(const char* number, std::size_t whole, std::size_t decimals) {
    const char first = *number == '-' ? number[1] : *number;
    return decimals == 3 && whole >= 1 && whole <= 3 && first != '0';
}

std::string counted(std::size_t number, const char* what) {
    return std::to_string(number) + ' ' + what;
}

} // namespace

void Notes::add(std::string note) {
    if (m_notes.size() < mostNotes &&
        std::find(m_notes.begin(), m_notes.end(), note) == m_notes.end())
        m_notes.push_back(std::move(note));
}

double numberIn(std::string_view text, char comma) {
    while (!text.empty() && blanksSeparate.isBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && blanksSeparate.isBlank(text.back()))
        text.remove_suffix(1);
    if (text.size() > 1 && text[0] == '+' && text[1] != '-')
        text.remove_prefix(1);

    char pointed[64];
    const std::size_t at = text.find(comma);
    if (at != std::string_view::npos && comma != '.') {
        if (text.size() > sizeof pointed || text.find('.') != std::string_view::npos)
            return notANumber;
        std::copy(text.begin(), text.end(), pointed);
        pointed[at] = '.';
        text = {pointed, text.size()};
    }
    double value = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, value);
    if (stop != end || text.empty())
        return notANumber;
    const bool tiny = text.find("e-") != std::string_view::npos || // too small for a double
                      text.find("E-") != std::string_view::npos;
    if (error == std::errc::result_out_of_range && tiny)
        return 0;
    return error == std::errc() && std::isfinite(value) ? value : notANumber;
}

Failure RowReader::read(const char*& at, TableHeader header, Table& table) {
    m_begin = m_at = at;
    m_header = std::move(header);
    m_chars = m_header.chars;
    m_set = &table.set;
    *m_set = {};
    m_ended = false;
    m_hasPoints = m_hasCommas = m_hasThousands = false;
    m_wavelengthsDiffer = false;

    Form form = Form::Lines;
    m_layout = layoutOf(m_header.names, {}, m_wants.spectra);
    if (findRow())
        form = inspectFirstRow();
    if (m_layout.columns.size() > maxCgatsColumns)
        return Failure::TooLarge;
    for (const std::string& note : m_layout.notes)
        m_notes.add(note);
    m_values.assign(m_layout.valueCount, 0);
    m_unreadable.assign(m_layout.valueCount, 0);
    m_set->deviceSpace = m_layout.deviceSpace;
    m_set->channels = m_layout.channels;
    m_set->axis = m_layout.axis;
    table.unit = m_layout.unit;
    table.unevenSpectra = m_layout.unevenSpectra;
    table.kind = m_layout.kind;

    // A cell takes two bytes at least, so that a count that lies can't ask for more than the text.
    const std::size_t room = static_cast<std::size_t>(m_end - m_at) /
                             (2 * std::max<std::size_t>(1, m_layout.columns.size()));
    if (m_header.setCount && *m_header.setCount <= std::min(room + 1, maxCgatsPatches)) {
        const auto rows = static_cast<std::size_t>(*m_header.setCount);
        m_set->device.reserve(rows * m_layout.device.count);
        m_set->xyz.reserve(m_layout.xyz.count > 0 ? rows : 0);
        m_set->lab.reserve(m_layout.lab.count > 0 ? rows : 0);
        m_set->spectra.reserve(rows * m_layout.spectra.count);
        m_set->ids.reserve(m_layout.hasIds ? rows : 0);
        m_set->names.reserve(m_layout.hasNames ? rows : 0);
    }

    while (!m_ended && findRow()) {
        if (m_set->patchCount == maxCgatsPatches)
            return Failure::TooLarge;
        const bool quick = form == Form::Lines   ? quickRow<Form::Lines>()
                           : form == Form::Cells ? quickRow<Form::Cells>()
                                                 : quickRow<Form::Stream>();
        if (quick) {
            append();
            continue;
        }
        if (form == Form::Stream)
            return Failure::Damaged;
        if (const Failure failure = carefulRow(); failure != Failure::None)
            return failure;
    }
    at = m_at;
    if (const Failure failure = checkEnd(m_end); failure != Failure::None)
        return failure;
    if (m_hasThousands && m_hasPoints)
        return Failure::NotNumeric;
    if (m_hasCommas)
        m_notes.add("Commas are read as decimal points.");
    const Failure failure = dropUnreadableGroups();
    table.unevenSpectra = m_layout.unevenSpectra || m_wavelengthsDiffer;
    return failure;
}

/// Goes to the next line that is neither blank nor a comment. False at END_DATA and at the end.
bool RowReader::findRow() {
    while (true) {
        while (m_at != m_end && !m_chars->isPlain(*m_at))
            ++m_at;
        if (m_at == m_end)
            return false;
        if (*m_at != '#')
            break;
        m_at = lineEndOf(m_at, m_end);
    }
    return !takeEndOfData();
}

/// The whole line, with the separators in front of an empty first cell.
std::string_view RowReader::lineAtHand() const {
    const char* start = m_at;
    while (start != m_begin && m_chars->isBlank(start[-1]))
        --start;
    return {start, static_cast<std::size_t>(lineEndOf(m_at, m_end) - start)};
}

bool RowReader::takeEndOfData() {
    if (*m_at != 'E' && *m_at != 'e' && *m_at != '"')
        return false;
    const char* behind = m_at;
    const Word word = takeWord(behind, m_end, *m_chars);
    if (!sameWord(word.text, "END_DATA"))
        return false;
    if (word.quoted) { // alone in its line; else it is an id
        behind = skipBlanks(behind, m_end, *m_chars);
        if (behind != m_end && !m_chars->isLineEnd(*behind))
            return false;
    }
    m_at = lineEndOf(behind, m_end);
    m_ended = true;
    return true;
}

/// Settles, by the first row, what separates cells, how many there are, and whether lines count.
RowReader::Form RowReader::inspectFirstRow() {
    const std::string_view line = lineAtHand();
    const std::string_view row = unwrapLine(line, m_unwrapped) ? m_unwrapped : line;
    const char* const behind = line.data() + line.size();
    Form form = Form::Lines;
    if (cellsBySeparator(row) || cellsBySpreadsheet(row)) {
        form = Form::Cells;
    } else {
        const std::size_t width = m_header.names.size();
        splitWords(row, *m_chars, mostWords(), m_words);
        const std::size_t found = m_words.size();
        if (found < width && followingLinesComplete(behind, found)) {
            form = Form::Stream;
            m_notes.add("Rows run on over several lines.");
        } else if (found > width && found % width == 0 && m_header.fieldCount != found) {
            form = Form::Stream;
            m_notes.add("Some lines hold several rows.");
        } else if (found > width && namesAreLost(behind, found)) {
            m_notes.add("There are " + counted(width, "column names for rows of ") +
                        counted(found, "cells: the cells behind the named ones are skipped."));
            m_header.names.resize(found);
        }
    }
    std::vector<double> numbers; // for SPECTRAL_NM
    for (const Word& word : m_words) {
        const double number = numberIn(word.text, m_chars->decimalComma());
        numbers.push_back(std::isnan(number) ? 0 : number);
    }
    m_layout = layoutOf(m_header.names, numbers, m_wants.spectra);
    return form;
}

/// Words of a line that are looked at; beyond them no line makes sense.
std::size_t RowReader::mostWords() const {
    return std::max(2 * m_layout.columns.size(), maxCgatsColumns) + surplusWords;
}

/// True if semicolons or commas give the row that blanks don't, though the names don't show it.
bool RowReader::cellsBySpreadsheet(std::string_view row) {
    if (m_chars != &blanksSeparate)
        return false;
    splitWords(row, *m_chars, mostWords(), m_words);
    if (m_words.size() >= m_layout.columns.size())
        return false;
    for (const CharTable* chars : {&semicolonsSeparate, &commasSeparate}) {
        m_chars = chars;
        if (cellsBySeparator(row))
            return true;
    }
    m_chars = &blanksSeparate;
    return false;
}

/// True if a row with more cells than names belongs to columns whose names were lost: the header
/// counts them, or the next row has as many.
bool RowReader::namesAreLost(const char* behind, std::size_t found) const {
    if (!allNumbers(m_words.data()))
        return false;
    const char* next = behind;
    while (next != m_end && !m_chars->isPlain(*next))
        ++next;
    std::vector<Word> words;
    splitWords({next, static_cast<std::size_t>(lineEndOf(next, m_end) - next)}, *m_chars,
               mostWords(), words);
    return m_header.fieldCount == found || words.size() == found;
}

/// True if the words of the lines from `at` on bring `have` words to exactly one row, at a line
/// end.
bool RowReader::followingLinesComplete(const char* at, std::size_t have) const {
    const std::size_t width = m_header.names.size();
    std::vector<Word> words;
    while (have < width) {
        while (at != m_end && !m_chars->isPlain(*at))
            ++at;
        if (at == m_end)
            return false;
        const std::string_view line(at, static_cast<std::size_t>(lineEndOf(at, m_end) - at));
        if (!splitWords(line, *m_chars, width, words))
            return false;
        if (!words.empty() && sameWord(words[0].text, "END_DATA"))
            return false;
        have += words.size();
        at = line.data() + line.size();
    }
    return have == width;
}

/// A number in any writing, NaN for what is none; takes note of points and commas.
double RowReader::readNumber(std::string_view text) {
    const double value = numberIn(text, m_chars->decimalComma());
    const std::size_t comma = text.find(m_chars->decimalComma());
    if (std::isnan(value))
        return value;
    if (text.find('.') != std::string_view::npos) {
        m_hasPoints = true;
    } else if (comma != std::string_view::npos) {
        m_hasCommas = true;
        const std::size_t sign = text.find_first_not_of(" +-");
        m_hasThousands |= meansThousands(text.data() + sign, comma - sign, text.size() - comma - 1);
    }
    return value;
}

/// As plainNumber, for up to seven digits and a point at once, without a loop over them: the eight
/// bytes are taken as one word whose lowest byte is the first character.
inline bool RowReader::shortNumber(const char*& at, double& value) {
    if (std::endian::native != std::endian::little || m_end - at < 9)
        return false;
    const bool negative = *at == '-';
    const char* const p = at + (negative ? 1 : 0);
    std::uint64_t digits = 0;
    std::memcpy(&digits, p, sizeof digits);
    digits ^= 0x3030303030303030; // digits become 0 to 9
    // The top bit of every byte that is no digit, up to the second such byte.
    std::uint64_t others = (digits | (digits + 0x7676767676767676)) & 0x8080808080808080;
    if (others == 0)
        return false;
    int length = std::countr_zero(others) / 8;
    int count = length;
    int decimals = 0;
    if (p[length] == '.') {
        others &= others - 1;
        if (others == 0)
            return false;
        const std::uint64_t whole = (std::uint64_t{1} << (8 * length)) - 1;
        digits = (digits & whole) | ((digits >> 8) & ~whole);
        count = std::countr_zero(others) / 8 - 1;
        decimals = count - length;
        length = count + 1;
        m_hasPoints = true;
    }
    if (count == 0 || m_chars->isPlain(p[length]))
        return false;
    // Zeros in front make eight digits; then pairs, fours and all eight are put together.
    digits <<= 8 * (8 - count);
    digits = 10 * digits + (digits >> 8);
    constexpr std::uint64_t pairs = 0x000000FF000000FF;
    digits =
        ((digits & pairs) * 0x000F424000000064 + ((digits >> 16) & pairs) * 0x0000271000000001) >>
        32;
    const double magnitude =
        static_cast<double>(static_cast<std::uint32_t>(digits)) / powersOfTen[decimals];
    value = negative ? -magnitude : magnitude;
    at = p + length;
    return true;
}

/// Reads a number as nearly all numbers are written: digits and a point. Exact, since both parts of
/// its only division are. False for all others, `at` untouched.
inline bool RowReader::plainNumber(const char*& at, double& value) {
    const char* p = at;
    const bool negative = *p == '-';
    p += negative ? 1 : 0;
    std::uint64_t digits = 0;
    const char* start = p;
    while (p != m_end && isDigit(*p))
        digits = 10 * digits + static_cast<std::uint64_t>(*p++ - '0');
    std::size_t count = static_cast<std::size_t>(p - start);
    std::size_t decimals = 0;
    bool comma = false;
    if (p != m_end && (*p == '.' || *p == m_chars->decimalComma())) {
        comma = *p != '.';
        start = ++p;
        while (p != m_end && isDigit(*p))
            digits = 10 * digits + static_cast<std::uint64_t>(*p++ - '0');
        decimals = static_cast<std::size_t>(p - start);
        count += decimals;
    }
    if (count == 0 || count > mostDigits || digits > largestExact ||
        (p != m_end && m_chars->isPlain(*p)))
        return false;
    const double magnitude = static_cast<double>(digits) / powersOfTen[decimals];
    value = negative ? -magnitude : magnitude;
    if (comma) {
        m_hasCommas = true;
        m_hasThousands |= meansThousands(at, count - decimals, decimals);
    } else if (decimals > 0) {
        m_hasPoints = true;
    }
    at = p;
    return true;
}

/// Reads the row at hand in one pass. False if it needs care or, in a stream, breaks off; then
/// nothing has moved.
template<RowReader::Form form>
bool RowReader::quickRow() {
    const CharTable& chars = *m_chars;
    const char separator = chars.cellSeparator();
    const char* at = m_at;
    if (form == Form::Cells && at != m_begin && at[-1] == separator)
        return false; // the first cell is empty
    for (const Column& column : m_layout.columns) {
        if constexpr (form == Form::Cells) {
            while (at != m_end && chars.isBlank(*at) && *at != separator)
                ++at;
            if (&column != m_layout.columns.data()) {
                if (at == m_end || *at++ != separator)
                    return false;
                while (at != m_end && chars.isBlank(*at) && *at != separator)
                    ++at;
            }
        } else {
            at = skipBlanks(at, m_end, chars);
        }
        if constexpr (form == Form::Stream) {
            while (at != m_end && (!chars.isPlain(*at) || *at == '#')) {
                if (*at == '#')
                    at = lineEndOf(at, m_end);
                else
                    ++at;
            }
        }
        if (at == m_end || !chars.isPlain(*at) || *at == '#')
            return false;
        switch (column.kind) {
        case Column::Skip:
            if (*at == '"') {
                takeWord(at, m_end, chars);
            } else {
                do
                    ++at;
                while (at != m_end && chars.isPlain(*at));
            }
            break;
        case Column::Number:
            if (!shortNumber(at, m_values[column.slot]) &&
                !plainNumber(at, m_values[column.slot])) {
                const Word word = takeWord(at, m_end, chars);
                const double value = readNumber(word.text);
                if (std::isnan(value)) {
                    if (form == Form::Lines || sameWord(word.text, "END_DATA"))
                        return false;
                    ++m_unreadable[column.slot];
                }
                m_values[column.slot] = value;
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
    if constexpr (form == Form::Lines) {
        at = skipBlanks(at, m_end, chars);
        if (at != m_end && !chars.isLineEnd(*at)) {
            if (*at != '#')
                return false;
            at = lineEndOf(at, m_end);
        }
    }
    m_at = at;
    return true;
}

/// Reads the line at hand in every way that makes a row of it: cells between strict separators,
/// words, several rows, a name with blanks, a remark behind the last cell, missing last cells.
Failure RowReader::carefulRow() {
    const std::string_view line = lineAtHand();
    m_at = line.data() + line.size();
    const std::string_view row = unwrapLine(line, m_unwrapped) ? m_unwrapped : line;
    const std::size_t width = m_layout.columns.size();

    if (cellsBySeparator(row)) {
        place(m_words.data(), width);
        append();
        return Failure::None;
    }
    if (!splitWords(row, *m_chars, mostWords(), m_words))
        return Failure::Damaged;
    if (!m_words.empty() && sameWord(m_words.back().text, "END_DATA")) {
        m_words.pop_back();
        m_ended = true;
    }
    if (m_words.size() < width) {
        // Only what nobody needs may be missing at the end of a row.
        const bool needed = std::any_of(
            m_layout.columns.begin() + static_cast<std::ptrdiff_t>(m_words.size()),
            m_layout.columns.end(), [](const Column& c) { return c.kind == Column::Number; });
        if (needed || m_words.empty())
            return Failure::Damaged;
        m_words.resize(width);
    } else if (m_words.size() > width) {
        if (m_words.size() % width == 0)
            return severalRows();
        if (!joinNames()) {
            const bool remark = std::isnan(numberIn(m_words[width].text, '.'));
            if (!remark || !allNumbers(m_words.data()))
                return Failure::Damaged;
            m_notes.add("Words behind the last cell of a row are skipped.");
        }
    }
    place(m_words.data(), width);
    append();
    return Failure::None;
}

/// Splits the row by its strict separator. True if this gives one cell for each column.
bool RowReader::cellsBySeparator(std::string_view row) {
    const std::size_t width = m_layout.columns.size();
    if (row.find(m_chars->cellSeparator()) == std::string_view::npos)
        return false;
    if (!splitCells(row, *m_chars, width + maxCgatsColumns, m_words))
        return false;
    while (m_words.size() > width && m_words.back().text.empty())
        m_words.pop_back();
    return m_words.size() == width;
}

/// A row with more words than cells, whose name or id has blanks: joins the words of that cell, if
/// all numbers then fall into place.
bool RowReader::joinNames() {
    const std::size_t width = m_layout.columns.size();
    const std::size_t surplus = m_words.size() - width;
    for (const Column::Kind kind : {Column::Name, Column::Id}) {
        const auto column = std::find_if(m_layout.columns.begin(), m_layout.columns.end(),
                                         [&](const Column& c) { return c.kind == kind; });
        if (column == m_layout.columns.end())
            continue;
        const auto first = static_cast<std::size_t>(column - m_layout.columns.begin());
        const auto words = m_words.begin() + static_cast<std::ptrdiff_t>(first);
        if (std::none_of(words, words + static_cast<std::ptrdiff_t>(surplus + 1),
                         [](const Word& w) { return std::isnan(numberIn(w.text, ',')); }))
            continue; // numbers alone are no name
        std::vector<Word> joined = m_words;
        const char* const start = joined[first].text.data();
        const std::string_view lastWord = joined[first + surplus].text;
        joined[first].text = {start,
                              static_cast<std::size_t>(lastWord.data() + lastWord.size() - start)};
        joined.erase(joined.begin() + static_cast<std::ptrdiff_t>(first + 1),
                     joined.begin() + static_cast<std::ptrdiff_t>(first + 1 + surplus));
        if (allNumbers(joined.data())) {
            m_words = std::move(joined);
            m_notes.add("Names with blanks are not quoted.");
            return true;
        }
    }
    return false;
}

/// Rows that run on in one line.
Failure RowReader::severalRows() {
    const std::size_t width = m_layout.columns.size();
    for (std::size_t first = 0; first < m_words.size(); first += width) {
        if (!allNumbers(m_words.data() + first))
            return Failure::Damaged;
        if (m_set->patchCount == maxCgatsPatches)
            return Failure::TooLarge;
        place(m_words.data() + first, width);
        append();
    }
    m_notes.add("Some lines hold several rows.");
    return Failure::None;
}

/// True if every cell that is to be a number is one. REQUIRES: a word for every column.
bool RowReader::allNumbers(const Word* cells) const {
    for (const Column& column : m_layout.columns) {
        if (column.kind == Column::Number &&
            std::isnan(numberIn(cells->text, m_chars->decimalComma())))
            return false;
        ++cells;
    }
    return true;
}

/// Puts cells into the row's values. What is no number is counted: whether that ruins a group of
/// columns is for the whole table to say.
void RowReader::place(const Word* cells, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
        const Column& column = m_layout.columns[i];
        if (column.kind == Column::Id) {
            m_id = cells[i];
        } else if (column.kind == Column::Name) {
            m_name = cells[i];
        } else if (column.kind == Column::Number) {
            const double value = readNumber(cells[i].text);
            m_unreadable[column.slot] += std::isnan(value) ? 1 : 0;
            m_values[column.slot] = std::isnan(value) ? 0 : value;
        }
    }
}

std::string RowReader::textOf(const Word& word) const {
    if (word.doubledQuotes)
        return toUtf8(wordText(word));
    return m_ascii ? std::string(word.text) : toUtf8(word.text);
}

void RowReader::append() {
    DataSet& set = *m_set;
    const double* const values = m_values.data();
    const auto add = [&](std::vector<double>& target, const Group& group) {
        target.insert(target.end(), values + group.first, values + group.first + group.count);
    };
    ++set.patchCount;
    if (m_layout.hasIds)
        set.ids.push_back(textOf(m_id));
    if (m_layout.hasNames)
        set.names.push_back(textOf(m_name));
    if (m_layout.device.count > 0)
        add(set.device, m_layout.device);
    if (m_layout.xyz.count > 0) {
        const double* const xyz = values + m_layout.xyz.first;
        set.xyz.push_back({xyz[0], xyz[1], xyz[2]});
    }
    if (m_layout.lab.count > 0) {
        const double* const lab = values + m_layout.lab.first;
        set.lab.push_back({lab[0], lab[1], lab[2]});
    }
    if (m_layout.spectra.count > 0)
        add(set.spectra, m_layout.spectra);
    if (m_layout.wavelengths.count > 0 && !m_wavelengthsDiffer) {
        m_wavelengthsDiffer =
            !std::equal(m_layout.statedWavelengths.begin(), m_layout.statedWavelengths.end(),
                        values + m_layout.wavelengths.first);
    }
}

/// Holds the rows against the counts of the header. A count that lies is noted and the rows rule,
/// but rows that just stop are the mark of a text that was cut off.
Failure RowReader::checkEnd(const char* end) {
    const std::size_t rows = m_set->patchCount;
    if (!m_ended && m_header.hasBegin) {
        const bool lineIsWhole = end[-1] == '\n' || end[-1] == '\r';
        if (m_header.setCount != rows || !lineIsWhole)
            return Failure::Damaged;
        m_notes.add("END_DATA is missing; the number of rows is the one stated.");
    }
    if (m_header.setCount && *m_header.setCount != rows)
        m_notes.add("NUMBER_OF_SETS says " + std::to_string(*m_header.setCount) + ", there are " +
                    counted(rows, "rows: the rows count."));
    if (m_header.fieldCount && *m_header.fieldCount != m_layout.columns.size())
        m_notes.add("NUMBER_OF_FIELDS says " + std::to_string(*m_header.fieldCount) +
                    ", there are " + counted(m_layout.columns.size(), "columns."));
    return Failure::None;
}

/// A group of columns that holds no number at all counts as absent. One that holds some can't be
/// used, nor left out without hiding a fault.
Failure RowReader::dropUnreadableGroups() {
    DataSet& set = *m_set;
    const auto state = [&](const Group& group) {
        std::size_t unreadable = 0;
        for (std::size_t slot = group.first; slot < group.first + group.count; ++slot)
            unreadable += m_unreadable[slot];
        return unreadable;
    };
    const struct {
        const Group& group;
        const char* name;
    } groups[] = {{m_layout.device, "device values"},
                  {m_layout.xyz, "XYZ"},
                  {m_layout.lab, "Lab"},
                  {m_layout.spectra, "spectra"}};
    bool dropped = false;
    for (const auto& [group, name] : groups) {
        const std::size_t unreadable = state(group);
        if (unreadable == 0)
            continue;
        if (unreadable != group.count * set.patchCount)
            return Failure::NotNumeric;
        m_notes.add(std::string("The columns of ") + name + " hold no numbers.");
        dropped = true;
        if (&group == &m_layout.device) {
            set.device.clear();
            set.channels.clear();
            set.deviceSpace = DeviceSpace::None;
        } else if (&group == &m_layout.xyz) {
            set.xyz.clear();
        } else if (&group == &m_layout.lab) {
            set.lab.clear();
        } else {
            set.spectra.clear();
            set.axis = {};
        }
    }
    if (m_wavelengthsDiffer || state(m_layout.wavelengths) > 0) {
        m_wavelengthsDiffer = true;
        set.spectra.clear();
        set.axis = {};
        m_notes.add("The rows state different wavelengths: the spectra are left out.");
    }
    const bool nothingLeft =
        set.device.empty() && set.xyz.empty() && set.lab.empty() && set.spectra.empty();
    return dropped && nothingLeft ? Failure::NotNumeric : Failure::None;
}

} // namespace colour::cgats
