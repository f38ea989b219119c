// SPDX-License-Identifier: Apache-2.0
// A text as a QR code (ISO/IEC 18004).
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace label {

/// Error correction: recovers about 7 or 15 percent of the code words.
enum class Correction { Low, Medium };

/// The modules of a symbol, without its quiet zone.
struct Symbol {
    static constexpr std::size_t quietZone = 4; ///< Modules of white that the standard requires.

    std::size_t side = 0;
    std::vector<bool> dark; ///< side * side, row by row.

    bool empty() const { return side == 0; }
    bool isDark(std::size_t row, std::size_t column) const { return dark[row * side + column]; }
    std::size_t sideWithQuietZone() const { return side + 2 * quietZone; }
};

/// The smallest symbol for an ASCII text. Nothing if the text is empty or too long for any symbol.
std::optional<Symbol> symbolOf(const std::string& text, Correction correction);

} // namespace label
