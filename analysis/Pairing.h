// SPDX-License-Identifier: Apache-2.0
// Finds the patches of one data set in another.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "colour/DataSet.h"

namespace analysis {

/// How patches were identified.
enum class PairedBy {
    Own,          ///< The patches are the set's own.
    Profile,      ///< A profile contains every patch.
    DeviceValues, ///< From here on, the most certain method first.
    Labels,       ///< SAMPLE_ID or SAMPLE_NAME.
    Order,
};

/// "own", "profile", "deviceValues", "labels", "order".
const char* pairedByName(PairedBy by);

inline constexpr std::uint32_t noRow = UINT32_MAX;

struct RowPair {
    std::uint32_t left;
    std::uint32_t right;
};

/// For each row of the left set, its row in the right one.
struct Pairing {
    PairedBy by = PairedBy::Order;
    std::vector<std::uint32_t> partner; ///< noRow if none. One entry per left row.
    std::vector<RowPair> again;         ///< Repeated rows of the right set, by ascending right row.
    std::size_t paired = 0;             ///< Left rows that have a partner of their own.
    std::size_t rounded = 0;      ///< Of these, by device values that agree only in whole percents.
    std::size_t contradicted = 0; ///< Of these, by ids although names disagree, or in reverse.
    bool spacesDiffer = false;    ///< Both sets have device values, but of different kinds.
};

/// Pairs two sets in linear time. Among equal patches, the k-th pairs with the k-th.
///
/// If both sets have device values of the same kind, only these decide: patches with other device
/// values are other patches, whatever their ids. Values are compared at 0.0001 percent, the
/// remaining rows at 0.01 and then at 1, because tickets keep two decimals for the first strip and
/// whole percents for the second. Without these values, labels decide. Of the four combinations of
/// ids and names, the one that pairs most rows is used. If two pair equally many, names are used if
/// nine in ten differ in each set, otherwise the earlier of id to id, name to name, id to name,
/// name to id. If the sets have no label in common, their order decides, provided that they have
/// the same size or that one of them has neither ids nor names. `paired` is 0 if nothing pairs.
///
/// A remaining row with the key of paired rows of its own set is a repeat. It pairs with the
/// partners of these rows in turn. Repeats of the left set get a `partner` but do not count as
/// `paired`; repeats of the right set are in `again`.
///
/// REQUIRES: fewer than 2^32 - 1 rows per set.
Pairing pairSets(const colour::DataSet& left, const colour::DataSet& right);

/// Pairs every row with itself.
Pairing pairWithItself(std::size_t rows);

/// Rows of the right set (`count` in total) that are nobody's partner, in ascending order.
std::vector<std::uint32_t> rowsLeft(const Pairing& pairing, std::size_t count);

} // namespace analysis
