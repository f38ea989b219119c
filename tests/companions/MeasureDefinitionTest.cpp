// SPDX-License-Identifier: Apache-2.0
// Sends random control strips through the definition writer, which cuts lines, and the measuring
// tool's reader. The reader must return the strip's content or refuse it.
#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <iostream>
#include <random>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "companions/measure-tool/Definition.h"
#include "companions/measure-tool/Failure.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

using Names = std::vector<std::string>;

struct Patch {
    std::string id;
    std::vector<double> device; ///< In percent.
};

struct Strip {
    std::string text;
    std::vector<Patch> patches; ///< Including filling rows.
    Names wholeRows;            ///< The part of each row that must be complete to be read.
    std::string names;          ///< The line of column names.
    bool dynamic = false;
    bool tooMuchInk = false;
};

class StripMaker {
  public:
    explicit StripMaker(unsigned seed) : m_engine(seed) {}

    Strip make() {
        const Names device = pick<Names>({{"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"},
                                          {"C", "M", "Y", "K"},
                                          {"Cyan", "Magenta", "Yellow", "Black"},
                                          {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "SPOT_485"},
                                          {"C", "M", "Y", "K", "SPOT_021", "SPOT_5"},
                                          {"RGB_R", "RGB_G", "RGB_B"},
                                          {"R", "G", "B"}});
        m_isRgb = device.size() == 3;
        m_tabs = chance(70);
        m_foreign = chance(70) ? below(30) : 0;
        const bool named = chance(80);
        const bool nameFirst = chance(60);
        Names columns{"SAMPLE_ID"};
        if (named && nameFirst) {
            columns.push_back("SAMPLE_NAME");
        }
        columns.insert(columns.end(), device.begin(), device.end());
        m_needed = columns.size();
        if (named && !nameFirst) {
            columns.push_back("SAMPLE_NAME");
        }
        const Names references = makeReferences();
        // Some strips start with their references.
        const bool referencesFirst = chance(15);
        const auto place = referencesFirst ? columns.begin() + 1 : columns.end();
        columns.insert(place, references.begin(), references.end());
        m_needed += referencesFirst ? references.size() : 0;

        Strip strip;
        strip.dynamic = chance(40);
        m_overInked = !m_isRgb && chance(5);
        strip.names = joined(columns);
        strip.text = "CGATS.17\n";
        if (chance(50)) {
            strip.text += "NUMBER_OF_FIELDS " + std::to_string(columns.size()) + "\n";
        }
        const std::size_t rows = 1 + below(12);
        const std::size_t grid = rows + below(4);
        strip.text += "BEGIN_DATA_FORMAT\n" + strip.names + "\nEND_DATA_FORMAT\n";
        strip.text += "NUMBER_OF_STRIPS 1\nNUMBER_OF_COLS " + std::to_string(grid) +
                      "\nNUMBER_OF_SETS " + std::to_string(rows) + "\nBEGIN_DATA\n";
        for (std::size_t row = 0; row < rows; ++row) {
            addRow(columns, row, strip);
        }
        strip.text += "END_DATA\n";
        for (std::size_t row = rows; strip.dynamic && row < grid; ++row) {
            strip.patches.push_back(
                {std::to_string(row + 1), std::vector<double>(device.size(), m_isRgb ? 100 : 0)});
        }
        return strip;
    }

  private:
    std::size_t below(std::size_t limit) { return m_engine() % limit; }
    bool chance(unsigned percent) { return below(100) < percent; }

    template<class T>
    T pick(const std::vector<T>& choices) {
        return choices[below(choices.size())];
    }

    Names makeReferences() {
        const Names lab{"LAB_L", "LAB_A", "LAB_B"};
        switch (below(4)) {
        case 0:
            return {};
        case 1:
            return lab;
        case 2:
            return {"LAB_L", "LAB_A", "LAB_B", "XYZ_X", "XYZ_Y", "XYZ_Z"};
        default:
            Names spectra;
            const std::string start = pick<std::string>({"SPECTRAL_NM_", "SPECTRAL_", "nm"});
            for (int nm = 380; nm <= 730; nm += 10) {
                spectra.push_back(start + std::to_string(nm));
            }
            return spectra;
        }
    }

    std::string joined(const Names& cells) {
        std::string line;
        for (const std::string& cell : cells) {
            line += (line.empty() ? "" : m_tabs ? "\t" : pick<std::string>({" ", "  "})) + cell;
        }
        return line;
    }

    std::string makeName() {
        const Names letters{"ä", "白", "😀", "é", " ", "3"};
        std::string name = "N";
        for (std::size_t i = below(16); i > 0; --i) {
            name += below(100) < m_foreign ? pick(letters) : "x";
        }
        name += "n";
        return m_tabs ? name : "\"" + name + "\"";
    }

    std::string makeAmount(double& percent) {
        char text[32];
        if (m_isRgb) {
            const int value = static_cast<int>(below(256));
            percent = value / 2.55;
            return std::to_string(value);
        }
        percent = pick<double>({0, 100, 100, static_cast<double>(below(101)),
                                static_cast<double>(below(10001)) / 100});
        std::snprintf(text, sizeof text, chance(50) ? "%.2f" : "%g", percent);
        return text;
    }

    void addRow(const Names& columns, std::size_t row, Strip& strip) {
        Patch patch;
        Names cells;
        for (const std::string& column : columns) {
            if (column == "SAMPLE_ID") {
                patch.id = std::to_string(row + 1);
                cells.push_back(patch.id);
            } else if (column == "SAMPLE_NAME") {
                cells.push_back(makeName());
            } else if (column.starts_with("LAB") || column.starts_with("XYZ")) {
                cells.push_back(pick<std::string>({"1", "55", "-37.25", "84.0123456789"}));
            } else if (column.starts_with("SPECTRAL") || column.starts_with("nm")) {
                cells.push_back(pick<std::string>({"0.1", "0.123456789012"}));
            } else {
                double percent = 0;
                std::string amount = makeAmount(percent);
                // The largest amount shows the strip's scale, so one patch has a full ink.
                if (row == 0 && patch.device.empty()) {
                    percent = 100;
                    amount = m_isRgb ? "255" : "100";
                }
                if (m_overInked && row == 0 && patch.device.size() == 1) {
                    amount = std::to_string(102 + below(154));
                    strip.tooMuchInk = true;
                }
                patch.device.push_back(percent);
                cells.push_back(amount);
            }
        }
        const std::string line = joined(cells);
        strip.text += line + "\n";
        strip.patches.push_back(std::move(patch));
        std::size_t end = 0;
        for (std::size_t i = 0; i < m_needed; ++i) {
            end = line.find(cells[i], end) + cells[i].size();
        }
        const bool last = m_needed == cells.size();
        strip.wholeRows.push_back(line.substr(0, end) + (last ? "\r" : line.substr(end, 1)));
    }

    std::mt19937 m_engine;
    bool m_isRgb = false;
    bool m_tabs = true;
    bool m_overInked = false;
    std::size_t m_foreign = 0; ///< Percentage of non-ASCII characters in names.
    std::size_t m_needed = 0;  ///< Cells of a row up to the last device value.
};

/// True if no needed part can have been cut: then the reader must not refuse.
bool mustBeRead(const Strip& strip, const std::string& definition) {
    const auto isPlain = [](const std::string& line) {
        return line.size() < 508 &&
               std::all_of(line.begin(), line.end(), [](char c) { return (c & 0x80) == 0; });
    };
    bool whole = isPlain(strip.names) && !strip.tooMuchInk;
    for (const std::string& row : strip.wholeRows) {
        // A row that ends with a needed cell is safe only if it can't have been cut.
        const bool arrived = definition.find("\n" + row) != definition.npos;
        whole = whole && arrived && (row.back() != '\r' || isPlain(row));
    }
    return whole;
}

TEST(MeasureDefinition, IsReadRightOrRefused) {
    const char* const given = std::getenv("TINTGATE_SEED");
    const unsigned first =
        given != nullptr ? static_cast<unsigned>(std::atol(given)) : std::random_device()();
    std::cout << "TINTGATE_SEED=" << first << '\n';
    const support::ScratchFolder folder;
    int read = 0;
    int refused = 0;
    for (unsigned round = 0; round < 800; ++round) {
        const Strip strip = StripMaker(first + round).make();
        SCOPED_TRACE("TINTGATE_SEED=" + std::to_string(first + round) + "\n" + strip.text);
        KZJobDataStruct job;
        job.useDynstrip = strip.dynamic ? 1 : 0;
        job.illuminationMode = static_cast<int>(round % 5) - 1;
        const wxString path = KZVerifyJobProcessor().WriteTemporaryMeasurementDefinitionFile(
            folder.write("strip.it8", strip.text), &job);
        const std::string definition = support::contentsOf(path.utf8_string());
        const bool mustBe = mustBeRead(strip, definition);
        try {
            const measuretool::Definition result = measuretool::readDefinition(path.utf8_string());
            const colour::DataSet& chart = result.chart;
            ++read;
            ASSERT_FALSE(strip.tooMuchInk);
            ASSERT_EQ(chart.patchCount, strip.patches.size());
            const std::size_t channels = strip.patches[0].device.size();
            ASSERT_EQ(chart.channels.size(), channels);
            for (std::size_t i = 0; i < chart.patchCount; ++i) {
                ASSERT_EQ(chart.ids[i], strip.patches[i].id);
                for (std::size_t k = 0; k < channels; ++k) {
                    ASSERT_NEAR(chart.device[i * channels + k], strip.patches[i].device[k], 1e-9);
                }
            }
            ASSERT_EQ(result.condition, round % 5 == 0 ? "" : "M" + std::to_string(round % 5 - 1));
        } catch (const measuretool::Failure& failure) {
            ++refused;
            ASSERT_EQ(failure.status, measuretool::Status::BadDefinition);
            ASSERT_FALSE(mustBe) << failure.what() << "\n" << definition;
        }
    }
    // Both outcomes must occur, or the test proves nothing.
    EXPECT_GT(read, 250);
    EXPECT_GT(refused, 50);
}

} // namespace
