// SPDX-License-Identifier: Apache-2.0
#include "analysis/Pairing.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <numeric>
#include <string>
#include <string_view>

namespace analysis {
namespace {

using colour::DataSet;
using colour::DeviceSpace;

/// Rows of one set, found by hashes of their keys. Rows with equal keys are queued in row order.
///
/// Open addressing with a power of two of slots, at least twice the rows, so that probes stay
/// short. The caller must say whether keys are equal, because equal hashes don't prove it.
class RowIndex {
  public:
    explicit RowIndex(std::size_t rows)
        : m_mask(std::bit_ceil(std::max<std::size_t>(rows, 8) * 2) - 1), m_slots(m_mask + 1),
          m_next(rows, noRow) {}

    /// REQUIRES: rows are added in ascending order. `same(b)`: the added row and row b have equal
    /// keys.
    template<class Same>
    void add(std::uint64_t hash, std::uint32_t row, Same same) {
        Slot& slot = find(hash, same);
        if (slot.key == noRow) {
            slot = {hash, row, row, row};
        } else {
            m_next[slot.last] = row;
            slot.last = row;
        }
    }

    /// Takes the first remaining row of a key, or noRow. `same(b)`: row b has that key.
    template<class Same>
    std::uint32_t take(std::uint64_t hash, Same same) {
        Slot& slot = find(hash, same);
        const std::uint32_t row = slot.first;
        if (row != noRow) {
            slot.first = m_next[row];
        }
        return row;
    }

    /// Like take, but starts again when all rows of a key were taken. noRow for an unknown key.
    template<class Same>
    std::uint32_t takeInTurn(std::uint64_t hash, Same same) {
        Slot& slot = find(hash, same);
        const std::uint32_t row = slot.first == noRow ? slot.key : slot.first;
        if (row != noRow) {
            slot.first = m_next[row];
        }
        return row;
    }

  private:
    struct Slot {
        std::uint64_t hash = 0;
        std::uint32_t key = noRow; ///< A row with the key. Stays when the queue is empty.
        std::uint32_t first = noRow;
        std::uint32_t last = noRow;
    };

    template<class Same>
    Slot& find(std::uint64_t hash, Same same) {
        for (std::size_t at = hash & m_mask;; at = (at + 1) & m_mask) {
            Slot& slot = m_slots[at];
            if (slot.key == noRow || (slot.hash == hash && same(slot.key))) {
                return slot;
            }
        }
    }

    std::size_t m_mask;
    std::vector<Slot> m_slots;
    std::vector<std::uint32_t> m_next;
};

std::uint64_t mixed(std::uint64_t h) {
    h ^= h >> 32;
    h *= 0x9E3779B97F4A7C15u;
    h ^= h >> 29;
    h *= 0xBF58476D1CE4E5B9u;
    return h ^ h >> 32;
}

/// Device values of a set in integer quanta, `width` channels per row. Channels that the set lacks
/// are 0: a process chart pairs with one that has unused spot channels.
class DeviceKeys {
  public:
    DeviceKeys(const DataSet& set, std::size_t width, double perPercent)
        : m_width(width), m_keys(set.patchCount * width) {
        const std::size_t own = set.channels.size();
        for (std::size_t row = 0; row < set.patchCount; ++row) {
            for (std::size_t channel = 0; channel < own; ++channel) {
                const double value = set.device[row * own + channel] * perPercent;
                // This order of the arguments also bounds NaN.
                const double bounded = std::min(std::max(-2e9, value), 2e9);
                m_keys[row * width + channel] =
                    static_cast<std::int32_t>(std::floor(bounded + 0.5));
            }
        }
    }

    std::uint64_t hash(std::uint32_t row) const {
        std::uint64_t h = m_width;
        for (const std::int32_t *at = key(row), *end = at + m_width; at != end; ++at) {
            h = mixed(h + static_cast<std::uint32_t>(*at));
        }
        return h;
    }

    bool same(std::uint32_t row, const DeviceKeys& other, std::uint32_t otherRow) const {
        return std::equal(key(row), key(row) + m_width, other.key(otherRow));
    }

  private:
    const std::int32_t* key(std::uint32_t row) const { return &m_keys[row * m_width]; }

    std::size_t m_width;
    std::vector<std::int32_t> m_keys;
};

class LabelKeys {
  public:
    explicit LabelKeys(const std::vector<std::string>& labels) : m_labels(labels) {}

    std::uint64_t hash(std::uint32_t row) const {
        return mixed(std::hash<std::string_view>{}(m_labels[row]));
    }

    bool same(std::uint32_t row, const LabelKeys& other, std::uint32_t otherRow) const {
        return m_labels[row] == other.m_labels[otherRow];
    }

  private:
    const std::vector<std::string>& m_labels;
};

/// Pairs rows that have no partner yet on either side.
template<class Keys>
std::size_t pairRest(Pairing& pairing, std::vector<bool>& taken, const Keys& left,
                     const Keys& right) {
    RowIndex index(taken.size());
    for (std::uint32_t row = 0; row < taken.size(); ++row) {
        if (!taken[row]) {
            index.add(right.hash(row), row,
                      [&](std::uint32_t other) { return right.same(row, right, other); });
        }
    }
    std::size_t found = 0;
    for (std::uint32_t row = 0; row < pairing.partner.size(); ++row) {
        if (pairing.partner[row] != noRow) {
            continue;
        }
        const std::uint32_t other = index.take(
            left.hash(row), [&](std::uint32_t key) { return left.same(row, right, key); });
        if (other == noRow) {
            continue;
        }
        pairing.partner[row] = other;
        taken[other] = true;
        ++found;
    }
    pairing.paired += found;
    return found;
}

/// Gives each row without a partner the partner of a row with the same key, in turn if there are
/// several. Calls found(row, partner) for each.
template<class Keys, class Found>
void pairRepeats(const std::vector<std::uint32_t>& partner, const Keys& keys, Found found) {
    RowIndex index(partner.size());
    const auto sameAs = [&](std::uint32_t row) {
        return [&keys, row](std::uint32_t other) { return keys.same(row, keys, other); };
    };
    for (std::uint32_t row = 0; row < partner.size(); ++row) {
        if (partner[row] != noRow) {
            index.add(keys.hash(row), row, sameAs(row));
        }
    }
    for (std::uint32_t row = 0; row < partner.size(); ++row) {
        if (partner[row] != noRow) {
            continue;
        }
        const std::uint32_t like = index.takeInTurn(keys.hash(row), sameAs(row));
        if (like != noRow) {
            found(row, partner[like]);
        }
    }
}

/// Adds the repeats of both sets by their keys. Can be called again with other keys for the
/// remaining rows.
template<class Keys>
void addRepeats(Pairing& pairing, std::size_t rightCount, const Keys& left, const Keys& right) {
    std::vector<std::uint32_t> inverse(rightCount, noRow);
    std::size_t leftPaired = 0;
    for (std::uint32_t row = 0; row < pairing.partner.size(); ++row) {
        if (pairing.partner[row] != noRow) {
            std::uint32_t& first = inverse[pairing.partner[row]];
            first = std::min(first, row); // noRow is the largest number
            ++leftPaired;
        }
    }
    for (const RowPair& pair : pairing.again) {
        inverse[pair.right] = pair.left;
    }
    if (pairing.paired + pairing.again.size() < rightCount) {
        pairRepeats(inverse, right, [&](std::uint32_t row, std::uint32_t partner) {
            pairing.again.push_back({partner, row});
        });
    }
    if (leftPaired < pairing.partner.size()) {
        const std::vector<std::uint32_t> partners = pairing.partner;
        pairRepeats(partners, left, [&](std::uint32_t row, std::uint32_t partner) {
            pairing.partner[row] = partner;
        });
    }
}

bool comparableDevices(const DataSet& left, const DataSet& right) {
    if (!left.hasDevice() || left.deviceSpace != right.deviceSpace) {
        return false;
    }
    return left.deviceSpace != DeviceSpace::Other || left.channels == right.channels;
}

void pairByOrder(Pairing& pairing, std::size_t rightCount) {
    pairing.paired = std::min(pairing.partner.size(), rightCount);
    std::iota(pairing.partner.begin(),
              pairing.partner.begin() + static_cast<std::ptrdiff_t>(pairing.paired), 0u);
}

Pairing pairByDevice(const DataSet& left, const DataSet& right) {
    Pairing pairing;
    pairing.by = PairedBy::DeviceValues;
    pairing.partner.assign(left.patchCount, noRow);
    // Most pairs of files are the same chart in the same order and need no lookups.
    if (left.channels.size() == right.channels.size() && left.device == right.device) {
        pairByOrder(pairing, right.patchCount);
        return pairing;
    }
    const std::size_t width = std::max(left.channels.size(), right.channels.size());
    constexpr double perPercent[] = {10000, 100, 1};
    std::vector<bool> taken(right.patchCount);
    for (const double scale : perPercent) {
        const std::size_t found = pairRest(pairing, taken, DeviceKeys(left, width, scale),
                                           DeviceKeys(right, width, scale));
        if (scale == 1) {
            pairing.rounded = found;
        }
        if (pairing.paired == std::min(left.patchCount, right.patchCount)) {
            break;
        }
    }
    for (const double scale : {perPercent[0], perPercent[1]}) {
        if (pairing.paired > 0 && (pairing.paired < left.patchCount ||
                                   pairing.paired + pairing.again.size() < right.patchCount)) {
            addRepeats(pairing, right.patchCount, DeviceKeys(left, width, scale),
                       DeviceKeys(right, width, scale));
        }
    }
    return pairing;
}

/// True if labels identify patches: at most one in ten repeats another, as paper does in a wedge.
bool mostlyDiffer(const std::vector<std::string>& labels) {
    std::vector<std::string_view> sorted(labels.begin(), labels.end());
    std::sort(sorted.begin(), sorted.end());
    const auto different = std::unique(sorted.begin(), sorted.end()) - sorted.begin();
    return static_cast<std::size_t>(different) * 10 >= labels.size() * 9;
}

/// Pairs by the labels of one kind on each side.
Pairing pairByLabels(const std::vector<std::string>& left, const std::vector<std::string>& right) {
    Pairing pairing;
    pairing.by = PairedBy::Labels;
    pairing.partner.assign(left.size(), noRow);
    std::vector<bool> taken(right.size());
    pairRest(pairing, taken, LabelKeys(left), LabelKeys(right));
    return pairing;
}

/// Counts the pairs for which the labels of the other kind name another row.
std::size_t contradictionsOf(const Pairing& pairing, const std::vector<std::string>& left,
                             const std::vector<std::string>& right) {
    if (left.empty() || right.empty()) {
        return 0;
    }
    const Pairing other = pairByLabels(left, right);
    std::size_t count = 0;
    for (std::size_t row = 0; row < left.size(); ++row) {
        if (pairing.partner[row] != noRow && other.partner[row] != noRow &&
            left[row] != right[pairing.partner[row]]) {
            ++count;
        }
    }
    return count;
}

/// `paired` is 0 if the sets have no label in common.
Pairing pairByBestLabels(const DataSet& left, const DataSet& right) {
    const struct {
        const std::vector<std::string>& left;
        const std::vector<std::string>& right;
    } combinations[] = {{left.ids, right.ids},
                        {left.names, right.names},
                        {left.ids, right.names},
                        {left.names, right.ids}};
    constexpr std::size_t ids = 0, names = 1;
    Pairing best;
    std::size_t bestAt = ids;
    for (std::size_t i = 0; i < std::size(combinations); ++i) {
        const auto& [leftLabels, rightLabels] = combinations[i];
        if (leftLabels.empty() || rightLabels.empty()) {
            continue;
        }
        Pairing pairing = pairByLabels(leftLabels, rightLabels);
        // Ids are often just row numbers. Names that differ were given on purpose.
        const bool better =
            pairing.paired > best.paired || (i == names && pairing.paired == best.paired &&
                                             mostlyDiffer(leftLabels) && mostlyDiffer(rightLabels));
        if (better) {
            best = std::move(pairing);
            bestAt = i;
        }
    }
    if (best.paired == 0) {
        return best;
    }
    if (bestAt == ids) {
        best.contradicted = contradictionsOf(best, left.names, right.names);
    } else if (bestAt == names) {
        best.contradicted = contradictionsOf(best, left.ids, right.ids);
    }
    const auto& [leftLabels, rightLabels] = combinations[bestAt];
    if (best.paired < std::max(left.patchCount, right.patchCount)) {
        addRepeats(best, right.patchCount, LabelKeys(leftLabels), LabelKeys(rightLabels));
    }
    return best;
}

} // namespace

const char* pairedByName(PairedBy by) {
    switch (by) {
    case PairedBy::Own:
        return "own";
    case PairedBy::Profile:
        return "profile";
    case PairedBy::DeviceValues:
        return "deviceValues";
    case PairedBy::Labels:
        return "labels";
    case PairedBy::Order:
        break;
    }
    return "order";
}

Pairing pairSets(const DataSet& left, const DataSet& right) {
    if (comparableDevices(left, right)) {
        return pairByDevice(left, right);
    }
    Pairing pairing = pairByBestLabels(left, right);
    if (pairing.paired == 0) {
        const auto isLabelled = [](const DataSet& set) {
            return !set.ids.empty() || !set.names.empty();
        };
        pairing = {};
        pairing.partner.assign(left.patchCount, noRow);
        if (left.patchCount == right.patchCount || !isLabelled(left) || !isLabelled(right)) {
            pairByOrder(pairing, right.patchCount);
        }
    }
    pairing.spacesDiffer = left.hasDevice() && right.hasDevice();
    return pairing;
}

Pairing pairWithItself(std::size_t rows) {
    Pairing pairing;
    pairing.by = PairedBy::Own;
    pairing.partner.resize(rows);
    pairByOrder(pairing, rows);
    return pairing;
}

std::vector<std::uint32_t> rowsLeft(const Pairing& pairing, std::size_t count) {
    std::vector<bool> taken(count);
    for (const std::uint32_t row : pairing.partner) {
        if (row != noRow) {
            taken[row] = true;
        }
    }
    for (const RowPair& pair : pairing.again) {
        taken[pair.right] = true;
    }
    std::vector<std::uint32_t> rows;
    for (std::uint32_t row = 0; row < count; ++row) {
        if (!taken[row]) {
            rows.push_back(row);
        }
    }
    return rows;
}

} // namespace analysis
