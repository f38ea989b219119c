// SPDX-License-Identifier: Apache-2.0
// The definition for the measuring tool, made from the job's control-strip file, keyword by
// keyword. Every line ends with "\r\n":
//
//     CGATS.17
//     ORIGINATOR "Nerova Verify"
//     NUMBER_OF_FIELDS 11
//     BEGIN_DATA_FORMAT
//     SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B XYZ_X XYZ_Y XYZ_Z
//     END_DATA_FORMAT
//     KEYWORD DEVICE
//     DEVICE 21
//     KEYWORD ZEBRA_RULER_MODE        (depends on the instrument)
//     ZEBRA_RULER_MODE 1
//     KEYWORD LOWRES
//     LOWRES 0
//     KEYWORD ILLUMINATION_CONDITION
//     ILLUMINATION_CONDITION 1
//     KEYWORD NUMBER_OF_STRIPS
//     NUMBER_OF_STRIPS 3
//     KEYWORD NUMBER_OF_SETS
//     NUMBER_OF_SETS 72
//     KEYWORD NUMBER_OF_COLS
//     NUMBER_OF_COLS 24
//     BEGIN_DATA
//     1 0 0 0 100 16 0 0 2.1 2.2 1.8
//     ...
//     END_DATA
#include "measure/DefinitionFile.h"

#include <algorithm>
#include <fstream>
#include <initializer_list>
#include <string>
#include <string_view>

#include <unistd.h>

#include "job/JobRecords.h"
#include "measure/Paths.h"
#include "measure/StripLines.h"
#include "measure/StripText.h"

namespace {

constexpr long mostSets = 1'000'000; ///< A strip with more patches counts as damaged.

// Offsets of the number in a keyword's line. The last one includes the separator, because blanks
// may precede the number (C52).
constexpr std::size_t behindStrips = 17;
constexpr std::size_t behindSets = 15;
constexpr std::size_t behindColumns = 14;

/// Patches of paper white: filling rows without their number.
constexpr const char* rgbWhite = "\t255\t255\t255\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00\r\n";
constexpr const char* cmykWhite =
    "\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00\r\n";

/// Lines for certain instruments, in this order.
struct InstrumentLines {
    std::initializer_list<int> deviceIDs;
    const char* text;
};

constexpr InstrumentLines instrumentLines[] = {
    {{28, 29, 31, 32, 33, 43},
     "KEYWORD DEVICEMODE\r\nDEVICEMODE 0\r\n"
     "KEYWORD POSITIONING\r\nPOSITIONING 0\r\n"
     "KEYWORD MEASURINGTYPE\r\nMEASURINGTYPE 2\r\n"},
    {{33}, "KEYWORD APERTURESIZE\r\nAPERTURESIZE 6\r\n"},
    {{28, 29, 31, 32, 43}, "KEYWORD APERTURESIZE\r\nAPERTURESIZE 2\r\n"},
    {{21, 22, 48, 49, 50}, "KEYWORD ZEBRA_RULER_MODE\r\nZEBRA_RULER_MODE 1\r\n"},
};

bool contains(std::wstring_view line, std::initializer_list<std::wstring_view> words) {
    return std::any_of(words.begin(), words.end(),
                       [&](std::wstring_view word) { return line.find(word) != line.npos; });
}

/// A line in the form for a definition.
std::string conditioned(std::wstring_view line) {
    return line.empty() ? "\r\n" : StringConditioning({line.data(), line.size()}).utf8_string();
}

/// Builds the text of a definition from the lines of a strip.
class Definition {
  public:
    Definition(measure::StripText& strip, const KZJobDataStruct& job)
        : m_strip(strip), m_job(job), m_isDynamic(job.useDynstrip == 1 && job.secondStrip == 0) {}

    /// False if the size of the strip is unknown; the text ends there.
    bool build() {
        m_text = "CGATS.17\r\nORIGINATOR \"Nerova Verify\"\r\n";
        addFormat();
        addDevice();
        addInstrument();
        addLineOf("VERTICAL_MEAS");
        addLineOf("BORDER_PATCHES");
        const long strips = addNumberOf("NUMBER_OF_STRIPS", behindStrips);
        if (m_isDynamic ? !addDynamicSize(strips) : !addSize(strips)) {
            return false;
        }
        addStartOfData();
        if (m_isDynamic) {
            addFilledRows();
        } else {
            addRows();
        }
        return true;
    }

    const std::string& text() const { return m_text; }

  private:
    void add(std::string_view text) { m_text += text; }
    void addLine(std::wstring_view line) { m_text += conditioned(line); }
    void addFoundLine() { addLine({m_line.wx_str(), m_line.length()}); }

    bool find(const char* word) { return m_strip.find(word, &m_line); }

    void addFormat() {
        if (find("NUMBER_OF_FIELDS")) {
            addFoundLine();
        }
        if (find("BEGIN_DATA_FORMAT")) {
            addFoundLine();
            addLine(m_strip.nextLine()); // The field list is one line.
        }
        add("END_DATA_FORMAT\r\n");
    }

    /// If the strip does not name the instrument, there is no KEYWORD line (C51).
    void addDevice() {
        for (std::wstring_view line = m_strip.firstLine(); !m_strip.atEnd();
             line = m_strip.nextLine()) {
            if (contains(line, {L"DEVICE"}) && !contains(line, {L"KEYWORD"})) {
                add("KEYWORD\tDEVICE\r\n");
                addLine(line);
                return;
            }
        }
        add("DEVICE " + std::to_string(m_job.deviceID) + "\r\n");
    }

    void addInstrument() {
        for (const auto& [deviceIDs, text] : instrumentLines) {
            if (std::find(deviceIDs.begin(), deviceIDs.end(), m_job.deviceID) != deviceIDs.end()) {
                add(text);
            }
        }
        add("KEYWORD LOWRES\r\nLOWRES 0\r\n"
            "KEYWORD ILLUMINATION_CONDITION\r\n");
        add("ILLUMINATION_CONDITION " + std::to_string(m_job.illuminationMode) + "\r\n");
        if (m_isDynamic) {
            add("KEYWORD FORCE_LAB_CALCULATION\r\nFORCE_LAB_CALCULATION 1\r\n");
        }
    }

    /// Adds the first line with the word, if there is one (C53), and stores it in m_line.
    bool addLineOf(const char* word) {
        const bool found = find(word);
        if (found) {
            add("KEYWORD " + std::string(word) + "\r\n");
            addFoundLine();
        }
        return found;
    }

    /// Same. Returns the line's number, or 0.
    long addNumberOf(const char* word, std::size_t offset) {
        return addLineOf(word) ? measure::numberBehind(m_line, offset) : 0;
    }

    void addNumber(const std::string& word, long number) {
        add("KEYWORD " + word + "\r\n" + word + "\t" + std::to_string(number) + "\r\n");
    }

    /// A dynamic strip has as many patches as its grid has places, whatever its own count is (C54).
    bool addDynamicSize(long strips) {
        const long columns = addNumberOf("NUMBER_OF_COLS", behindColumns);
        if (columns < 1 || strips < 1 || columns > mostSets / strips) {
            return false;
        }
        m_sets = columns * strips;
        addNumber("NUMBER_OF_SETS", m_sets);
        return true;
    }

    bool addSize(long strips) {
        const long sets = addNumberOf("NUMBER_OF_SETS", behindSets);
        if (addLineOf("NUMBER_OF_COLS")) {
            return true;
        }
        if (sets < 1 || strips < 1 || sets > mostSets) {
            return false;
        }
        addNumber("NUMBER_OF_COLS", sets / strips);
        return true;
    }

    /// Moves the strip to the line before its rows, or to its end.
    void addStartOfData() {
        if (!find("END_DATA_FORMAT")) {
            return;
        }
        while (!m_strip.atEnd()) {
            const std::wstring_view line = m_strip.nextLine();
            if (contains(line, {L"BEGIN_DATA"})) {
                addLine(line);
                return;
            }
        }
    }

    /// Adds all following lines. An empty line after the last one counts as a line (C55).
    void addRows() {
        while (!m_strip.atEnd()) {
            addLine(m_strip.nextLine());
        }
    }

    /// Adds the strip's rows, and white rows up to the size of the grid.
    void addFilledRows() {
        long rows = 0;
        while (!m_strip.atEnd()) {
            const std::wstring_view line = m_strip.nextLine();
            if (contains(line, {L"END_DATA"})) {
                break;
            }
            ++rows; // The empty line after the last one counts too (C55).
            addLine(line);
        }
        const char* const white =
            find("RGB_R") && find("RGB_G") && find("RGB_B") ? rgbWhite : cmykWhite;
        for (long row = rows + 1; row <= m_sets; ++row) {
            add(std::to_string(row) + white);
        }
        add("END_DATA"); // No line end (C56).
    }

    measure::StripText& m_strip;
    const KZJobDataStruct& m_job;
    const bool m_isDynamic;
    long m_sets = 0; ///< For a dynamic strip.
    wxString m_line; ///< The line found last.
    std::string m_text;
};

/// The head of a strip, i.e. the text before its table, for instruments that are set up by their
/// own file next to the definition (C58).
std::string headOf(measure::StripText& strip) {
    std::string text;
    std::wstring_view line = strip.firstLine();
    while (!contains(line, {L"BEGIN_DATA_FORMAT", L"NUMBER_OF_FIELDS", L"SAMPLE_NAME"})) {
        text += conditioned(line);
        if (strip.atEnd()) {
            break;
        }
        line = strip.nextLine();
    }
    return text;
}

/// Replaces an existing file. A failure is noticed when the tool looks for the file (C57).
void write(const wxString& path, const std::string& text) {
    const std::string bytes = measure::pathBytes(path);
    unlink(bytes.c_str());
    std::ofstream(bytes, std::ios::binary) << text;
}

} // namespace

// The strip is read completely before any removal, because it may have the definition's name.
wxString measure::writeDefinition(const wxString& path, const KZJobDataStruct& job) {
    StripText strip;
    if (!strip.read(path)) {
        return {};
    }
    const wxString output = pathBeside(path, definitionName);
    {
        Definition definition(strip, job);
        const bool isWhole = definition.build();
        write(output, definition.text());
        if (!isWhole) {
            return {};
        }
    }
    wxString line;
    if (strip.find("File_Format=BARBIERI", &line) || strip.find("iSis_INFO", &line)) {
        write(pathBeside(path, "NMPatchSetDefinition.dcf"), headOf(strip));
    }
    return output;
}
