// SPDX-License-Identifier: Apache-2.0
// Classifies patches by their device values: paper, a solid, a grey and so on.
#pragma once

#include <array>
#include <bitset>
#include <cstddef>
#include <optional>
#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Criteria.h"
#include "analysis/OuterGamut.h"

namespace analysis {

/// Allowed deviation of a device value in percent: eight-bit values deviate by 0.2, whole percents
/// by 0.5.
inline constexpr double deviceTolerance = 0.5;

/// True if a patch has no inks other than C, M, Y and K. A CMYK profile has no colours for other
/// patches. REQUIRES: set.hasCmyk().
bool isProcessOnly(const colour::DataSet& set, std::size_t row);

/// True if no ink is printed at all.
bool isPaper(const double* device, std::size_t channels);

/// The only ink of a patch, as the place of its channel; nothing for paper and for overprints.
std::optional<std::size_t> onlyInk(const double* device, std::size_t channels);

/// True for CMY greys that are balanced by the near-neutral formula of G7: magenta and yellow
/// follow cyan by it. The greys of ISO 12647-7 and of older strips (40/27/27) are not.
bool isBalancedGrey(const double* device, std::size_t channels);

inline constexpr std::size_t patchKinds = static_cast<std::size_t>(Patches::Repeated) + 1;

/// The patches of a comparison by kind, each list in ascending order. All and Repeated have no
/// lists.
struct Selections {
    std::array<std::vector<std::size_t>, patchKinds> lists;
    std::bitset<outerGamutCount> outerGamut; ///< Entries of the list in the data.

    const std::vector<std::size_t>& of(Patches patches) const {
        return lists[static_cast<std::size_t>(patches)];
    }
};

/// Classifies the patches of a comparison. All lists are empty if no file has process colours.
Selections selectionsOf(const Comparison& comparison);

} // namespace analysis
