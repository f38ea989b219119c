// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <charconv>
#include <cmath>

#include "colour/CgatsLines.h"
#include "colour/CgatsText.h"

namespace colour {

namespace {

/// Line ends would end a value, and NULs the text, so values must not contain them.
bool isForbidden(char c) {
    return c == '\n' || c == '\r' || c == '\0';
}

void addQuoted(std::string& text, std::string_view value) {
    text += '"';
    for (const char c : value) {
        if (c == '"') {
            text += '"';
        }
        text += isForbidden(c) ? ' ' : c;
    }
    text += '"';
}

/// Writes a word unquoted if every reader parses it as one word, otherwise in quotes.
void addWord(std::string& text, std::string_view word) {
    const bool simple = !word.empty() && std::all_of(word.begin(), word.end(), [](char c) {
        return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') ||
               c == '_' || c == '-' || c == '.' || c == '+';
    });
    if (simple && !cgats::sameWord(word, "END_DATA")) {
        text += word;
    } else {
        addQuoted(text, word);
    }
}

/// Writes the shortest text that gives the same number when read.
void addNumber(std::string& text, double value) {
    char digits[32];
    const auto [end, error] = std::to_chars(digits, digits + sizeof digits, value);
    static_cast<void>(error); // the longest double has 24 characters
    text.append(digits, end);
}

void addHeaderText(std::string& text, const char* keyword, const std::string& value) {
    if (value.empty()) {
        return;
    }
    text += keyword;
    text += ' ';
    addQuoted(text, value);
    text += '\n';
}

void addHeader(std::string& text, const DataSet& set) {
    text += "CGATS.17\n";
    addHeaderText(text, "ORIGINATOR", set.originator);
    addHeaderText(text, "DESCRIPTOR", set.descriptor);
    addHeaderText(text, "CREATED", set.created);
    addHeaderText(text, "INSTRUMENTATION", set.instrumentation);
    Conditions conditions = set.conditions;
    if (set.calculated) { // the colours no longer match the source's stated conditions
        conditions.illuminant = "D50";
        conditions.observer = "2";
    }
    if (!conditions.illuminant.empty()) {
        addHeaderText(text, "WEIGHTING_FUNCTION", "ILLUMINANT, " + conditions.illuminant);
    }
    if (!conditions.observer.empty()) {
        addHeaderText(text, "WEIGHTING_FUNCTION", "OBSERVER, " + conditions.observer + " degree");
    }
    if (!conditions.measurement.empty()) {
        text += "KEYWORD \"MEASUREMENT_CONDITION\"\n";
        addHeaderText(text, "MEASUREMENT_CONDITION", conditions.measurement);
    }
    // Dark or small sets would not reveal their scales.
    text += "KEYWORD \"TINTGATE_SCALES\"\n"
            "TINTGATE_SCALES \"device 100, XYZ 100, spectra 1\"\n";
}

/// The columns of a data set's text.
struct Columns {
    explicit Columns(const DataSet& set)
        : ids(set.ids.size() == set.patchCount), names(set.names.size() == set.patchCount),
          xyz(set.xyz.size() == set.patchCount), lab(set.lab.size() == set.patchCount),
          channels(set.channels.size()), spectra(static_cast<std::size_t>(set.axis.length)) {
        if (set.device.size() != channels * set.patchCount) {
            channels = 0;
        }
        if (set.spectra.size() != spectra * set.patchCount) {
            spectra = 0;
        }
    }

    std::size_t count() const {
        return 1 + (names ? 1 : 0) + channels + (xyz ? 3 : 0) + (lab ? 3 : 0) + spectra;
    }

    bool ids;
    bool names;
    bool xyz;
    bool lab;
    std::size_t channels;
    std::size_t spectra;
};

void addFormat(std::string& text, const DataSet& set, const Columns& columns) {
    text += "NUMBER_OF_FIELDS " + std::to_string(columns.count());
    text += "\nBEGIN_DATA_FORMAT\nSAMPLE_ID";
    if (columns.names) {
        text += "\tSAMPLE_NAME";
    }
    for (std::size_t i = 0; i < columns.channels; ++i) {
        text += '\t';
        addWord(text, set.channels[i]);
    }
    if (columns.xyz) {
        text += "\tXYZ_X\tXYZ_Y\tXYZ_Z";
    }
    if (columns.lab) {
        text += "\tLAB_L\tLAB_A\tLAB_B";
    }
    for (std::size_t i = 0; i < columns.spectra; ++i) {
        text += "\tSPECTRAL_NM";
        text += std::to_string(set.axis.base + static_cast<long long>(i) * set.axis.step);
    }
    text += "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " + std::to_string(set.patchCount);
    text += "\nBEGIN_DATA\n";
}

void addNumbers(std::string& text, const double* values, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
        text += '\t';
        addNumber(text, values[i]);
    }
}

void addRow(std::string& text, const DataSet& set, const Columns& columns, std::size_t row) {
    addWord(text, columns.ids ? set.ids[row] : std::to_string(row + 1));
    if (columns.names) {
        text += '\t';
        addWord(text, set.names[row]);
    }
    addNumbers(text, set.device.data() + row * columns.channels, columns.channels);
    if (columns.xyz) {
        const double values[] = {set.xyz[row].X, set.xyz[row].Y, set.xyz[row].Z};
        addNumbers(text, values, 3);
    }
    if (columns.lab) {
        const double values[] = {set.lab[row].L, set.lab[row].a, set.lab[row].b};
        addNumbers(text, values, 3);
    }
    addNumbers(text, set.spectra.data() + row * columns.spectra, columns.spectra);
    text += '\n';
}

} // namespace

std::string writeCgats(const DataSet& set) {
    const Columns columns(set);
    std::string text;
    text.reserve(1024 + set.patchCount * columns.count() * 12);
    addHeader(text, set);
    addFormat(text, set, columns);
    for (std::size_t row = 0; row < set.patchCount; ++row) {
        addRow(text, set, columns, row);
    }
    text += "END_DATA\n";
    return text;
}

} // namespace colour
