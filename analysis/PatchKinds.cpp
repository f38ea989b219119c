// SPDX-License-Identifier: Apache-2.0
#include "analysis/PatchKinds.h"

#include <algorithm>
#include <cmath>
#include <cstdint>

namespace analysis {
namespace {

/// CMY triplets in use as greys, in percent: those of ISO 12647-7 and its control strips, those of
/// older strips, and those of the near-neutral formula.
constexpr double greyTriplets[][3] = {
    {10, 6, 6},       {20, 12, 12},       {40, 27, 27},       {60, 45, 45},
    {80, 65, 65},     {100, 85, 85},      {3.1, 2.2, 2.2},    {10.2, 7.4, 7.4},
    {25, 19, 19},     {50, 40, 40},       {75, 66, 66},       {3, 2.24, 2.24},
    {10, 7.46, 7.46}, {25, 18.88, 18.88}, {75, 66.12, 66.12}, {90, 85.34, 85.34},
};
constexpr std::size_t firstBalanced = 6; ///< From here on they are by the near-neutral formula.

using KindSet = std::uint32_t;

constexpr KindSet kind(Patches patches) {
    return KindSet{1} << static_cast<unsigned>(patches);
}

bool near(double value, double wanted) {
    return std::abs(value - wanted) <= deviceTolerance;
}

/// True for one of the triplets from `first` on.
bool isGrey(const double* cmyk, std::size_t first) {
    if (std::abs(cmyk[1] - cmyk[2]) > 2 * deviceTolerance) { // magenta and yellow are alike in all
        return false;
    }
    return std::any_of(greyTriplets + first, std::end(greyTriplets), [&](const double* grey) {
        return near(cmyk[0], grey[0]) && near(cmyk[1], grey[1]) && near(cmyk[2], grey[2]);
    });
}

/// Kinds of a patch with process inks only. Most kinds depend on which inks are 0 or 100.
KindSet kindsOfProcess(const double* cmyk, std::bitset<outerGamutCount>& outerGamut) {
    constexpr unsigned c = 1, m = 2, y = 4, k = 8;
    unsigned none = 0;
    unsigned full = 0;
    for (unsigned ink = 0; ink < 4; ++ink) {
        none |= near(cmyk[ink], 0) ? 1u << ink : 0;
        full |= near(cmyk[ink], 100) ? 1u << ink : 0;
    }
    KindSet kinds = 0;
    if ((none | full) == (c | m | y | k)) {
        constexpr struct {
            unsigned inks;
            KindSet kinds;
        } pureKinds[] = {
            {0, kind(Patches::Paper)},
            {c, kind(Patches::SolidCyan) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
            {m,
             kind(Patches::SolidMagenta) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
            {y,
             kind(Patches::SolidYellow) | kind(Patches::Solids) | kind(Patches::ChromaticSolids)},
            {k, kind(Patches::SolidBlack) | kind(Patches::Solids)},
            {m | y, kind(Patches::Red) | kind(Patches::Secondaries)},
            {c | y, kind(Patches::Green) | kind(Patches::Secondaries)},
            {c | m, kind(Patches::Blue) | kind(Patches::Secondaries)},
        };
        for (const auto& entry : pureKinds) {
            kinds |= full == entry.inks ? entry.kinds : 0;
        }
    }
    const bool isPaper = kinds == kind(Patches::Paper);
    if ((none & (c | m | y)) != 0) { // greys have all three
        if ((none & k) != 0 && !isPaper) {
            kinds |= kind(Patches::SurfaceGamut);
        }
        if (const auto entry = outerGamutEntry(cmyk)) {
            outerGamut.set(*entry);
            kinds |= kind(Patches::OuterGamut);
        }
    } else if ((none & k) != 0 && isGrey(cmyk, 0)) {
        kinds |= kind(Patches::Greys);
    }
    return kinds;
}

/// All kinds of a patch. `channels` are process inks followed by spot colours.
KindSet kindsOf(const double* device, std::size_t channels,
                std::bitset<outerGamutCount>& outerGamut) {
    const auto off = [](double value) { return near(value, 0); };
    const double* const spots = device + 4;
    const double* const end = device + channels;
    const auto inked = static_cast<std::size_t>(end - spots) -
                       static_cast<std::size_t>(std::count_if(spots, end, off));
    if (inked == 0) {
        return kindsOfProcess(device, outerGamut);
    }
    if (inked == 1 && std::all_of(device, spots, off) &&
        std::any_of(spots, end, [](double value) { return near(value, 100); })) {
        return kind(Patches::Spots);
    }
    return 0;
}

} // namespace

bool isProcessOnly(const colour::DataSet& set, std::size_t row) {
    const std::size_t channels = set.channels.size();
    const double* const device = &set.device[row * channels];
    return std::all_of(device + 4, device + channels, [](double value) { return near(value, 0); });
}

bool isPaper(const double* device, std::size_t channels) {
    return std::all_of(device, device + channels, [](double value) { return near(value, 0); });
}

std::optional<std::size_t> onlyInk(const double* device, std::size_t channels) {
    std::optional<std::size_t> ink;
    for (std::size_t i = 0; i < channels; ++i) {
        if (near(device[i], 0)) {
            continue;
        }
        if (ink) {
            return std::nullopt;
        }
        ink = i;
    }
    return ink;
}

bool isBalancedGrey(const double* device, std::size_t channels) {
    return isGrey(device, firstBalanced) && isPaper(device + 3, channels - 3);
}

Selections selectionsOf(const Comparison& c) {
    Selections selections;
    if (!c.devices || !c.devices->file.set->hasCmyk()) {
        return selections;
    }
    const std::size_t channels = c.devices->file.set->channels.size();
    for (std::size_t patch = 0; patch < c.patchCount(); ++patch) {
        KindSet kinds = kindsOf(c.deviceOf(patch), channels, selections.outerGamut);
        for (std::size_t i = 0; kinds; ++i, kinds >>= 1) {
            if (kinds & 1) {
                selections.lists[i].push_back(patch);
            }
        }
    }
    return selections;
}

} // namespace analysis
