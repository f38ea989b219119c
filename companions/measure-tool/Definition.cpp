// A definition, all lines ending in CR LF but the last:
//
//     CGATS.17
//     ORIGINATOR "Nerova Verify"
//     NUMBER_OF_FIELDS 11
//     BEGIN_DATA_FORMAT
//     SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B XYZ_X XYZ_Y XYZ_Z
//     END_DATA_FORMAT
//     KEYWORD  DEVICE
//     DEVICE 33
//     ...
//     KEYWORD NUMBER_OF_SETS
//     NUMBER_OF_SETS  4
//     BEGIN_DATA
//     1  100  0     0     0     55.00  -37.00  -50.00  14.91  22.93  61.81
//     2  Zeichen mit mehreren Bytes   their rows are cut off at the end
//     3  0.00 0.00  0.00  0.00  95.00    0.00    0.00  84.00  87.00  74.00   a filling row, which
//     4  0.00 0.00  0.00  0.00  95.00    0.00    0.00  84.00  87.00  74.00   always has these cells
//     END_DATA
//
// The writer cuts a row by one byte for each byte that its characters have beyond the first, and
// rows and names alike at 511 bytes. What goes is references, which nobody needs who measures: they
// are taken out before the text is read.
#include "companions/measure-tool/Definition.h"

#include <algorithm>
#include <cctype>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include "colour/ColourFile.h"
#include "companions/measure-tool/Failure.h"

namespace measuring {
namespace {

constexpr std::size_t largestFile = 64 << 20;

constexpr std::string_view fillings[] = {
    "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00",
    "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00",
};

using Lines = std::vector<std::string>;

Lines linesOf(std::string_view text) {
    Lines lines;
    while (!text.empty()) {
        const std::size_t end = text.find_first_of("\r\n");
        lines.emplace_back(text.substr(0, end));
        const bool both = end != text.npos && text.substr(end, 2) == "\r\n";
        text.remove_prefix(end == text.npos ? text.size() : end + (both ? 2 : 1));
    }
    return lines;
}

std::string firstWordOf(const std::string& line) {
    const std::size_t start = std::min(line.find_first_not_of(" \t"), line.size());
    return line.substr(start, line.find_first_of(" \t", start) - start);
}

/// The first line from `first` on that begins with this word, else `last`.
std::size_t findLine(const Lines& lines, const char* word, std::size_t first, std::size_t last) {
    while (first < last && firstWordOf(lines[first]) != word)
        ++first;
    return first;
}

std::string upperCase(std::string name) {
    std::transform(name.begin(), name.end(), name.begin(),
                   [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    return name;
}

bool isDevice(const std::string& name) {
    const std::string upper = upperCase(name);
    return upper.starts_with("CMYK") || upper.starts_with("RGB") || upper.starts_with("SPOT") ||
           upper.find("CLR") != upper.npos;
}

/// True for a column of references: Lab, XYZ, or a spectral value, told by its wavelength.
bool isReference(std::string name) {
    name = upperCase(std::move(name));
    for (const char* start : {"LAB_", "XYZ_", "CIE", "SPECTRAL"})
        if (name.starts_with(start))
            return true;
    int digits = 0;
    for (const char c : name) {
        digits = c >= '0' && c <= '9' ? digits + 1 : 0;
        if (digits == 3)
            return true;
    }
    return false;
}

/// Takes away the meaning of the references' columns. Returns the number of columns up to the last
/// one that is none, or 0 where the names are not parted by one tab each.
std::size_t hideReferences(std::string& names) {
    if (names.find('"') != names.npos)
        return 0; // a name may have blanks in it
    std::string hidden;
    std::size_t count = 0;
    std::size_t needed = 0;
    bool tabs = true;
    for (std::size_t at = 0; (at = names.find_first_not_of(" \t", at)) < names.size();) {
        const std::size_t end = std::min(names.find_first_of(" \t", at), names.size());
        const std::string name = names.substr(at, end - at);
        const bool reference = isReference(name);
        tabs = tabs && (end == names.size() || names[end] == '\t') &&
               (at == 0 || names[at - 1] == '\t') && (at < 2 || names[at - 2] != '\t');
        hidden.append(count == 0 ? "" : "\t").append(reference ? "-" : name);
        ++count;
        needed = reference ? needed : count;
        at = end;
    }
    names = hidden;
    return tabs ? needed : 0;
}

/// Takes off what stands behind so many cells parted by tabs.
void cutBehind(std::size_t cells, std::string& line) {
    std::size_t end = line.find('\t');
    for (std::size_t i = 1; i < cells && end != line.npos; ++i)
        end = line.find('\t', end + 1);
    line.resize(std::min(end, line.size()));
}

/// The sample number of a filling row; empty for any other line.
std::string numberOfFilling(std::string_view line) {
    const std::size_t digits = std::min(line.find_first_not_of("0123456789"), line.size());
    const bool filling = std::find(std::begin(fillings), std::end(fillings), line.substr(digits)) !=
                         std::end(fillings);
    return std::string(line.substr(0, filling ? digits : 0));
}

/// Takes the filling rows from the end of the rows. A strip of nothing else keeps them as rows.
Lines takeFillings(Lines& lines, std::size_t firstRow, std::size_t lastRow) {
    Lines numbers;
    std::size_t first = lastRow;
    for (; first > firstRow; --first) {
        std::string number = numberOfFilling(lines[first - 1]);
        if (number.empty())
            break;
        numbers.push_back(std::move(number));
    }
    if (first == firstRow)
        return {};
    const auto begin = lines.begin();
    lines.erase(begin + static_cast<std::ptrdiff_t>(first),
                begin + static_cast<std::ptrdiff_t>(lastRow));
    std::reverse(numbers.begin(), numbers.end());
    return numbers;
}

/// Where device values end a row, what was cut off is theirs, and the black of 100 reads 10.
void checkUncut(const std::string& names, std::span<const std::string> rows) {
    if (!isDevice(names.substr(names.find_last_of(" \t") + 1)))
        return;
    for (std::size_t row = 0; row < rows.size(); ++row)
        if (std::any_of(rows[row].begin(), rows[row].end(), [](char c) { return (c & 0x80) != 0; }))
            throw Failure(Status::BadDefinition,
                          "row " + std::to_string(row + 1) +
                              " of the definition has lost the end of its device values to a name "
                              "of several bytes a character: in the strip, names go behind them");
}

/// Makes a text that the reader of colour files takes whole. Returns the numbers of filling rows.
Lines prepare(Lines& lines) {
    const std::size_t format = findLine(lines, "BEGIN_DATA_FORMAT", 0, lines.size());
    const std::size_t firstRow = findLine(lines, "BEGIN_DATA", format, lines.size()) + 1;
    const std::size_t lastRow = findLine(lines, "END_DATA", firstRow, lines.size());
    // The writer takes the names to stand on one line; where they don't, the text stays as it is.
    const std::size_t names = format + 1;
    if (firstRow > lines.size() ||
        findLine(lines, "END_DATA_FORMAT", format, firstRow) != names + 1)
        return {};
    const std::size_t cells = hideReferences(lines[names]);
    Lines numbers = takeFillings(lines, firstRow, lastRow);
    const auto rows = std::span(lines).subspan(firstRow, lastRow - firstRow - numbers.size());
    checkUncut(lines[names], rows);
    const bool tabs = std::all_of(rows.begin(), rows.end(), [](const std::string& row) {
        return row.empty() || row.find('\t') != row.npos;
    });
    if (cells > 0 && tabs) {
        cutBehind(cells, lines[names]);
        for (std::string& row : rows)
            cutBehind(cells, row);
    }
    return numbers;
}

/// The reader tells a text that was cut off by its last line, which stays without an end.
std::string textOf(const Lines& lines, const std::string& original) {
    std::string text;
    for (const std::string& line : lines)
        text += line + "\n";
    if (!text.empty() && original.back() != '\n' && original.back() != '\r')
        text.pop_back();
    return text;
}

void addPaper(colour::DataSet& chart, const Lines& numbers) {
    const double white = chart.deviceSpace == colour::DeviceSpace::Rgb ? 100 : 0;
    for (const std::string& number : numbers) {
        ++chart.patchCount;
        if (!chart.ids.empty())
            chart.ids.push_back(number);
        if (!chart.names.empty())
            chart.names.emplace_back();
        chart.device.insert(chart.device.end(), chart.channels.size(), white);
    }
}

} // namespace

colour::DataSet readDefinition(const std::string& path) {
    std::string bytes;
    expectUsable(colour::readWholeFile(path, largestFile, bytes), Status::BadDefinition, path);
    Lines lines = linesOf(bytes);
    const Lines numbers = prepare(lines);
    colour::DataSet set;
    const colour::CgatsWants wants{.spectra = false};
    colour::Failure failure = colour::readCgats(textOf(lines, bytes), wants, set);
    // Where references are all that there is, ids have to tell the patches apart.
    if (failure == colour::Failure::NoColourValues && numbers.empty())
        failure = colour::readCgats(bytes, wants, set);
    expectUsable(failure, Status::BadDefinition, path);
    colour::DataSet chart = colour::chartOf(std::move(set));
    addPaper(chart, numbers);
    return chart;
}

} // namespace measuring
