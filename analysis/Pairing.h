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

/// For each row of the left set its row in the right one.
struct Pairing {
    PairedBy by = PairedBy::Order;
    std::vector<std::uint32_t> partner; ///< noRow where there is none. One entry a left row.
    std::size_t paired = 0;
    std::size_t rounded = 0; ///< Of these, by device values that agree in whole percents only.
};

/// Pairs two sets in linear time; of patches that are alike, the k-th goes with the k-th.
///
/// Where both sets have device values of one kind, these alone decide: patches with other device
/// values are other patches, whatever their ids. They are compared at 0.0001 percent, what is left
/// at 0.01 and then at 1, since tickets keep two decimals on the first strip and whole percents on
/// the second. Without such values ids or names decide, whichever both sets have in common; and
/// where they have none in common, the order, if the sets are of one size or one of them has
/// neither ids nor names. `paired` is 0 if nothing goes together.
///
/// REQUIRES: fewer than 2^32 - 1 rows a set.
Pairing pairSets(const colour::DataSet& left, const colour::DataSet& right);

/// Every row with itself.
Pairing pairWithItself(std::size_t rows);

/// Rows of the right set, of `count`, that are nobody's partner, by rising row.
std::vector<std::uint32_t> rowsLeft(const Pairing& pairing, std::size_t count);

} // namespace analysis
