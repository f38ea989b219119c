// SPDX-License-Identifier: Apache-2.0
// The bytes in which a store keeps the elements of one key:
//
//   01                                version
//   02  03 00 00 00  <3 times 4>      three ints from position 0
//   00  02 00 00 00                   a hole of two positions
//   04  01 00 00 00  02 00 00 00 'hi' one text of two bytes, at position 5
//
// Runs of elements of one type follow each other: the type (a PARAM_TYPE; 0 is a hole), the number
// of positions, and each element's value. All numbers are little-endian. Texts and binaries have
// their length in front; a pointer is kept as a number of 64 bits. The last run is no hole.
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
