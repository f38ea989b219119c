// SPDX-License-Identifier: Apache-2.0
// The elements of one key as JSON. A key is a run of elements, or a list of runs if types differ or
// there are holes:
//
//   {"string": "Proof"}                          one text
//   {"double": [2.5, 5.0, "NaN"]}                three doubles from position 0
//   [{"int": 1}, {"at": 8, "string": "far"}]     an int at 0, a hole from 1 to 7, a text at 8
//
// A run has one type and its values in order. "at" is its start, if it does not directly follow the
// previous run.
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

/// The word for a type. Empty for types that are never stored.
const char* typeWord(PARAM_TYPE type);

/// PARAM_DELETE for an unknown word.
PARAM_TYPE typeOfWord(const std::string& word);

Json valueJson(const store::Value& value);

/// Throws Failure (BadInput), with a sentence, if the JSON is not a value of the type.
store::Value valueFromJson(PARAM_TYPE type, const Json& json);

/// Parses typed text: digits, a number, the words for special doubles, or text unchanged. Binaries
/// are base64.
store::Value valueFromText(PARAM_TYPE type, const std::string& text);

/// The form that valueFromText reads; texts and binaries are unchanged.
std::string valueText(const store::Value& value);

Json elementsJson(const store::Elements& elements);

/// Throws Failure (BadInput), with a sentence.
std::shared_ptr<store::Elements> elementsFromJson(const Json& json);

} // namespace admin
