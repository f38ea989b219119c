// SPDX-License-Identifier: Apache-2.0
// Text for a terminal.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace report {

enum class Tone { Plain, Bold, Soft, Passed, Failed, Open };

/// Gives texts their tone by escape sequences, or leaves them alone. Whatever comes from a file or
/// ticket is shown with its control characters escaped, so that it can't act on the terminal.
class Painter {
  public:
    explicit Painter(bool colours) : m_colours(colours) {}

    std::string operator()(Tone tone, std::string_view text) const;

  private:
    bool m_colours;
};

/// Whether standard output is a terminal that takes colours: not with NO_COLOR set to anything, nor
/// with TERM "dumb" or unset.
bool terminalTakesColours();

struct Cell {
    std::string text;
    Tone tone = Tone::Plain;
    bool toTheRight = false; ///< For numbers.
};

/// Columns as wide as their widest cell, two blanks apart, two in front.
std::string tableText(const std::vector<std::vector<Cell>>& lines, const Painter& paint);

} // namespace report
