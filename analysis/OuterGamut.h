// SPDX-License-Identifier: Apache-2.0
// The patches of the outer gamut: 226 sets of process colours for judging proofs.
#pragma once

#include <cstddef>
#include <optional>

namespace analysis {

inline constexpr std::size_t outerGamutCount = 226;

/// The position in the list, from 0, of the entry within 0.5 percent of C, M, Y, K. Nothing for
/// other colours. Levels are at least 3 apart, so a colour is near one entry at most.
std::optional<std::size_t> outerGamutEntry(const double* cmyk);

} // namespace analysis
