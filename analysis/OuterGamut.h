// SPDX-License-Identifier: Apache-2.0
// The patches of the outer gamut: 226 sets of process colours that proofs are judged by.
#pragma once

#include <cstddef>
#include <optional>

namespace analysis {

inline constexpr std::size_t outerGamutCount = 226;

/// Place in the list, from 0, of the entry within 0.5 percent of C, M, Y, K; nothing for other
/// colours. Levels are at least 3 apart, so no colour is near two entries.
std::optional<std::size_t> outerGamutEntry(const double* cmyk);

} // namespace analysis
