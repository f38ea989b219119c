// SPDX-License-Identifier: Apache-2.0
// Formats text for a terminal.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace report {

enum class Tone { Plain, Bold, Soft, Passed, Failed, Open };

/// Adds escape sequences for tones, or none. Control characters in texts from files and tickets are
/// escaped, so that they can't control the terminal.
class Painter {
  public:
    explicit Painter(bool colours) : m_colours(colours) {}

    std::string operator()(Tone tone, std::string_view text) const;

  private:
    bool m_colours;
};

/// Whether standard output is a terminal with colours. False if NO_COLOR is set, and if TERM is
/// "dumb" or unset.
bool terminalTakesColours();

/// The columns that a terminal needs for a line of valid UTF-8: two for each wide character
/// (Chinese, Japanese, Korean), none for a combining one.
std::size_t columnsOf(std::string_view text);

struct Cell {
    std::string text;
    Tone tone = Tone::Plain;
    bool toTheRight = false; ///< For numbers.
};

/// Columns as wide as their widest cell, separated by two blanks and indented by two.
std::string tableText(const std::vector<std::vector<Cell>>& lines, const Painter& paint);

} // namespace report
