// SPDX-License-Identifier: Apache-2.0
// Correct CGATS text:
//
//     CGATS.17
//     ORIGINATOR "Printing house"          standard keyword: no declaration
//     KEYWORD "MEASUREMENT_CONDITION"      others need one
//     MEASUREMENT_CONDITION "M1"
//     NUMBER_OF_FIELDS 8
//     BEGIN_DATA_FORMAT
//     SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B
//     END_DATA_FORMAT
//     NUMBER_OF_SETS 1
//     BEGIN_DATA
//     1 0 0 0 0 95.0 0.0 -2.0
//     END_DATA
//
// Everything except the column names and the rows may be missing, repeated, wrong or quoted. This
// file reads the header and finds the tables. CgatsRows.cpp reads a table, CgatsTables.cpp combines
// them into one data set.
#include "colour/CgatsText.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstring>
#include <new>
#include <stdexcept>

#include "colour/CgatsConditions.h"
#include "colour/CgatsInks.h"
#include "colour/CgatsTables.h"
#include "colour/SingleInkSpectra.h"
#include "colour/TextEncoding.h"

namespace colour {

namespace {

using namespace cgats;

/// Size of the header, in bytes, that is searched for keywords and for a line of names without
/// BEGIN_DATA_FORMAT.
constexpr std::size_t searchedHeader = std::size_t{1} << 20;

constexpr std::string_view firstWords[] = {"CGATS", "IT8.", "ISO28178", "CTI1",
                                           "CTI2",  "CTI3", "ECI2002"};

constexpr std::string_view knownKeywords[] = {
    "BEGIN_DATA",
    "BEGIN_DATA_FORMAT",
    "NUMBER_OF_FIELDS",
    "NUMBER_OF_SETS",
    "KEYWORD",
    "ORIGINATOR",
    "DESCRIPTOR",
    "FILE_DESCRIPTOR",
    "CREATED",
    "INSTRUMENTATION",
    "DEVICE",
    "LGOROWLENGTH",
    "MEASUREMENT_SOURCE",
    "PRINT_CONDITIONS",
    "WEIGHTING_FUNCTION",
};

/// Iterates over header lines, without blank lines, comments and leading blanks.
class Lines {
  public:
    explicit Lines(std::string_view text) : m_at(text.data()), m_end(m_at + text.size()) {}

    bool next(std::string_view& line) {
        while (true) {
            while (m_at != m_end && !anySeparates.isPlain(*m_at)) {
                ++m_at;
            }
            if (m_at == m_end) {
                return false;
            }
            const char* const start = m_at;
            m_at = lineEndOf(start, m_end);
            if (*start == '#') {
                continue;
            }
            line = {start, static_cast<std::size_t>(m_at - start)};
            return true;
        }
    }

    const char* at() const { return m_at; }
    const char* end() const { return m_end; }
    void moveTo(const char* at) { m_at = at; }

  private:
    const char* m_at;
    const char* m_end;
};

/// First word of a line, without its quotes.
std::string_view firstWordOf(std::string_view line) {
    const char* at = line.data();
    return takeWord(at, line.data() + line.size(), anySeparates).text;
}

/// Position of a separate word in a line, ignoring case; npos if there is none.
std::size_t findWord(std::string_view line, std::string_view word) {
    const auto isPart = [](char c) { return anySeparates.isPlain(c) && c != '"'; };
    for (std::size_t at = 0; at + word.size() <= line.size(); ++at) {
        const std::size_t behind = at + word.size();
        if ((at == 0 || !isPart(line[at - 1])) &&
            (behind == line.size() || !isPart(line[behind])) &&
            sameWord(line.substr(at, word.size()), word)) {
            return at;
        }
    }
    return std::string_view::npos;
}

bool isStructure(std::string_view word) {
    for (const char* name : {"BEGIN_DATA", "END_DATA", "BEGIN_DATA_FORMAT", "END_DATA_FORMAT"}) {
        if (sameWord(word, name)) {
            return true;
        }
    }
    return false;
}

/// Column names found in some lines, and their separator.
struct NameList {
    std::vector<std::string> names;
    const CharTable* chars = &blanksSeparate;
    std::vector<std::string> others; ///< The line split the other way, if that differs.
};

std::size_t knownNames(const std::vector<std::string>& names) {
    const std::vector<ColumnMeaning> meanings = meaningsOf(names);
    return static_cast<std::size_t>(
        std::count_if(meanings.begin(), meanings.end(), [](const ColumnMeaning& meaning) {
            return meaning.quantity != Quantity::Unknown;
        }));
}

std::vector<std::string> textsOf(const std::vector<Word>& words) {
    std::vector<std::string> texts;
    for (const Word& word : words) {
        texts.push_back(toUtf8(wordText(word)));
    }
    return texts;
}

void dropEmptyEnd(std::vector<Word>& cells) {
    while (!cells.empty() && cells.back().text.empty()) {
        cells.pop_back();
    }
}

/// The separator of a line of names: the one that gives the most meaningful names.
const CharTable* separatorOf(std::string_view line) {
    const CharTable* best = &blanksSeparate;
    if (line.find_first_of(",;") == std::string_view::npos) {
        return best;
    }
    std::size_t most = 0;
    for (const CharTable* chars : {&blanksSeparate, &semicolonsSeparate, &commasSeparate}) {
        std::vector<Word> words;
        splitWords(line, *chars, maxCgatsColumns, words);
        const std::size_t known = knownNames(textsOf(words));
        if (known > most) {
            most = known;
            best = chars;
        }
    }
    return best;
}

/// Adds the names of one line. False if the limit is exceeded.
bool addLine(std::string_view line, std::optional<unsigned long long> fieldCount, NameList& list) {
    std::string inner;
    if (unwrapLine(line, inner)) {
        line = inner;
    }
    const bool isFirst = list.names.empty();
    if (isFirst) {
        list.chars = separatorOf(line);
    }
    const std::size_t room = maxCgatsColumns - list.names.size();
    std::vector<Word> words;
    if (!splitWords(line, *list.chars, room, words)) {
        return false;
    }
    std::vector<std::string> names = textsOf(words);
    if (names.empty()) {
        return true;
    }

    // Names may contain blanks: only tabs separate them if that gives the stated count, or names
    // with more meanings. The rows may override this.
    list.others.clear();
    if (isFirst && splitCells(line, *list.chars, room, words)) {
        dropEmptyEnd(words);
        std::vector<std::string> cells = textsOf(words);
        if (fieldCount != names.size() &&
            (fieldCount == cells.size() || knownNames(cells) > knownNames(names))) {
            std::swap(names, cells);
        }
        if (cells.size() != names.size() && cells.size() > 1) {
            list.others = std::move(cells);
        }
    }
    std::move(names.begin(), names.end(), std::back_inserter(list.names));
    return true;
}

/// The names in a line without BEGIN_DATA_FORMAT. Empty unless they are certainly names.
NameList unannouncedNames(std::string_view line) {
    NameList list;
    if (!addLine(line, std::nullopt, list) || list.names.size() < 3 ||
        !holdWholeGroup(meaningsOf(list.names))) {
        list.names.clear();
    }
    return list;
}

/// True if a line looks like a row: mostly numbers.
bool isRow(std::string_view line, const CharTable& chars) {
    std::vector<Word> words;
    splitWords(line, chars, maxCgatsColumns, words);
    const auto numbers = std::count_if(words.begin(), words.end(), [&](const Word& word) {
        return !std::isnan(numberIn(word.text, chars.decimalComma()));
    });
    return numbers >= 3 && 2 * static_cast<std::size_t>(numbers) >= words.size();
}

/// A count from a keyword's value.
std::optional<unsigned long long> countIn(const std::string& value) {
    unsigned long long count = 0;
    const auto [stop, error] = std::from_chars(value.data(), value.data() + value.size(), count);
    if (error != std::errc() || stop == value.data()) {
        return std::nullopt;
    }
    return count;
}

/// Some exporters write the time of a date as a comment: CREATED "11/21/2026" # Time: 09:15
std::string timeBehind(std::string_view line) {
    constexpr std::string_view mark = "# Time:";
    constexpr std::size_t longest = 40;
    const std::size_t at = line.rfind(mark);
    const std::size_t quote = line.rfind('"');
    const bool inQuotes = quote != line.npos && quote > at;
    return at == line.npos || inQuotes ? "" : " " + toUtf8(line.substr(at, longest));
}

/// Reads one text from beginning to end.
class TextReader {
  public:
    TextReader(std::string_view text, const CgatsWants& wants)
        : m_text(text), m_lines(text), m_wants(wants), m_ascii(isAscii(text)) {}

    /// On success, `set` is complete. On failure, it may contain anything.
    Failure read(DataSet& set);

  private:
    Failure readLine(std::string_view line);
    Failure readFormat(std::string_view line);
    Failure readRows(const char* at, bool hasBegin);
    Failure findNames(Lines& rows);
    void letRowDecide(Lines rows);
    void seeHeader(const KeywordLine& line);
    Failure seeUnannounced(std::string_view line);

    std::string_view m_text;
    Lines m_lines;
    const CgatsWants& m_wants;
    bool m_ascii;
    Notes m_notes;

    NameList m_names;       ///< From the current format, or else from the previous table.
    NameList m_unannounced; ///< From a line that looks like names, until BEGIN_DATA confirms it.
    bool m_hasFormat = false;
    std::optional<unsigned long long> m_fieldCount;
    std::optional<unsigned long long> m_setCount;

    std::size_t m_tables = 0;
    Table m_table;
    DataSet m_texts; ///< Only header texts.
    std::string m_printConditions;
    ScaleHint m_scaleHint = ScaleHint::None;
    ConditionFinder m_conditions;
    InkNames m_inks;
};

Failure TextReader::read(DataSet& set) {
    std::string_view line;
    while (m_lines.next(line)) {
        if (const Failure failure = readLine(line); failure != Failure::None) {
            return failure;
        }
    }
    if (m_tables == 0) {
        return Failure::Damaged; // truncated before its rows
    }
    if (const Failure failure = complete(m_table, m_scaleHint, m_wants, m_notes);
        failure != Failure::None) {
        return failure;
    }

    set = std::move(m_table.set);
    set.originator = std::move(m_texts.originator);
    set.descriptor = std::move(m_texts.descriptor);
    set.created = std::move(m_texts.created);
    set.instrumentation = std::move(m_texts.instrumentation);
    set.printing = std::move(m_texts.printing.empty() ? m_printConditions : m_texts.printing);
    set.conditions = m_conditions.result();
    m_inks.name(set);
    set.notes = m_notes.take();
    return Failure::None;
}

Failure TextReader::readLine(std::string_view line) {
    const std::string_view word = firstWordOf(line);
    const char* const behind = word.data() + word.size() + (*line.data() == '"' ? 1 : 0);
    if (sameWord(word, "BEGIN_DATA_FORMAT")) {
        m_lines.moveTo(std::min(behind, line.data() + line.size()));
        return readFormat(line);
    }
    if (sameWord(word, "BEGIN_DATA")) {
        return readRows(std::min(behind, line.data() + line.size()), true);
    }
    if (isStructure(word)) {
        return Failure::None;
    }

    KeywordLine keyword = keywordLine(line);
    if (keyword.keyword == "NUMBER_OF_FIELDS") {
        m_fieldCount = countIn(keyword.value);
    } else if (keyword.keyword == "NUMBER_OF_SETS") {
        m_setCount = countIn(keyword.value);
    } else if (keyword.keyword != "KEYWORD") {
        if (keyword.keyword == "CREATED") {
            keyword.value += timeBehind(line);
        }
        seeHeader(keyword);
        return seeUnannounced(line);
    }
    return Failure::None;
}

/// Reads the names after BEGIN_DATA_FORMAT, from any number of lines.
Failure TextReader::readFormat(std::string_view line) {
    m_names = {};
    m_hasFormat = true;
    while (true) {
        const char* const start = m_lines.at();
        if (!m_lines.next(line)) {
            return Failure::Damaged;
        }
        if (sameWord(firstWordOf(line), "BEGIN_DATA")) {
            m_notes.add("END_DATA_FORMAT is missing.");
            m_lines.moveTo(start);
            return Failure::None;
        }
        const std::size_t end = findWord(line, "END_DATA_FORMAT"); // may also follow the last name
        if (!addLine(line.substr(0, end), m_fieldCount, m_names)) {
            return Failure::TooLarge;
        }
        if (end != std::string_view::npos) {
            return Failure::None;
        }
    }
}

/// Handles a line of names without BEGIN_DATA_FORMAT. If rows follow immediately, BEGIN_DATA is
/// missing too, and the rows are read.
Failure TextReader::seeUnannounced(std::string_view line) {
    const auto searched = static_cast<std::size_t>(line.data() - m_text.data()) + line.size();
    if (m_hasFormat || searched > searchedHeader) {
        return Failure::None;
    }
    NameList names = unannouncedNames(line);
    if (names.names.empty()) {
        return Failure::None;
    }
    m_unannounced = std::move(names);
    Lines ahead = m_lines;
    std::string_view next;
    if (!ahead.next(next) || isStructure(firstWordOf(next)) || !isRow(next, *m_unannounced.chars)) {
        return Failure::None;
    }
    m_notes.add("BEGIN_DATA is missing: the rows are assumed to follow the column names.");
    return readRows(line.data() + line.size(), false);
}

/// Determines the column names for the rows after BEGIN_DATA.
Failure TextReader::findNames(Lines& rows) {
    if (m_hasFormat) {
        return m_names.names.empty() ? Failure::Damaged : Failure::None;
    }
    if (!m_unannounced.names.empty()) {
        m_names = std::move(m_unannounced);
    } else {
        Lines ahead = rows;
        std::string_view line;
        NameList names;
        if (ahead.next(line) && !isStructure(firstWordOf(line))) {
            names = unannouncedNames(line);
        }
        if (!names.names.empty()) {
            m_names = std::move(names);
            rows = ahead;
        } else if (m_names.names.empty()) {
            return Failure::Damaged; // no column names anywhere
        } else {
            return Failure::None; // same as in the previous table
        }
    }
    m_notes.add("BEGIN_DATA_FORMAT is missing: a line of column names replaces it.");
    return Failure::None;
}

/// A line of names with blanks and tabs can be split in two ways, and a wrong NUMBER_OF_FIELDS
/// selects the wrong one. The number of cells in the first row decides.
void TextReader::letRowDecide(Lines rows) {
    std::string_view line;
    if (m_names.others.empty() || !rows.next(line)) {
        return;
    }
    std::vector<Word> cells;
    splitCells(line, *m_names.chars, maxCgatsColumns, cells);
    dropEmptyEnd(cells);
    std::vector<Word> words;
    splitWords(line, *m_names.chars, maxCgatsColumns, words);
    const auto fits = [&](const std::vector<std::string>& names) {
        return names.size() == cells.size() || names.size() == words.size();
    };
    const bool meansMore = knownNames(m_names.others) == m_names.others.size() &&
                           knownNames(m_names.names) < m_names.names.size();
    if (fits(m_names.others) && (!fits(m_names.names) || meansMore)) {
        std::swap(m_names.names, m_names.others);
    }
}

Failure TextReader::readRows(const char* at, bool hasBegin) {
    Lines rows = m_lines;
    rows.moveTo(at);
    if (const Failure failure = findNames(rows); failure != Failure::None) {
        return failure;
    }
    letRowDecide(rows);

    const TableHeader header{m_names.names, m_names.chars, m_fieldCount, m_setCount, hasBegin};
    Table table;
    at = rows.at();
    if (const Failure failure =
            RowReader(m_text, m_ascii, header, m_wants, m_notes).read(at, table);
        failure != Failure::None) {
        return failure;
    }
    m_lines.moveTo(at);
    if (++m_tables == 1) {
        m_table = std::move(table);
    } else {
        joinTable(m_table, std::move(table), m_notes);
    }
    m_hasFormat = false;
    m_unannounced = {};
    m_fieldCount.reset();
    m_setCount.reset();
    return m_table.set.patchCount > maxCgatsPatches ? Failure::TooLarge : Failure::None;
}

/// Stores the header texts of a data set. The first of several equal keywords counts.
void TextReader::seeHeader(const KeywordLine& line) {
    const auto keep = [&](std::string& text) {
        if (text.empty()) {
            text = line.value;
        }
    };
    if (line.keyword == "ORIGINATOR") {
        keep(m_texts.originator);
    } else if (line.keyword == "CREATED") {
        keep(m_texts.created);
    } else if (line.keyword == "INSTRUMENTATION") {
        keep(m_texts.instrumentation);
    } else if (line.keyword == "DESCRIPTOR" || line.keyword == "FILE_DESCRIPTOR") {
        keep(m_texts.descriptor);
    } else if (line.keyword == "PRINTER") {
        keep(m_texts.printing);
    } else if (line.keyword == "PRINT_CONDITIONS" && !sameWord(line.value, "Not specified")) {
        keep(m_printConditions);
    } else if (line.keyword == "TINTGATE_SCALES" &&
               line.value == "device 100, XYZ 100, spectra 1") {
        m_scaleHint = ScaleHint::Stated;
    } else if (m_scaleHint == ScaleHint::None &&
               (line.keyword == "CTI1" || line.keyword == "CTI2" || line.keyword == "CTI3")) {
        m_scaleHint = ScaleHint::NeverOfOne;
    }
    m_conditions.see(line.keyword, line.value);
    m_inks.see(line.keyword, line.value);
}

bool isBlack(const DataSet& set) {
    return std::all_of(set.lab.begin(), set.lab.end(), [](const Lab& lab) { return lab.L == 0; });
}

} // namespace

namespace {

bool isCgats(std::string_view bytes) {
    if (bytes.empty() || std::memchr(bytes.data(), 0, bytes.size()) != nullptr) {
        return false;
    }
    Lines lines(bytes.substr(0, searchedHeader));
    std::string_view line;
    bool isFirst = true;
    while (lines.next(line)) {
        const std::string_view word = firstWordOf(line);
        if (isFirst) {
            const std::string upper = upperCase(word.substr(0, 16));
            for (const std::string_view known : firstWords) {
                if (upper.starts_with(known)) {
                    return true;
                }
            }
        }
        isFirst = false;
        const std::string keyword = keywordLine(line).keyword;
        if (std::find(std::begin(knownKeywords), std::end(knownKeywords), keyword) !=
                std::end(knownKeywords) &&
            (isStructure(word) ||
             std::none_of(word.begin(), word.end(), [](char c) { return c >= 'a' && c <= 'z'; }))) {
            return true;
        }
        if (!unannouncedNames(line).names.empty()) {
            return true;
        }
    }
    return false;
}

} // namespace

bool looksLikeCgats(std::string_view bytes) {
    std::string decoded;
    return isCgats(withoutUtf16(bytes, decoded));
}

Failure readCgats(std::string_view bytes, const CgatsWants& wants, DataSet& set) {
    if (bytes.size() > maxCgatsBytes) {
        return Failure::TooLarge;
    }
    try {
        if (wants.spectra && wants.singleInks) {
            return readWithSingleInkSpectra(bytes, wants, set);
        }
        std::string decoded;
        bytes = withoutUtf16(bytes, decoded);
        if (!isCgats(bytes)) {
            return Failure::NotRecognised;
        }
        DataSet result;
        const Failure failure = TextReader(bytes, wants).read(result);
        if (failure != Failure::None) {
            return failure;
        }
        if (!wants.spectra && result.hasColour() && isBlack(result)) {
            // Stores without Lab and XYZ write zeros for them; then the spectra are used.
            DataSet withSpectra;
            if (TextReader(bytes, {}).read(withSpectra) == Failure::None && !isBlack(withSpectra)) {
                result = std::move(withSpectra);
            }
        }
        if (!result.conditions.areUsual() && result.hasColour() && !wants.calculated) {
            DataSet calculated;
            const CgatsWants again{.spectra = true, .calculated = true};
            if (TextReader(bytes, again).read(calculated) == Failure::None &&
                calculated.calculated) {
                result = std::move(calculated);
                if (!wants.spectra) {
                    result.spectra = {};
                    result.axis = {};
                }
            }
        }
        set = std::move(result);
        return Failure::None;
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

std::optional<std::string> cgatsKeyword(std::string_view bytes, std::string_view keyword) {
    std::string decoded;
    Lines lines(withoutUtf16(bytes, decoded));
    std::string_view line;
    bool inRows = false;
    while (lines.next(line)) {
        const std::string_view word = firstWordOf(line);
        if (inRows) {
            inRows = !sameWord(word, "END_DATA");
        } else if (sameWord(word, "BEGIN_DATA")) {
            inRows = true;
        } else if (line.front() == '"' || sameWord(word, keyword)) {
            KeywordLine found = keywordLine(line);
            if (sameWord(found.keyword, keyword)) {
                return std::move(found.value);
            }
        }
    }
    return std::nullopt;
}

} // namespace colour
