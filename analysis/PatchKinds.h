// SPDX-License-Identifier: Apache-2.0
// What a patch is by its device values: paper, a solid, a grey and so on.
#pragma once

#include <array>
#include <bitset>
#include <cstddef>
#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Criteria.h"
#include "analysis/OuterGamut.h"

namespace analysis {

/// How far a device value may be off and still count, in percent: eight-bit values miss by 0.2,
/// whole percents by 0.5.
inline constexpr double deviceTolerance = 0.5;

/// True if a patch has no ink beside C, M, Y and K. A CMYK profile has colours for no other patch.
/// REQUIRES: set.hasCmyk().
bool isProcessOnly(const colour::DataSet& set, std::size_t row);

inline constexpr std::size_t patchKinds = static_cast<std::size_t>(Patches::Repeated) + 1;

/// The patches of a comparison by kind, each list by rising index. Those of All and Repeated are
/// not listed.
struct Selections {
    std::array<std::vector<std::size_t>, patchKinds> lists;
    std::bitset<outerGamutCount> outerGamut; ///< Entries of the list that are there.

    const std::vector<std::size_t>& of(Patches patches) const {
        return lists[static_cast<std::size_t>(patches)];
    }
};

/// Sorts the patches of a comparison. All lists are empty if no file has process colours.
Selections selectionsOf(const Comparison& comparison);

} // namespace analysis
