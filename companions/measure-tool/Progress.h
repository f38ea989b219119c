// SPDX-License-Identifier: Apache-2.0
// Shows a measurement's progress to a person at a terminal.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdio>
#include <string>

#include "colour/DataSet.h"

namespace measuretool {

/// One line that changes with each patch. Uses standard error, or standard output if that is not a
/// terminal. Shows nothing if neither is one.
class Progress {
  public:
    Progress();
    ~Progress(); ///< Keeps the line and moves to the next.
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    /// Starts the measurement of a chart: shows its size and its first patch.
    void begin(const colour::DataSet& chart);

    /// Shows the patches measured so far, of `total`. Skips some if they change too fast.
    void show(const colour::DataSet& measurement, std::size_t done, std::size_t total);

    /// Shows a sentence on its own line.
    void say(const std::string& sentence);

    /// Replaces the text of the changing line.
    void line(const std::string& text);

  private:
    std::FILE* m_terminal = nullptr;
    bool m_open = false; ///< The cursor is in an unfinished line.
    std::chrono::steady_clock::time_point m_next{};
};

} // namespace measuretool
