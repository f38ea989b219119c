// SPDX-License-Identifier: Apache-2.0
// What tests of tintgate-check have in common: a home of their own, and measurements made of
// Debian's data sets.
#pragma once

#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace checktest {

namespace fs = std::filesystem;
using Json = nlohmann::json;

inline const std::string icc = "/usr/share/color/icc/";
inline const std::string presets = TINTGATE_SOURCE_DIR "/presets/";

/// One wedge of FOGRA39L: paper, solids, secondaries and greys, with L* `shift` too high. Against
/// FOGRA39L it passes at 0 and fails at 8.
inline std::string wedge(double shift, bool withGreys = true) {
    std::string text = support::contentsOf(icc + "FOGRA39L.ti3");
    std::erase(text, '\r');
    const std::size_t data = text.find("BEGIN_DATA\n") + 11;
    std::string rows;
    int count = 0;
    std::istringstream lines(text.substr(data, text.find("END_DATA\n", data) - data));
    for (std::string line; std::getline(lines, line);) {
        std::istringstream cells(line);
        std::string id;
        double c, m, y, k, X, Y, Z, L, a, b;
        cells >> id >> c >> m >> y >> k >> X >> Y >> Z >> L >> a >> b;
        const bool isSolid = (c == 0 || c == 100) && (m == 0 || m == 100) && (y == 0 || y == 100);
        const bool isGrey = m > 0 && m == y && c > m && c < 70 && k == 0;
        if ((isSolid && (k == 0 || (k == 100 && c + m + y == 0))) || (isGrey && withGreys)) {
            std::ostringstream row;
            row << id << ' ' << c << ' ' << m << ' ' << y << ' ' << k << ' ' << L + shift << ' '
                << a << ' ' << b << '\n';
            rows += row.str();
            ++count;
        }
    }
    return "CGATS.17\nNUMBER_OF_FIELDS 8\nBEGIN_DATA_FORMAT\n"
           "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\nEND_DATA_FORMAT\n"
           "NUMBER_OF_SETS " +
           std::to_string(count) + "\nBEGIN_DATA\n" + rows + "END_DATA\n";
}

class CheckTest : public testing::Test {
  protected:
    CheckTest() {
        m_options.folder = m_scratch.path();
        m_options.environment = {{"HOME", m_scratch.path("home")},
                                 {"XDG_CONFIG_HOME", std::nullopt},
                                 {"TINTGATE_ROOT", m_scratch.path("root")}};
    }

    support::Outcome check(std::vector<std::string> words) const {
        words.insert(words.begin(), TINTGATE_CHECK);
        return support::run(words, m_options);
    }

    /// The lines of JSON that a run prints.
    std::vector<Json> lines(std::vector<std::string> words) const {
        words.insert(words.begin(), "--json");
        std::istringstream output(check(words).output);
        std::vector<Json> all;
        for (std::string line; std::getline(output, line);) {
            all.push_back(Json::parse(line));
        }
        return all;
    }

    const support::ScratchFolder m_scratch;
    support::RunOptions m_options;
};

} // namespace checktest
