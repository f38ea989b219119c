// SPDX-License-Identifier: Apache-2.0
#include "colour/SingleInkSpectra.h"

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

namespace colour {
namespace {

constexpr double leastInk = 0.5; ///< Percent; less counts as not printed.

bool isSingleInk(const DataSet& set, std::size_t row) {
    const std::size_t channels = set.channels.size();
    const double* const device = &set.device[row * channels];
    return std::count_if(device, device + channels,
                         [](double value) { return value > leastInk; }) <= 1;
}

/// Whether the line that begins at `at` consists of `word`. If it does, `at` moves to the next one.
bool takeLine(std::string_view bytes, std::string_view word, std::size_t& at) {
    if (bytes.compare(at, word.size(), word) != 0) {
        return false;
    }
    const std::size_t next = bytes.find_first_not_of(" \t\r", at + word.size());
    if (next != bytes.npos && bytes[next] != '\n') {
        return false;
    }
    at = next == bytes.npos ? bytes.size() : next + 1;
    return true;
}

/// The position after the first line BEGIN_DATA at or after `at`, or npos if there is none.
std::size_t rowsBehind(std::string_view bytes, std::size_t at) {
    constexpr std::string_view start = "\nBEGIN_DATA";
    for (at = bytes.find(start, at); at != bytes.npos; at = bytes.find(start, at)) {
        ++at;
        if (takeLine(bytes, start.substr(1), at)) {
            return at;
        }
    }
    return bytes.npos;
}

/// The names of columns are words between BEGIN_DATA_FORMAT and END_DATA_FORMAT. Too few of them
/// have no room for spectra, which have 16 bands at least.
bool mayHaveSpectra(std::string_view header, std::size_t channels) {
    constexpr std::size_t fewestBands = 16;
    const std::size_t format = header.find("BEGIN_DATA_FORMAT");
    std::size_t words = 0;
    bool inWord = false;
    for (const char c : header.substr(std::min(format, header.size()))) {
        const bool isBlank = c == ' ' || c == '\t' || c == '\r' || c == '\n';
        words += !isBlank && !inWord ? 1 : 0;
        inWord = !isBlank;
    }
    return format == header.npos || words >= channels + fewestBands;
}

/// The lines of the only table, whose rows begin at `begin`. Empty if it is none.
std::vector<std::string_view> rowsOf(std::string_view bytes, std::size_t begin) {
    std::vector<std::string_view> rows;
    for (std::size_t at = begin; at < bytes.size();) {
        if (bytes[at] == 'E' && takeLine(bytes, "END_DATA", at)) {
            return rowsBehind(bytes, at - 1) == bytes.npos ? rows : std::vector<std::string_view>();
        }
        const std::size_t to = std::min(bytes.find('\n', at), bytes.size());
        const std::string_view line = bytes.substr(at, to - at);
        const std::size_t first = line.find_first_not_of(" \t\r");
        if (first != line.npos && line[first] != '#') {
            rows.push_back(line);
        }
        at = to + 1;
    }
    return {};
}

/// Adds the spectra to a set that was read without them. False if this way is not open.
bool addSpectra(std::string_view bytes, DataSet& set) {
    const std::size_t begin = rowsBehind(bytes, 0);
    if (begin == bytes.npos) {
        return false;
    }
    if (!mayHaveSpectra(bytes.substr(0, begin), set.channels.size())) {
        return true;
    }
    const std::vector<std::string_view> rows = rowsOf(bytes, begin);
    if (rows.size() != set.patchCount) {
        return false;
    }
    std::string text(bytes.substr(0, begin));
    std::vector<std::uint32_t> wanted;
    for (std::uint32_t row = 0; row < rows.size(); ++row) {
        if (isSingleInk(set, row)) {
            wanted.push_back(row);
            text.append(rows[row]).push_back('\n');
        }
    }
    text += "END_DATA\n";
    DataSet part;
    if (wanted.empty() || readCgats(text, {.spectra = true}, part) != Failure::None ||
        part.patchCount != wanted.size() || part.channels != set.channels) {
        return false;
    }
    const std::size_t channels = set.channels.size();
    for (std::size_t i = 0; i < wanted.size(); ++i) {
        const auto device = part.device.begin() + static_cast<std::ptrdiff_t>(i * channels);
        if (!std::equal(device, device + static_cast<std::ptrdiff_t>(channels),
                        &set.device[wanted[i] * channels])) {
            return false; // the few rows show another scale
        }
    }
    set.axis = part.axis;
    set.spectra = std::move(part.spectra);
    set.spectrumRows = std::move(wanted);
    for (std::string& note : part.notes) {
        const bool isNew = std::find(set.notes.begin(), set.notes.end(), note) == set.notes.end();
        if (isNew && !note.starts_with("NUMBER_OF_SETS")) { // which counts all rows
            set.notes.push_back(std::move(note));
        }
    }
    return true;
}

} // namespace

Failure readWithSingleInkSpectra(std::string_view bytes, const CgatsWants& wants, DataSet& set) {
    CgatsWants first = wants;
    first.singleInks = first.spectra = false;
    DataSet found;
    if (const Failure failure = readCgats(bytes, first, found); failure != Failure::None) {
        return failure;
    }
    const bool isRead = found.axis.length > 0 || (found.hasCmyk() && addSpectra(bytes, found));
    if (isRead) {
        set = std::move(found);
        return Failure::None;
    }
    first.spectra = true;
    return readCgats(bytes, first, set);
}

} // namespace colour
