// SPDX-License-Identifier: Apache-2.0
// What one key holds, as JSON. A key is a run of elements, or a list of runs where types differ or
// there are holes:
//
//   {"string": "Proof"}                          one text
//   {"double": [2.5, 5.0, "NaN"]}                three doubles from position 0
//   [{"int": 1}, {"at": 8, "string": "far"}]     an int at 0, a hole from 1 to 7, a text at 8
//
// A run has one type and its values in order; "at" says where it starts, if not right behind the
// run before.
//
//   int, uint       numbers
//   int64, uint64   numbers, or their digits in a string. Written as a string beyond 2^53, since
//                   many JSON readers would round them
//   double          a number, or "Infinity", "-Infinity", "NaN", or "NaN:" and the 16 hexadecimal
//                   digits of any other not-a-number
//   string          a text, or {"base64": "..."} for bytes that are no UTF-8
//   binary          base64
//   pointer         a number as for uint64, which means something to whoever stored it alone
#pragma once

#include <memory>
#include <string>

#include "companions/tintgate-store/Bytes.h"
#include "store/tickets/TicketElements.h"

namespace admin {

/// The word for a type; empty for what is never kept.
const char* typeWord(PARAM_TYPE type);

/// PARAM_DELETE where there is no such word.
PARAM_TYPE typeOfWord(const std::string& word);

Json valueJson(const store::Value& value);

/// Throws Failure (BadInput), with a sentence, where the JSON is no value of the type.
store::Value valueFromJson(PARAM_TYPE type, const Json& json);

/// From what somebody typed: digits, a number, the words for doubles that are none, text as it is.
/// Binaries are base64.
store::Value valueFromText(PARAM_TYPE type, const std::string& text);

/// As valueFromText reads it; texts and binaries as they are.
std::string valueText(const store::Value& value);

Json elementsJson(const store::Elements& elements);

/// Throws Failure (BadInput), with a sentence.
std::shared_ptr<store::Elements> elementsFromJson(const Json& json);

} // namespace admin
