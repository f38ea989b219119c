// SPDX-License-Identifier: Apache-2.0
// A row that loses two bytes because its name has two more bytes than characters:
//
//     SAMPLE_ID SAMPLE_NAME CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B
//     1         Größe       0      0      0      100    16    0     0
//
// arrives without the last cell and the preceding tab. Here that loses a reference value, which is
// not needed. Without the Lab columns, or if they are short, it would turn black 100 into 1.
#include "companions/measure-tool/CutLines.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <iterator>
#include <string_view>
#include <vector>

#include "base/Trim.h"
#include "colour/CgatsColumns.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

using colour::cgats::Column;
using colour::cgats::Layout;
using colour::cgats::Quantity;

/// A cut line has 511 bytes, or up to three less so as not to split a character.
constexpr std::size_t shortestCut = 511 - 3;

constexpr std::string_view blanks = " \t";

enum class Separator {
    Tab,    ///< One tab between two cells.
    Blanks, ///< Any number of blanks and tabs; cells with blanks are quoted.
    Unknown,
};

/// Views of their line.
using Cells = std::vector<std::string_view>;

bool mayBeCut(const std::string& line) {
    return line.size() >= shortestCut ||
           std::any_of(line.begin(), line.end(), [](char c) { return (c & 0x80) != 0; });
}

bool isRow(const std::string& line) {
    const std::size_t first = line.find_first_not_of(blanks);
    return first != line.npos && line[first] != '#';
}

Cells cellsByTabs(std::string_view line) {
    Cells cells;
    for (std::size_t at = 0, end = 0; end != line.npos; at = end + 1) {
        end = line.find('\t', at);
        cells.push_back(base::trimmed(line.substr(at, end == line.npos ? end : end - at)));
    }
    return cells;
}

/// The end of the cell that starts at `at`. A quote closes only before a blank or the line's end.
std::size_t endOfWord(std::string_view line, std::size_t at) {
    if (line[at] != '"') {
        return std::min(line.find_first_of(blanks, at), line.size());
    }
    std::size_t end = line.find('"', at + 1);
    while (end != line.npos && end + 1 < line.size() && blanks.find(line[end + 1]) == blanks.npos) {
        end = line.find('"', end + 1);
    }
    return end == line.npos ? line.size() : end + 1;
}

Cells cellsByBlanks(std::string_view line) {
    Cells cells;
    for (std::size_t at = 0; (at = line.find_first_not_of(blanks, at)) != line.npos;) {
        if (line[at] == '#') {
            break;
        }
        const std::size_t end = endOfWord(line, at);
        cells.push_back(line.substr(at, end - at));
        at = end;
    }
    return cells;
}

Cells cellsOf(std::string_view line, Separator separator) {
    return separator == Separator::Tab ? cellsByTabs(line) : cellsByBlanks(line);
}

/// Detected from the names. If they are ambiguous, detected from the rows.
Separator separatorOf(const TableLines& table) {
    if (table.names.find_first_of("\",;") != table.names.npos) {
        return Separator::Unknown;
    }
    if (table.names.find('\t') == table.names.npos) {
        return Separator::Blanks;
    }
    const Cells names = cellsByTabs(table.names);
    const bool blankInName = std::any_of(names.begin(), names.end(), [](std::string_view name) {
        return name.empty() || name.find(' ') != name.npos;
    });
    if (blankInName) {
        return Separator::Unknown;
    }
    const bool tabs = std::all_of(table.rows.begin(), table.rows.end(), [](const auto& row) {
        return !isRow(row) || row.find('\t') != row.npos;
    });
    return tabs ? Separator::Tab : Separator::Blanks;
}

bool isReference(Quantity quantity) {
    return quantity == Quantity::Lab || quantity == Quantity::Xyz ||
           quantity == Quantity::Spectral || quantity == Quantity::Wavelength ||
           quantity == Quantity::SpectralValue;
}

[[noreturn]] void refuse(const std::string& problem) {
    throw Failure(Status::BadDefinition, problem);
}

/// A name up to its first digit, in upper case.
std::string startOf(const std::string& name) {
    std::string start = name.substr(0, name.find_first_of("0123456789"));
    std::transform(start.begin(), start.end(), start.begin(),
                   [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    return start;
}

/// A cut list of columns ends with a damaged name, and the columns after it are unknown. They count
/// as references if the previous name is one and the damaged name can be another.
void checkCutNames(std::vector<std::string>& names) {
    const std::size_t whole = names.size() - 1;
    const auto meanings = colour::cgats::meaningsOf(names);
    const std::string damaged = startOf(names[whole]);
    bool references = whole > 0 && isReference(meanings[whole - 1].quantity);
    if (references) {
        const std::string continued[] = {startOf(names[whole - 1]), "LAB_", "XYZ_"};
        references =
            std::any_of(std::begin(continued), std::end(continued),
                        [&](const std::string& start) { return start.starts_with(damaged); });
    }
    if (!references) {
        refuse("the definition's list of columns is cut off: the strip may use at most 511 bytes "
               "for it, and non-ASCII names take more of them");
    }
    names[whole] = "-";
}

/// The part of a table that is kept.
struct Kept {
    std::vector<std::size_t> columns;
    std::size_t needed = 0; ///< Cells up to the last id or device value. Names may be cut.
    bool hasDevice = false;
};

Kept keptOf(const std::vector<std::string>& names) {
    const Layout layout = colour::cgats::layoutOf(names, {}, false);
    Kept kept;
    kept.hasDevice = layout.device.count > 0;
    for (std::size_t i = 0; i < names.size(); ++i) {
        const Column& column = layout.columns[i];
        const bool device = column.kind == Column::Number && layout.device.contains(column.slot);
        if (device || column.kind == Column::Id) {
            kept.needed = i + 1;
        }
        if (device || column.kind == Column::Id || column.kind == Column::Name) {
            kept.columns.push_back(i);
        }
    }
    return kept;
}

bool isNumber(std::string_view cell) {
    double value = 0;
    const auto [end, error] = std::from_chars(cell.data(), cell.data() + cell.size(), value);
    return error == std::errc() && end == cell.data() + cell.size();
}

/// Without this check, a reader would skip cells of unnamed columns, such as a spot ink if the
/// strip's list of columns is on two lines.
void checkAllNamed(const TableLines& table, std::size_t nameCount, Separator separator) {
    const auto first = std::find_if(table.rows.begin(), table.rows.end(), isRow);
    if (first == table.rows.end()) {
        return;
    }
    const Cells cells = cellsOf(*first, separator);
    // With blanks, extra cells may be a name of several words, unless the strip counts columns.
    const bool surplus = cells.size() > nameCount && isNumber(cells[nameCount]);
    if (surplus && (separator == Separator::Tab || cells.size() == table.fieldCount)) {
        refuse(
            "the rows of the definition have more cells than there are column names: the strip's "
            "list of columns must be on one line");
    }
}

/// The cells of a row that are kept.
std::string keptCells(const std::string& line, std::size_t number, const Kept& kept,
                      std::size_t nameCount, Separator separator) {
    const Cells cells = cellsOf(line, separator);
    const std::string row = "row " + std::to_string(number) + " of the definition ";
    if (cells.size() < kept.needed) {
        refuse(row + "lacks device values, or they are not all on one line");
    }
    if (separator == Separator::Blanks && cells.size() > nameCount) {
        refuse(row + "can't be split into cells: in the strip, names with blanks must be quoted");
    }
    if (kept.needed > 0 && mayBeCut(line)) {
        const std::string_view last = cells[kept.needed - 1];
        if (last.data() + last.size() == line.data() + line.size()) {
            refuse(row +
                   "may have lost the end of its device values, because of a non-ASCII name or "
                   "of 511 bytes before them: in the strip, names must follow them");
        }
    }
    std::string result;
    for (const std::size_t column : kept.columns) {
        result += column == kept.columns.front() ? "" : "\t";
        result += column < cells.size() ? cells[column] : "";
    }
    return result;
}

std::string joined(const std::vector<std::string>& names, const std::vector<std::size_t>& columns) {
    std::string line;
    for (const std::size_t column : columns) {
        line += (line.empty() ? "" : "\t") + names[column];
    }
    return line;
}

/// The names of all columns, with those of references replaced: their cells are ignored.
std::string withoutReferences(const std::vector<std::string>& names, const Kept& kept,
                              Separator separator) {
    std::string line;
    for (std::size_t i = 0; i < names.size(); ++i) {
        const bool stays =
            std::find(kept.columns.begin(), kept.columns.end(), i) != kept.columns.end();
        line += i == 0 ? "" : separator == Separator::Tab ? "\t" : " ";
        line += stays ? names[i] : "-";
    }
    return line;
}

} // namespace

void dropCutCells(const TableLines& table) {
    const Separator separator = separatorOf(table);
    const Cells nameCells = cellsOf(table.names, separator);
    std::vector<std::string> names(nameCells.begin(), nameCells.end());
    const bool namesCut = table.isWritten && mayBeCut(table.names);
    const bool rowsCut =
        table.isWritten && std::any_of(table.rows.begin(), table.rows.end(),
                                       [](const auto& row) { return isRow(row) && mayBeCut(row); });
    const bool anyCut = namesCut || rowsCut;
    if (anyCut && separator == Separator::Unknown) {
        refuse("the definition has lines that may be cut off, and its columns can't be separated: "
               "in the strip, tabs must separate them");
    }
    if (names.empty() || separator == Separator::Unknown) {
        return;
    }
    if (namesCut) {
        checkCutNames(names);
    } else {
        checkAllNamed(table, names.size(), separator);
    }
    const Kept kept = keptOf(names);
    std::size_t number = 0;
    for (std::string& row : table.rows) {
        if (!anyCut || !isRow(row)) {
            continue;
        }
        std::string cells = keptCells(row, ++number, kept, names.size(), separator);
        // Without device values, the references stay, because the reader needs one or the other.
        if (kept.hasDevice) {
            row = std::move(cells);
        }
    }
    if (kept.hasDevice) {
        table.names =
            anyCut ? joined(names, kept.columns) : withoutReferences(names, kept, separator);
    }
}

} // namespace measuretool
