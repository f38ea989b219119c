// SPDX-License-Identifier: Apache-2.0
// What must be sent to turn one ticket's table into another's.
#pragma once

#include <vector>

#include "ticket/ParameterRecords.h"

namespace ticket {

/// The records that make of a ticket that holds `present` one that holds `wanted`, by ascending
/// key, and within a key changed elements by position, then new ones, then deletions from the last
/// one down.
///
/// Both tables come from walks of tickets: keys ascend by strcmp, equal keys of one table have one
/// address, positions ascend within a key and begin with POSITION_WHOLE. The records point to the
/// tables' own keys and values. A binary value always counts as changed, and so does a NaN.
std::vector<SETMULTIPAR> difference(const SETMULTIPAR* present, const SETMULTIPAR* wanted);

} // namespace ticket
