// SPDX-License-Identifier: Apache-2.0
// Output of a command: a table for people, or JSON for scripts.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

namespace admin {

/// Members are in display order.
using Row = nlohmann::ordered_json;

struct Column {
    const char* name;    ///< Name of the JSON member.
    const char* heading; ///< Heading in the table.
};

/// Prints objects on standard output: in JSON, one list with all their members; as a table, the
/// given columns, with null as "-", and true and false as yes and no.
void showRows(const std::vector<Column>& columns, const std::vector<Row>& rows, bool asJson);

/// Prints one object as JSON, or one line per member.
void showObject(const Row& object, bool asJson);

/// "1 file", "2 files".
std::string counted(std::int64_t count, const std::string& one);

} // namespace admin
