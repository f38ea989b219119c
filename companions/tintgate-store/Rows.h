// SPDX-License-Identifier: Apache-2.0
// What a command shows: a table for people, or JSON for scripts.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

namespace admin {

/// In the order in which it is shown.
using Row = nlohmann::ordered_json;

struct Column {
    const char* name;    ///< Of the member in JSON.
    const char* heading; ///< In the table.
};

/// Prints objects on standard output. In JSON as one list with all their members; as a table the
/// given columns, where null is shown as "-", and true and false as yes and no.
void showRows(const std::vector<Column>& columns, const std::vector<Row>& rows, bool asJson);

/// One object: as JSON, or with a line for each member.
void showObject(const Row& object, bool asJson);

/// As in "1 file" and "2 files".
std::string counted(std::int64_t count, const std::string& one);

} // namespace admin
