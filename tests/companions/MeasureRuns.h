// SPDX-License-Identifier: Apache-2.0
// Runs the measuring tool on definitions as the writer makes them.
#pragma once

#include <cmath>
#include <filesystem>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/CgatsText.h"

namespace measuretool {

inline const std::string profile = "/usr/share/color/icc/ghostscript/default_cmyk.icc";
inline const std::string virtualPrint = "instrument = virtual\nprofile = " + profile + "\n";

inline const std::string head = "CGATS.17\nORIGINATOR \"Nerova Verify\"\n";
inline const std::string cmyk = "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
inline const std::string begin = "BEGIN_DATA\n";
inline const std::string end = "END_DATA\n";
inline const std::string paper = "0\t0\t0\t0";
inline const std::string rows = begin + "1\t100\t0\t0\t0\n2\t40\t27\t27\t0\n";

inline std::string format(const std::string& names) {
    return "BEGIN_DATA_FORMAT\nSAMPLE_ID\t" + names + "\nEND_DATA_FORMAT\n";
}

/// Converts line ends to CR LF, as in definitions.
inline std::string crlf(const std::string& text) {
    return std::regex_replace(text, std::regex("\n"), "\r\n");
}

/// A definition of patches such as "100\t0\t0\t0".
inline std::string definitionOf(const std::vector<std::string>& patches) {
    std::string lines;
    for (std::size_t i = 0; i < patches.size(); ++i) {
        lines += std::to_string(i + 1) + "\t" + patches[i] + "\n";
    }
    return crlf(head + format(cmyk) + "DEVICE 33\n" + begin + lines + end);
}

/// "1: 100 0 0 0; 2: 40 27 27 0; "
inline std::string patchesText(const colour::DataSet& set) {
    std::ostringstream text;
    const std::size_t channels = set.channels.size();
    for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
        text << set.ids[patch] << ':';
        for (std::size_t i = 0; i < channels; ++i) {
            text << ' ' << std::round(100 * set.device[patch * channels + i]) / 100;
        }
        text << "; ";
    }
    return text.str();
}

class MeasureTool : public testing::Test {
  protected:
    MeasureTool() { m_folder.makeFolder("out"); }

    support::Outcome measure(const std::string& definition, const std::string& settings) const {
        m_folder.write("definition.it8", definition);
        return support::run({MEASURE_TOOL, writeOptions()}, environmentWith(settings));
    }

    std::string writeOptions() const {
        return m_folder.write("options",
                              "-apnm\nNerova Verify\n-l\n57\n-pwd\n\"\"\n-i\nInstrument 33"
                              "\n-m\nmeasure\n-o\n" +
                                  m_output + "\n-patch\n" + m_folder.path("definition.it8") +
                                  "\n-patchname\nstrip.it8\n-forcemeasure\nTrue\n");
    }

    support::RunOptions environmentWith(const std::string& settings) const {
        support::RunOptions options;
        options.environment["TINTGATE_MEASURE"] = m_folder.write("settings", settings);
        return options;
    }

    /// Returns the measurement and empties its folder.
    colour::DataSet takeResult() const {
        m_log = support::exists(m_logPath) ? support::contentsOf(m_logPath) : "";
        std::filesystem::remove(m_logPath);
        colour::DataSet set;
        if (support::exists(m_output)) {
            EXPECT_EQ(colour::readCgats(support::contentsOf(m_output), {}, set),
                      colour::Failure::None);
            std::filesystem::remove(m_output);
        }
        EXPECT_TRUE(std::filesystem::is_empty(m_folder.path("out")));
        return set;
    }

    /// Measures, and expects success.
    colour::DataSet measured(const std::string& definition, const std::string& settings) const {
        const support::Outcome outcome = measure(definition, settings);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
        EXPECT_EQ(outcome.output + outcome.error, "");
        return takeResult();
    }

    /// Expects one distinct failure, one line, and no measurement. The log must have the line too.
    void expectFailure(const support::Outcome& outcome, int exitCode, const std::string& words,
                       bool isLogged = true) const {
        EXPECT_EQ(outcome.exitCode, exitCode) << words;
        EXPECT_THAT(outcome.error, testing::HasSubstr(words));
        EXPECT_EQ(outcome.error.find('\n'), outcome.error.size() - 1) << outcome.error;
        EXPECT_EQ(takeResult().patchCount, 0u) << words;
        const std::string line = outcome.error.substr(outcome.error.find(' ') + 1);
        EXPECT_THAT(m_log, testing::EndsWith(isLogged ? " " + line : ""));
    }

    const support::ScratchFolder m_folder;
    const std::string m_output = m_folder.path("out/Measured sample.txt");
    const std::string m_logPath = m_folder.path("out/NerovaMeasure.log");
    mutable std::string m_log; ///< From the latest run.
};

} // namespace measuretool
