// SPDX-License-Identifier: Apache-2.0
// Computes what must be sent to turn one ticket's table into another's.
#pragma once

#include <vector>

#include "ticket/ParameterRecords.h"

namespace ticket {

/// Returns the records that turn a ticket with `present` into one with `wanted`, by ascending key.
/// Within a key: changed elements by position, then new ones, then deletions from the last one
/// down.
///
/// Both tables come from walks of tickets: keys ascend by strcmp, equal keys of one table have one
/// address, positions ascend within a key and begin with POSITION_WHOLE. The result points to the
/// keys and values of the tables. A binary value or a NaN always counts as changed.
std::vector<SETMULTIPAR> difference(const SETMULTIPAR* present, const SETMULTIPAR* wanted);

} // namespace ticket
