// SPDX-License-Identifier: Apache-2.0
// A definition. All lines but the last end with CR LF:
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
// The writer may have cut lines: CutLines.h describes how. Filling rows have these cells whatever
// the strip's columns are, so they are removed before the text is parsed.
#include "companions/measure-tool/Definition.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include "colour/CgatsText.h"
#include "colour/ColourFile.h"
#include "colour/TextEncoding.h"
#include "companions/measure-tool/CutLines.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

constexpr std::size_t largestFile = 64 << 20;

/// Rounding may raise an amount above 100 percent, up to this limit.
constexpr double largestAmount = 101;

constexpr std::string_view fillings[] = {
    "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00",
    "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00",
};

/// Distinguishes a definition from a strip that a person supplies.
constexpr const char* writer = "ORIGINATOR \"Nerova Verify\"";

/// Makes the reader use values as they are, instead of guessing their scale from the largest.
constexpr const char* statedScales = "TINTGATE_SCALES \"device 100, XYZ 100, spectra 1\"";

using Lines = std::vector<std::string>;

/// Drops blank lines, so a file of line ends gives no lines.
Lines linesOf(std::string_view text) {
    Lines lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find_first_of("\r\n"), text.size());
        if (end > 0) {
            lines.emplace_back(text.substr(0, end));
        }
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

std::string firstWordOf(const std::string& line) {
    const std::size_t start = std::min(line.find_first_not_of(" \t"), line.size());
    return line.substr(start, line.find_first_of(" \t", start) - start);
}

/// The first line from `first` on that begins with this word, or `last`.
std::size_t findLine(const Lines& lines, const char* word, std::size_t first, std::size_t last) {
    while (first < last && firstWordOf(lines[first]) != word) {
        ++first;
    }
    return first;
}

/// The sample number of a filling row; empty for any other line.
std::string numberOfFilling(std::string_view line) {
    const std::size_t digits = std::min(line.find_first_not_of("0123456789"), line.size());
    const bool filling = std::find(std::begin(fillings), std::end(fillings), line.substr(digits)) !=
                         std::end(fillings);
    return std::string(line.substr(0, filling ? digits : 0));
}

/// Removes filling rows from the end of the rows. A strip of nothing else keeps them as rows.
Lines takeFillings(Lines& lines, std::size_t firstRow, std::size_t lastRow) {
    Lines numbers;
    std::size_t first = lastRow;
    for (; first > firstRow; --first) {
        std::string number = numberOfFilling(lines[first - 1]);
        if (number.empty()) {
            break;
        }
        numbers.push_back(std::move(number));
    }
    if (first == firstRow) {
        return {};
    }
    const auto begin = lines.begin();
    lines.erase(begin + static_cast<std::ptrdiff_t>(first),
                begin + static_cast<std::ptrdiff_t>(lastRow));
    std::reverse(numbers.begin(), numbers.end());
    return numbers;
}

/// The integer that follows a keyword in the lines before `last`; 0 if there is none.
std::size_t countIn(const Lines& lines, const char* keyword, std::size_t last) {
    const std::size_t line = findLine(lines, keyword, 0, last);
    std::size_t count = 0;
    if (line < last) {
        const std::string& text = lines[line];
        const std::size_t start = std::min(text.find_first_of("0123456789"), text.size());
        std::from_chars(text.data() + start, text.data() + text.size(), count);
    }
    return count;
}

/// Makes the lines acceptable for the reader of colour files. Returns the numbers of filling rows.
Lines prepare(Lines& lines) {
    const std::size_t format = findLine(lines, "BEGIN_DATA_FORMAT", 0, lines.size());
    const std::size_t firstRow = findLine(lines, "BEGIN_DATA", format, lines.size()) + 1;
    const std::size_t lastRow = findLine(lines, "END_DATA", firstRow, lines.size());
    // The writer puts the names on one line. A strip supplied by a person may have them on several.
    // Its lines were never cut, and it stays unchanged.
    const std::size_t names = format + 1;
    if (firstRow > lines.size() ||
        findLine(lines, "END_DATA_FORMAT", format, firstRow) != names + 1) {
        return {};
    }
    const std::size_t fieldCount = countIn(lines, "NUMBER_OF_FIELDS", firstRow);
    Lines numbers = takeFillings(lines, firstRow, lastRow);
    const auto rows = std::span(lines).subspan(firstRow, lastRow - firstRow - numbers.size());
    const auto header = std::span(lines).first(format);
    const bool isWritten = std::find(header.begin(), header.end(), writer) != header.end();
    dropCutCells({lines[names], rows, fieldCount, isWritten});
    return numbers;
}

/// Keeps a missing line end of the last line: the reader uses it to detect truncated text.
std::string textOf(const Lines& lines, const std::string& original) {
    std::string text;
    for (const std::string& line : lines) {
        text += line + "\n";
    }
    if (!text.empty() && original.back() != '\n' && original.back() != '\r') {
        text.pop_back();
    }
    return text;
}

/// Amounts of ink are percent, whatever the largest value is. A strip with one row of 120 is
/// damaged; it is not a strip of 0 to 255, in which cyan 100 would be 39 percent.
void takeAmountsAsPercent(Lines lines, const std::string& original, colour::DataSet& set) {
    lines.insert(lines.begin() + 1, statedScales);
    colour::DataSet stated;
    if (colour::readCgats(textOf(lines, original), {.spectra = false}, stated) !=
            colour::Failure::None ||
        stated.device.size() != set.device.size()) {
        return;
    }
    // Fractions of 1 are left to the reader, which converts them to percent.
    const double largest = *std::max_element(stated.device.begin(), stated.device.end());
    if (largest > 1) {
        set.device = std::move(stated.device);
    }
}

void checkAmounts(const colour::DataSet& set) {
    const auto wrong = std::find_if(set.device.begin(), set.device.end(),
                                    [](double value) { return value > largestAmount; });
    if (wrong == set.device.end()) {
        return;
    }
    const auto index = static_cast<std::size_t>(wrong - set.device.begin());
    const std::size_t channels = set.channels.size();
    char amount[32];
    std::snprintf(amount, sizeof amount, "%.6g", *wrong);
    throw Failure(Status::BadDefinition, "row " + std::to_string(index / channels + 1) +
                                             " of the definition has " + amount + " for " +
                                             set.channels[index % channels] +
                                             ", which is above 100 percent");
}

void addPaper(colour::DataSet& chart, const Lines& numbers) {
    const double white = chart.deviceSpace == colour::DeviceSpace::Rgb ? 100 : 0;
    for (const std::string& number : numbers) {
        ++chart.patchCount;
        if (!chart.ids.empty()) {
            chart.ids.push_back(number);
        }
        if (!chart.names.empty()) {
            chart.names.emplace_back();
        }
        chart.device.insert(chart.device.end(), chart.channels.size(), white);
    }
}

/// Decodes ILLUMINATION_CONDITION: 0 to 3 are M0 to M3, and -1 is any. Other numbers have no
/// meaning that an export could be checked against.
std::string conditionIn(const std::string& bytes) {
    const std::string number =
        colour::cgatsKeyword(bytes, "ILLUMINATION_CONDITION").value_or(std::string());
    const bool known = number.size() == 1 && number[0] >= '0' && number[0] <= '3';
    return known ? "M" + number : std::string();
}

} // namespace

Definition readDefinition(const std::string& path) {
    std::string bytes;
    expectUsable(colour::readWholeFile(path, largestFile, bytes), Status::BadDefinition, path);
    if (std::string decoded; colour::isUtf16(bytes)) {
        colour::withoutUtf16(bytes, decoded);
        bytes = std::move(decoded);
    }
    Lines lines = linesOf(bytes);
    const Lines numbers = prepare(lines);
    colour::DataSet set;
    expectUsable(colour::readCgats(textOf(lines, bytes), {.spectra = false}, set),
                 Status::BadDefinition, path);
    if (set.hasDevice() && set.deviceSpace != colour::DeviceSpace::Rgb) {
        takeAmountsAsPercent(lines, bytes, set);
    }
    checkAmounts(set);
    Definition definition{colour::chartOf(std::move(set)), conditionIn(bytes)};
    addPaper(definition.chart, numbers);
    return definition;
}

} // namespace measuretool
