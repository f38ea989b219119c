// SPDX-License-Identifier: Apache-2.0
// Which patch of one data set is which of another.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "colour/DataSet.h"

namespace analysis {

/// What told the patches apart.
enum class PairedBy {
    Own,          ///< The patches are the set's own.
    Profile,      ///< A profile has every patch.
    DeviceValues, ///< From here on from the surest to the weakest.
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

/// For each row of the left set its row in the right one.
struct Pairing {
    PairedBy by = PairedBy::Order;
    std::vector<std::uint32_t> partner; ///< noRow where there is none. One entry a left row.
    std::vector<RowPair> again;         ///< Repeated rows of the right set, by rising right row.
    std::size_t paired = 0;             ///< Left rows that have a partner of their own.
    std::size_t rounded = 0;      ///< Of these, by device values that agree in whole percents only.
    std::size_t contradicted = 0; ///< Of these, by ids where names point elsewhere, or in reverse.
    bool spacesDiffer = false;    ///< Both sets have device values, of different kinds.
};

/// Pairs two sets in linear time; of patches that are alike, the k-th goes with the k-th.
///
/// If both sets have device values of one kind, these alone decide: patches with other device
/// values are other patches, whatever their ids. They are compared at 0.0001 percent, what is left
/// at 0.01 and then at 1, since tickets keep two decimals on the first strip and whole percents on
/// the second. Without such values labels decide: of the four combinations of ids and names the one
/// that pairs most rows, and of two that pair equally many the names, if nine in ten of either set
/// differ, else the earlier of id to id, name to name, id to name, name to id. If the sets have no
/// label in common, their order decides, provided that they are of one size or that one of them has
/// neither ids nor names. `paired` is 0 if nothing goes together.
///
/// A row left over that has the key of paired rows of its own set is a repeat. It pairs with the
/// partners of these rows in turn. Repeats of the left set get a `partner`, without counting as
/// `paired`; those of the right set are in `again`.
///
/// REQUIRES: fewer than 2^32 - 1 rows a set.
Pairing pairSets(const colour::DataSet& left, const colour::DataSet& right);

/// Every row with itself.
Pairing pairWithItself(std::size_t rows);

/// Rows of the right set, of `count`, that are nobody's partner, by rising row.
std::vector<std::uint32_t> rowsLeft(const Pairing& pairing, std::size_t count);

} // namespace analysis
