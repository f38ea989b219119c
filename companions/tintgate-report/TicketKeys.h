// SPDX-License-Identifier: Apache-2.0
// Values of a job's keys.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "jobkeys/StripKeys.h"
#include "store/tickets/TicketElements.h"

namespace report {

using jobkeys::Strip;

using SharedElements = std::shared_ptr<const store::Elements>;

/// The first element, as a reader of the key gets it. Nothing, or an empty text, if there is none
/// of this type.
std::optional<int> integerOf(const SharedElements& elements);
std::string textOf(const SharedElements& elements);

/// All elements. Holes and elements of other types are NaN. Empty if the array is longer than a
/// million patches need.
std::vector<double> doublesOf(const SharedElements& elements);
inline constexpr std::size_t mostElements = std::size_t{1} << 20;

/// The elements up to the first hole or element of another type.
std::vector<int> integersOf(const SharedElements& elements);

} // namespace report
