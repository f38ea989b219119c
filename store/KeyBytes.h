// SPDX-License-Identifier: Apache-2.0
// The stored form of the elements of one key:
//
//   01                                version
//   02  03 00 00 00  <3 times 4>      three ints from position 0
//   00  02 00 00 00                   a hole of two positions
//   04  01 00 00 00  02 00 00 00 'hi' one text of two bytes, at position 5
//
// Runs of elements of one type follow each other: the type (a PARAM_TYPE; 0 is a hole), the number
// of positions, and each element's value. All numbers are little-endian. Their length precedes
// texts and binaries; a pointer is stored as a 64-bit number. The last run is not a hole.
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "store/tickets/TicketContent.h"
#include "store/tickets/TicketElements.h"

namespace store {

std::string keyBytes(const Elements& elements);

/// Whether two tickets hold the same, to the bit.
bool haveSameKeys(const TicketContent& one, const TicketContent& other);

/// Null for bytes that keyBytes would not have written.
std::shared_ptr<Elements> elementsFromBytes(std::string_view bytes);

} // namespace store
