// SPDX-License-Identifier: Apache-2.0
// The text file that passes a job's stored values to the analysis. Lines end with "\n", and tabs
// separate columns:
//
//     CGATS.17
//     KEYWORD ILLUMINATION_CONDITION
//     ILLUMINATION_CONDITION 1
//     NUMBER_OF_FIELDS 8
//     BEGIN_DATA_FORMAT
//     SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B
//     END_DATA_FORMAT
//     NUMBER_OF_SETS 1
//     BEGIN_DATA
//     1 0 0 0 100 16.25 0.25 -0.5
//     END_DATA
#include "measure/SampleFile.h"

#include <array>
#include <charconv>
#include <cstdint>
#include <fstream>
#include <span>
#include <string>
#include <string_view>

#include "job/JobRecords.h"
#include "measure/Paths.h"

namespace {

/// Used entries of a spectral row. 0 if there are no spectra or they don't fit their rows.
int spectralLength(const measurementDataRecord& measurement) {
    if (measurement.spectral == nullptr || measurement.numPatches < 1) {
        return 0;
    }
    const int length = measurement.spectral[0].length;
    return length < 0 || length > spectralValueCount ? 0 : length;
}

struct Fields {
    int count;
    std::string names; ///< Separated by tabs.
};

Fields fieldsOf(const measurementDataRecord& measurement) {
    Fields fields = {5, "SAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K"};
    if (measurement.lab != nullptr) {
        fields.count += 3;
        fields.names += "\tLAB_L\tLAB_A\tLAB_B";
    }
    if (measurement.xyz != nullptr) {
        fields.count += 3;
        fields.names += "\tXYZ_X\tXYZ_Y\tXYZ_Z";
    }
    const int length = spectralLength(measurement);
    fields.count += length;
    for (int i = 0; i < length; ++i) {
        const spectralRow& range = measurement.spectral[0];
        const std::int64_t wavelength = range.base + std::int64_t{i} * range.stepsize;
        fields.names += "\tSPECTRAL_" + std::to_string(wavelength);
    }
    return fields;
}

/// Room for "-1.2345678e-308", which has everything that a number can have.
constexpr int longestNumber = 16;

/// Rows of data, one after the other.
class Row {
  public:
    void start(int number) { m_end = std::to_chars(m_text.begin(), m_text.end(), number).ptr; }

    /// Sets the number of significant digits for this row and all later rows.
    void setPrecision(int digits) { m_precision = digits; }

    void add(std::span<const double> values) {
        for (const double value : values) {
            *m_end++ = '\t';
            m_end = std::to_chars(m_end, m_end + longestNumber, value, std::chars_format::general,
                                  m_precision)
                        .ptr;
        }
    }

    std::string_view finish() {
        *m_end++ = '\n';
        return {m_text.data(), m_end};
    }

  private:
    static constexpr int mostValues = 4 + 3 + 3 + spectralValueCount;

    // The number of a patch takes no more than a value does.
    std::array<char, (1 + mostValues) * (1 + longestNumber)> m_text;
    char* m_end = m_text.data();
    int m_precision = 6;
};

/// The precision at the end of a row applies to the device and Lab values of the next row, so only
/// the first row has them with 6 digits (C47).
void writeRows(const measurementDataRecord& measurement, std::ofstream& file) {
    const auto length = static_cast<std::size_t>(spectralLength(measurement));
    Row row;
    for (int i = 0; i < measurement.numPatches; ++i) {
        const auto patch = static_cast<std::size_t>(i);
        row.start(i + 1);
        row.add({measurement.cmyk + patch * 4, 4});
        if (measurement.lab != nullptr) {
            row.add({measurement.lab + patch * 3, 3});
        }
        if (measurement.xyz != nullptr) {
            row.setPrecision(7);
            row.add({measurement.xyz + patch * 3, 3});
        }
        if (length > 0) {
            row.setPrecision(8);
            row.add({measurement.spectral[patch].values, length});
        }
        file << row.finish();
    }
}

} // namespace

int measure::writeSampleFile(const wxString& path, int illuminationMode,
                             const measurementDataRecord& measurement) {
    std::ofstream file(pathBytes(path));
    if (measurement.cmyk == nullptr) {
        return -1;
    }
    const Fields fields = fieldsOf(measurement);
    file << "CGATS.17\n"
            "KEYWORD ILLUMINATION_CONDITION\n"
            "ILLUMINATION_CONDITION "
         << std::to_string(illuminationMode) << "\nNUMBER_OF_FIELDS "
         << std::to_string(fields.count) << "\nBEGIN_DATA_FORMAT\n"
         << fields.names << "\nEND_DATA_FORMAT\nNUMBER_OF_SETS "
         << std::to_string(measurement.numPatches) << "\nBEGIN_DATA\n";
    writeRows(measurement, file);
    file << "END_DATA\n";
    return 0;
}
