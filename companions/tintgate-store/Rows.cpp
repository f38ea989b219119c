// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Rows.h"

#include <algorithm>
#include <iostream>

#include "base/Utf8.h"
#include "companions/tintgate-store/Bytes.h"

namespace admin {

namespace {

std::string cellText(const Row& value) {
    if (value.is_null()) {
        return "-";
    }
    if (value.is_boolean()) {
        return value.get<bool>() ? "yes" : "no";
    }
    if (value.is_object() && value.contains("base64")) {
        return printable(*fromBase64(value["base64"].get<std::string>()));
    }
    return value.is_string() ? printable(value.get_ref<const std::string&>()) : value.dump();
}

using Cells = std::vector<std::string>;

void printTable(const std::vector<Cells>& lines) {
    std::vector<std::size_t> widths(lines[0].size());
    for (const auto& cells : lines) {
        for (std::size_t i = 0; i < cells.size(); ++i) {
            widths[i] = std::max(widths[i], base::charactersIn(cells[i]));
        }
    }
    for (const auto& cells : lines) {
        std::string line;
        for (std::size_t i = 0; i < cells.size(); ++i) {
            line += cells[i];
            if (i + 1 < cells.size()) {
                line.append(widths[i] - base::charactersIn(cells[i]) + 2, ' ');
            }
        }
        std::cout << line << '\n';
    }
}

} // namespace

void showRows(const std::vector<Column>& columns, const std::vector<Row>& rows, bool asJson) {
    if (asJson) {
        std::cout << Row(rows).dump(2, ' ', true) << '\n';
        return;
    }
    std::vector<Cells> lines(1);
    for (const auto& column : columns) {
        lines[0].push_back(column.heading);
    }
    for (const auto& row : rows) {
        auto& cells = lines.emplace_back();
        for (const auto& column : columns) {
            cells.push_back(cellText(row.value(column.name, Row())));
        }
    }
    printTable(lines);
}

void showObject(const Row& object, bool asJson) {
    if (asJson) {
        std::cout << object.dump(2, ' ', true) << '\n';
        return;
    }
    std::vector<Cells> lines;
    for (const auto& [name, member] : object.items()) {
        lines.push_back({name, cellText(member)});
    }
    printTable(lines);
}

std::string counted(std::int64_t count, const std::string& one) {
    return std::to_string(count) + ' ' + one + (count == 1 ? "" : "s");
}

} // namespace admin
