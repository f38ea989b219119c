// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfMeasurement.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

#include <wx/datetime.h>

#include "jdf/JdfBuffer.h"

namespace {

constexpr std::size_t longestText = 180;
constexpr long longestSpectralPiece = 200;

template<std::size_t N>
std::string_view textOf(const char (&field)[N]) {
    return {field, strnlen(field, N)};
}

/// Truncates toward zero. NaN and values out of range give LONG_MIN, as the processor does.
long truncated(double value) {
    return value >= -0x1p63 && value < 0x1p63 ? static_cast<long>(value) : LONG_MIN;
}

long micro(double value) {
    return truncated(value * 1000000);
}

/// Rounds halves away from zero. NaN and values out of range give INT_MIN.
int roundedMicro(double value) {
    const double rounded = std::round(value * 1000000);
    return rounded >= INT_MIN && rounded <= INT_MAX ? static_cast<int>(rounded) : INT_MIN;
}

/// Converts a device value of 0 to 255 to whole percent, as a 16-bit integer.
double percent(double value) {
    const auto whole = static_cast<std::uint64_t>(truncated(std::floor(value / 2.55 + 0.5)));
    return static_cast<double>(whole & 0xFFFF);
}

/// Writes pieces at one position of a buffer. Meanwhile the text after that position is kept at the
/// buffer's end. So it moves only twice, whatever the number of pieces, and nothing is allocated.
/// Each piece is checked against the limit as if it were inserted alone.
class Pieces {
  public:
    Pieces(char* at, char* buffer, char* limit, long* length)
        : m_at(std::min(at, buffer + *length)), m_room(std::max(limit - buffer - *length, 0L)),
          m_after(buffer + *length - m_at), m_length(*length) {
        std::memmove(m_at + m_room, m_at, static_cast<std::size_t>(m_after));
    }
    ~Pieces() {
        std::memmove(m_at + m_done, m_at + m_room, static_cast<std::size_t>(m_after));
        m_length += m_done;
    }
    Pieces(const Pieces&) = delete;
    Pieces& operator=(const Pieces&) = delete;

    Pieces& operator<<(std::string_view text) {
        const auto size = static_cast<long>(text.size());
        if (m_used + size < m_room) {
            std::memcpy(m_at + m_used, text.data(), text.size());
        }
        m_used += size;
        return *this;
    }

    Pieces& operator<<(long number) {
        char digits[24];
        const auto end = std::to_chars(std::begin(digits), std::end(digits), number).ptr;
        return *this << std::string_view(digits, static_cast<std::size_t>(end - digits));
    }

    /// Length of the unfinished piece.
    long size() const { return m_used - m_done; }

    /// Ends the piece. Returns 0, or -30 if the piece is dropped.
    int end() {
        if (m_used >= m_room) {
            m_used = m_done;
            return jdf::BufferFull;
        }
        m_done = m_used;
        return jdf::Done;
    }

  private:
    char* const m_at;
    const long m_room;
    const long m_after; ///< Length of the text after the position.
    long& m_length;
    long m_done = 0; ///< Length of the finished pieces.
    long m_used = 0; ///< Includes the unfinished piece, which may exceed the room.
};

std::string_view boolean(bool value) {
    return value ? "true" : "false";
}

/// The element's name. Empty for a strip without an element (C80).
std::string_view elementName(const JDFMeasurementHeader& header) {
    constexpr std::string_view names[] = {"tazo:Measurement", "tazo:Measurement2"};
    return header.secondStrip < std::size(names) ? names[header.secondStrip] : "";
}

int writeOpening(Pieces& pieces, const JDFMeasurementHeader& header, std::string_view comment) {
    if (elementName(header).empty()) {
        return jdf::Done;
    }
    const bool isMeasured = header.measureDate[0] != '\0' || header.measureTime[0] != '\0';
    const std::string date = isMeasured ? std::string(textOf(header.measureDate))
                                        : wxDateTime::Now().FormatISODate().ToStdString(wxConvLibc);
    const std::string time = isMeasured ? std::string(textOf(header.measureTime))
                                        : wxDateTime::Now().FormatISOTime().ToStdString(wxConvLibc);
    pieces << "<" << elementName(header) << " Date=\"" << date << "\" Time=\"" << time
           << "\" Comment=\"" << comment << "\" ";
    return pieces.end();
}

/// Only the result of the last piece is returned (C78).
int writeAttributes(Pieces& pieces, const measurementDataRecord& measurement,
                    JDFMeasurementHeader& header) {
    pieces << "Approval=\"" << boolean(header.approval) << "\" MaxDeltaE=\""
           << micro(header.maxDeltaE) << "\" TotalPass=\"" << boolean(header.totalPass)
           << "\" CMMVersion=\"" << textOf(header.cmmVersion) << "\" ";
    pieces.end();

    if (textOf(header.deltaEType) == "CIELAB") {
        std::strcpy(header.deltaEType, "CIE Lab");
    }
    pieces << "MaxToleranc=\"" << micro(header.maxTolerance) << "\" TypeOfDeltaE=\""
           << textOf(header.deltaEType) << "\" AverageDeltaE=\"" << micro(header.averageDeltaE)
           << "\" ";
    pieces.end();

    pieces << "SpectralCount=\"" << (measurement.hasSpectral ? measurement.numPatches : 0)
           << "\" PaperWhitePass=\"" << boolean(header.paperWhitePass) << "\" AverageToleranc=\""
           << micro(header.averageTolerance) << "\">";
    pieces.end();

    pieces << "<FileSpec URL=\"cid:" << textOf(header.profileName).substr(0, longestText)
           << "\" MimeType=\"application/icc\" UserFileName=\"\""
              " DescriptiveName=\"EmbeddedProfileName\"/>\n";
    return pieces.end();
}

int writePatchDefinition(Pieces& pieces, int patch, const double* cmyk) {
    pieces << "<tazo:PatchDefinitionData" << patch << " CValue=\"" << micro(percent(cmyk[0]))
           << "\" KValue=\"" << micro(percent(cmyk[3])) << "\" MValue=\"" << micro(percent(cmyk[1]))
           << "\" YValue=\"" << micro(percent(cmyk[2])) << "\"/>\r\n";
    return pieces.end();
}

int writePatch(Pieces& pieces, const double* xyz) {
    pieces << "<tazo:PatchData XValue=\"" << truncated(xyz[0] * 100) << "\" YValue=\""
           << truncated(xyz[1] * 100) << "\" ZValue=\"" << truncated(xyz[2] * 100) << "\"/>\r\n";
    return pieces.end();
}

std::array<std::string, spectralValueCount> spectralNames() {
    std::array<std::string, spectralValueCount> names;
    for (int i = 0; i < spectralValueCount; ++i) {
        names[i] = "dvalue" + std::to_string(i) + "=\"";
    }
    return names;
}

int writeSpectrum(Pieces& pieces, int patch, const spectralRow& row) {
    static const auto names = spectralNames();
    pieces << "<tazo:SpectralData" << patch << " ";
    for (int i = 0; i < spectralValueCount; ++i) {
        pieces << names[i] << roundedMicro(row.values[i]) << "\"";
        if (pieces.size() > longestSpectralPiece) {
            if (const int error = pieces.end()) {
                return error;
            }
        }
    }
    pieces << "/>\r\n";
    return pieces.end();
}

/// Writes one kind of line after the other, up to the first refused piece.
int writePatches(Pieces& pieces, const measurementDataRecord& measurement, bool definitions) {
    int error = jdf::Done;
    const auto forEachPatch = [&](bool isThere, auto write) {
        for (int i = 0; isThere && error == jdf::Done && i < measurement.numPatches; ++i) {
            error = write(i);
        }
    };
    forEachPatch(definitions && measurement.cmyk != nullptr, [&](int i) {
        return writePatchDefinition(pieces, i, measurement.cmyk + std::ptrdiff_t{4} * i);
    });
    forEachPatch(measurement.xyz != nullptr, [&](int i) {
        return writePatch(pieces, measurement.xyz + std::ptrdiff_t{3} * i);
    });
    forEachPatch(measurement.spectral != nullptr,
                 [&](int i) { return writeSpectrum(pieces, i, measurement.spectral[i]); });
    return error;
}

int writeElement(Pieces& pieces, const measurementDataRecord& measurement,
                 JDFMeasurementHeader& header, std::string_view comment) {
    writeOpening(pieces, header, comment);
    int error = writeAttributes(pieces, measurement, header);
    if (error == jdf::Done) {
        error = writePatches(pieces, measurement, header.writePatchDefinitions);
    }
    if (error != jdf::Done || elementName(header).empty()) {
        return error;
    }
    pieces << "</" << elementName(header) << ">\n";
    return pieces.end();
}

} // namespace

int WriteJDFMeasureData(char* at, char* buffer, char* limit, long* length,
                        measurementDataRecord measurement, JDFMeasurementHeader* header,
                        wxString comment) {
    const wxCharBuffer narrow = comment.mb_str(wxConvLibc);
    const std::string text(narrow.data(), strnlen(narrow.data(), longestText));

    Pieces pieces(at, buffer, limit, length);
    return writeElement(pieces, measurement, *header, text);
}
