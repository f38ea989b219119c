// SPDX-License-Identifier: Apache-2.0
// What a person at a terminal sees of a measurement.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdio>
#include <string>

#include "colour/DataSet.h"

namespace measuretool {

/// One line that changes from patch to patch; nothing at all where nobody looks. Standard error, or
/// where that is no terminal, standard output.
class Progress {
  public:
    Progress();
    ~Progress(); ///< Leaves the line as it is and goes to the next.
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    /// The measurement of a chart begins: its size and its first patch.
    void begin(const colour::DataSet& chart);

    /// The patches of the measurement so far, of `total`. Faster than an eye, some are passed over.
    void show(const colour::DataSet& measurement, std::size_t done, std::size_t total);

    /// A sentence on a line of its own.
    void say(const std::string& sentence);

    /// A text in the line that changes.
    void line(const std::string& text);

  private:
    std::FILE* m_terminal = nullptr;
    bool m_open = false; ///< The cursor stands in a line.
    std::chrono::steady_clock::time_point m_next{};
};

} // namespace measuretool
