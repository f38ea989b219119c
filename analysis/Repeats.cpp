// SPDX-License-Identifier: Apache-2.0
#include "analysis/Repeats.h"

#include <algorithm>
#include <bit>
#include <utility>

#include "colour/Difference.h"

namespace analysis {
namespace {

using colour::Lab;
using colour::Xyz;

/// Finds the first patch of each group, in linear time.
class FirstPatches {
  public:
    explicit FirstPatches(const Comparison& c)
        : m_c(c), m_channels(c.devices ? c.devices->file.set->channels.size() : 0),
          m_slots(std::bit_ceil(std::max<std::size_t>(c.patchCount(), 8) * 2), noRow),
          m_shift(64 - std::countr_zero(m_slots.size())) {}

    /// The first equal patch of those passed so far. This may be the patch itself.
    std::uint32_t of(std::uint32_t patch) {
        for (std::size_t at = slotOf(patch);; at = (at + 1) & (m_slots.size() - 1)) {
            if (m_slots[at] == noRow) {
                m_slots[at] = patch;
            }
            if (same(m_slots[at], patch)) {
                return m_slots[at];
            }
        }
    }

  private:
    /// The highest bits of a product depend on all others. The low bits of whole percents are 0.
    std::size_t slotOf(std::uint32_t patch) const {
        constexpr std::uint64_t factor = 0x9E3779B97F4A7C15;
        std::uint64_t h = 0;
        if (m_channels == 0) {
            h = m_c.selectedRow[patch];
        } else {
            for (const double *at = m_c.deviceOf(patch), *end = at + m_channels; at != end; ++at) {
                h ^= std::bit_cast<std::uint64_t>(*at + 0.0); // -0 is 0
                h *= factor;
                h ^= h >> 32;
            }
        }
        return h * factor >> m_shift;
    }

    bool same(std::uint32_t a, std::uint32_t b) const {
        if (a == b) {
            return true;
        }
        if (m_channels == 0) {
            return m_c.selectedRow[a] == m_c.selectedRow[b];
        }
        const double* const values = m_c.deviceOf(a);
        return std::equal(values, values + m_channels, m_c.deviceOf(b));
    }

    const Comparison& m_c;
    std::size_t m_channels;
    std::vector<std::uint32_t> m_slots;
    int m_shift; ///< Leaves as many bits of a hash as an index of m_slots has.
};

/// Numbers the groups in the order of their first patches. Returns their count.
std::size_t numberGroups(Comparison& c) {
    FirstPatches first(c);
    c.groupOf.resize(c.patchCount());
    std::uint32_t groups = 0;
    for (std::uint32_t patch = 0; patch < c.patchCount(); ++patch) {
        const std::uint32_t like = first.of(patch);
        c.groupOf[patch] = like == patch ? groups++ : c.groupOf[like];
    }
    return groups;
}

/// The patches of each group with more than one, in ascending order.
std::vector<std::vector<std::uint32_t>> severalOf(const Comparison& c, std::size_t groups) {
    std::vector<std::uint32_t> counts(groups);
    for (const std::uint32_t group : c.groupOf) {
        ++counts[group];
    }
    std::vector<std::vector<std::uint32_t>> several;
    std::vector<std::uint32_t> placeOf(groups, noRow);
    for (std::uint32_t patch = 0; patch < c.patchCount(); ++patch) {
        const std::uint32_t group = c.groupOf[patch];
        if (counts[group] < 2) {
            continue;
        }
        if (placeOf[group] == noRow) {
            placeOf[group] = static_cast<std::uint32_t>(several.size());
            several.emplace_back();
        }
        several[placeOf[group]].push_back(patch);
    }
    return several;
}

/// The patches from different rows of a file, the first of each row. For a profile one patch is
/// enough, because it returns equal values for all.
std::vector<std::uint32_t> differentRows(const Input& side,
                                         const std::vector<std::uint32_t>& patches) {
    if (!side.file.set) {
        return {patches.front()};
    }
    std::vector<std::uint32_t> different = patches;
    const auto row = [&](std::uint32_t patch) { return side.rows[patch]; };
    const bool areDifferent =
        std::adjacent_find(different.begin(), different.end(),
                           [&](auto a, auto b) { return row(a) >= row(b); }) == different.end();
    if (areDifferent) {
        return different;
    }
    std::stable_sort(different.begin(), different.end(),
                     [&](auto a, auto b) { return row(a) < row(b); });
    different.erase(std::unique(different.begin(), different.end(),
                                [&](auto a, auto b) { return row(a) == row(b); }),
                    different.end());
    return different;
}

Lab meanOf(const std::vector<Lab>& lab, const std::vector<std::uint32_t>& patches) {
    if (patches.size() == 1) {
        return lab[patches.front()];
    }
    Xyz sum;
    for (const std::uint32_t patch : patches) {
        const Xyz xyz = colour::xyzFromLab(lab[patch]);
        sum = {sum.X + xyz.X, sum.Y + xyz.Y, sum.Z + xyz.Z};
    }
    const auto count = static_cast<double>(patches.size());
    return colour::labFromXyz({sum.X / count, sum.Y / count, sum.Z / count});
}

void addSpread(const Comparison& c, const std::vector<std::uint32_t>& readings,
               RepeatSpread& spread) {
    if (++spread.patches == 1) {
        spread.worst = readings.front();
    }
    spread.readings += readings.size();
    RepeatedPatch& repeated = spread.each.emplace_back();
    repeated = {readings.front(), readings.size(), 0, 0};
    const auto isFirst = [&](std::uint32_t patch) {
        return c.measuredLab[patch] == c.measuredLab[readings.front()];
    };
    if (std::all_of(readings.begin(), readings.end(), isFirst)) {
        return;
    }
    const Lab mean = meanOf(c.measuredLab, readings);
    for (const std::uint32_t patch : readings) {
        const double distance = colour::difference(c.formula, mean, c.measuredLab[patch]);
        spread.mean += distance;
        repeated.mean += distance / static_cast<double>(readings.size());
        repeated.largest = std::max(repeated.largest, distance);
        if (distance > spread.largest) {
            spread.largest = distance;
            spread.worst = patch;
        }
    }
}

template<class Value>
void keepFirst(std::vector<Value>& values, const std::vector<std::uint32_t>& firstOf) {
    if (values.empty()) {
        return;
    }
    for (std::size_t group = 0; group < firstOf.size(); ++group) {
        values[group] = values[firstOf[group]]; // a first patch is never before its group's number
    }
    values.resize(firstOf.size());
}

} // namespace

void findRepeats(Comparison& c) {
    const std::size_t groups = numberGroups(c);
    if (!c.measurement.file.set || groups == c.patchCount()) {
        return;
    }
    for (const auto& patches : severalOf(c, groups)) {
        if (const auto readings = differentRows(c.measurement, patches); readings.size() > 1) {
            addSpread(c, readings, c.spread);
        }
    }
    if (c.spread.readings > 0) {
        c.spread.mean /= static_cast<double>(c.spread.readings);
    }
}

void averageRepeats(Comparison& c) {
    const std::size_t groups =
        c.groupOf.empty() ? 0 : *std::max_element(c.groupOf.begin(), c.groupOf.end()) + 1;
    if (groups == c.patchCount()) {
        return;
    }
    for (const auto& patches : severalOf(c, groups)) {
        const std::uint32_t first = patches.front();
        const auto readings = differentRows(c.measurement, patches);
        const Lab target = meanOf(c.targetLab, differentRows(c.target, patches));
        const Lab measured = meanOf(c.measuredLab, readings);
        c.targetLab[first] = target;
        c.measuredLab[first] = measured;
        for (const std::uint32_t patch : readings) {
            if (c.measurement.file.set && c.measurement.rows[patch] != c.measurement.rows[first]) {
                c.furtherReadings.push_back({c.measurement.rows[patch], c.groupOf[first]});
            }
        }
    }

    std::vector<std::uint32_t> firstOf(groups, noRow);
    for (std::uint32_t patch = 0; patch < c.patchCount(); ++patch) {
        firstOf[c.groupOf[patch]] = std::min(firstOf[c.groupOf[patch]], patch);
    }
    c.spread.worst = c.groupOf[c.spread.worst];
    for (RepeatedPatch& repeated : c.spread.each) {
        repeated.patch = c.groupOf[repeated.patch];
    }
    for (Input* input : {&c.target, &c.measurement, &c.patchSet}) {
        keepFirst(input->rows, firstOf);
    }
    keepFirst(c.targetLab, firstOf);
    keepFirst(c.measuredLab, firstOf);
    keepFirst(c.selectedRow, firstOf);
    for (std::uint32_t group = 0; group < groups; ++group) {
        c.groupOf[group] = group;
    }
    c.groupOf.resize(groups);
}

} // namespace analysis
