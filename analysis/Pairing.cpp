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

/// Rows of one set under hashes of their keys. Equal keys queue up in the order of their rows.
///
/// Open addressing over a power of two at least twice the rows, so a probe stays short; whether
/// keys are equal is the caller's to say, since a hash alone does not prove it.
class RowIndex {
  public:
    explicit RowIndex(std::size_t rows)
        : m_mask(std::bit_ceil(std::max<std::size_t>(rows, 8) * 2) - 1), m_slots(m_mask + 1),
          m_next(rows, noRow) {}

    /// REQUIRES: rows are added in rising order. `same(a, b)`: rows a and b have equal keys.
    template<class Same>
    void add(std::uint64_t hash, std::uint32_t row, Same same) {
        Slot& slot = find(hash, [&](std::uint32_t other) { return same(row, other); });
        if (slot.key == noRow) {
            slot = {hash, row, row, row};
        } else {
            m_next[slot.last] = row;
            slot.last = row;
        }
    }

    /// Takes the first row that is still there for a key, or noRow. `same(b)`: row b has that key.
    template<class Same>
    std::uint32_t take(std::uint64_t hash, Same same) {
        Slot& slot = find(hash, same);
        const std::uint32_t row = slot.first;
        if (row != noRow)
            slot.first = m_next[row];
        return row;
    }

  private:
    struct Slot {
        std::uint64_t hash = 0;
        std::uint32_t key = noRow; ///< A row with the key; stays when the queue runs dry.
        std::uint32_t first = noRow;
        std::uint32_t last = noRow;
    };

    template<class Same>
    Slot& find(std::uint64_t hash, Same same) {
        for (std::size_t at = hash & m_mask;; at = (at + 1) & m_mask) {
            Slot& slot = m_slots[at];
            if (slot.key == noRow || (slot.hash == hash && same(slot.key)))
                return slot;
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

/// Pairs the rows that are still alone on both sides.
template<class LeftHash, class RightHash, class SameRight, class SameBoth>
std::size_t pairRest(Pairing& pairing, std::vector<bool>& taken, LeftHash leftHash,
                     RightHash rightHash, SameRight sameRight, SameBoth sameBoth) {
    RowIndex index(taken.size());
    for (std::uint32_t row = 0; row < taken.size(); ++row)
        if (!taken[row])
            index.add(rightHash(row), row, sameRight);
    std::size_t found = 0;
    for (std::uint32_t row = 0; row < pairing.partner.size(); ++row) {
        if (pairing.partner[row] != noRow)
            continue;
        const std::uint32_t other =
            index.take(leftHash(row), [&](std::uint32_t right) { return sameBoth(row, right); });
        if (other == noRow)
            continue;
        pairing.partner[row] = other;
        taken[other] = true;
        ++found;
    }
    pairing.paired += found;
    return found;
}

/// Device values of a set in whole quanta, `width` channels a row. Channels that the set lacks are
/// 0: a process chart goes with one that has unused spot channels.
std::vector<std::int32_t> quantised(const DataSet& set, std::size_t width, double perPercent) {
    const std::size_t own = set.channels.size();
    std::vector<std::int32_t> keys(set.patchCount * width);
    for (std::size_t row = 0; row < set.patchCount; ++row)
        for (std::size_t channel = 0; channel < own; ++channel) {
            const double value = set.device[row * own + channel] * perPercent;
            // In this order of arguments not-a-number is bounded too.
            const double bounded = std::min(std::max(-2e9, value), 2e9);
            keys[row * width + channel] = static_cast<std::int32_t>(std::floor(bounded + 0.5));
        }
    return keys;
}

std::uint64_t hashOf(const std::int32_t* key, std::size_t width) {
    std::uint64_t h = width;
    for (std::size_t i = 0; i < width; ++i)
        h = mixed(h + static_cast<std::uint32_t>(key[i]));
    return h;
}

std::size_t pairByDevice(Pairing& pairing, std::vector<bool>& taken, const DataSet& left,
                         const DataSet& right, double perPercent) {
    const std::size_t width = std::max(left.channels.size(), right.channels.size());
    const std::vector<std::int32_t> leftKeys = quantised(left, width, perPercent);
    const std::vector<std::int32_t> rightKeys = quantised(right, width, perPercent);
    const auto leftKey = [&](std::uint32_t row) { return &leftKeys[row * width]; };
    const auto rightKey = [&](std::uint32_t row) { return &rightKeys[row * width]; };
    return pairRest(
        pairing, taken, [&](std::uint32_t row) { return hashOf(leftKey(row), width); },
        [&](std::uint32_t row) { return hashOf(rightKey(row), width); },
        [&](std::uint32_t a, std::uint32_t b) {
            return std::equal(rightKey(a), rightKey(a) + width, rightKey(b));
        },
        [&](std::uint32_t a, std::uint32_t b) {
            return std::equal(leftKey(a), leftKey(a) + width, rightKey(b));
        });
}

std::size_t pairByLabels(Pairing& pairing, std::vector<bool>& taken,
                         const std::vector<std::string>& left,
                         const std::vector<std::string>& right) {
    const auto hash = [](const std::string& label) {
        return mixed(std::hash<std::string_view>{}(label));
    };
    return pairRest(
        pairing, taken, [&](std::uint32_t row) { return hash(left[row]); },
        [&](std::uint32_t row) { return hash(right[row]); },
        [&](std::uint32_t a, std::uint32_t b) { return right[a] == right[b]; },
        [&](std::uint32_t a, std::uint32_t b) { return left[a] == right[b]; });
}

bool comparableDevices(const DataSet& left, const DataSet& right) {
    if (!left.hasDevice() || left.deviceSpace != right.deviceSpace)
        return false;
    return left.deviceSpace != DeviceSpace::Other || left.channels == right.channels;
}

void pairByOrder(Pairing& pairing, std::size_t rightCount) {
    pairing.paired = std::min(pairing.partner.size(), rightCount);
    std::iota(pairing.partner.begin(),
              pairing.partner.begin() + static_cast<std::ptrdiff_t>(pairing.paired), 0u);
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
    Pairing pairing;
    pairing.partner.assign(left.patchCount, noRow);

    if (comparableDevices(left, right)) {
        pairing.by = PairedBy::DeviceValues;
        // Most pairs of files are one chart in one order, where nothing needs looking up.
        if (left.channels.size() == right.channels.size() && left.device == right.device) {
            pairByOrder(pairing, right.patchCount);
            return pairing;
        }
        std::vector<bool> taken(right.patchCount);
        const auto complete = [&] {
            return pairing.paired == std::min(left.patchCount, right.patchCount);
        };
        pairByDevice(pairing, taken, left, right, 10000);
        if (!complete())
            pairByDevice(pairing, taken, left, right, 100);
        if (!complete())
            pairing.rounded = pairByDevice(pairing, taken, left, right, 1);
        return pairing;
    }

    const std::vector<std::string>* const leftLabels[] = {&left.ids, &left.names, &left.ids,
                                                          &left.names};
    const std::vector<std::string>* const rightLabels[] = {&right.ids, &right.names, &right.names,
                                                           &right.ids};
    bool bothLabelled = false;
    for (std::size_t i = 0; i < std::size(leftLabels); ++i) {
        if (leftLabels[i]->empty() || rightLabels[i]->empty())
            continue;
        bothLabelled = true;
        std::vector<bool> taken(right.patchCount);
        if (pairByLabels(pairing, taken, *leftLabels[i], *rightLabels[i]) > 0) {
            pairing.by = PairedBy::Labels;
            return pairing;
        }
    }

    if (!bothLabelled || left.patchCount == right.patchCount)
        pairByOrder(pairing, right.patchCount);
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
    for (const std::uint32_t row : pairing.partner)
        if (row != noRow)
            taken[row] = true;
    std::vector<std::uint32_t> rows;
    for (std::uint32_t row = 0; row < count; ++row)
        if (!taken[row])
            rows.push_back(row);
    return rows;
}

} // namespace analysis
