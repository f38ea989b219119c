// SPDX-License-Identifier: Apache-2.0
// The tables under tests/data: comma-separated, comment lines with "#".
#pragma once

#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace support {

/// The rows of a table, its path relative to tests/data. Throws if there are none.
inline std::vector<std::vector<std::string>> readCsv(const std::string& path) {
    std::ifstream file(std::string(TINTGATE_SOURCE_DIR "/tests/data/") + path);
    std::vector<std::vector<std::string>> rows;
    for (std::string line; std::getline(file, line);) {
        if (line.empty() || line[0] == '#') {
            continue;
        }
        std::istringstream cells(line);
        auto& row = rows.emplace_back();
        for (std::string cell; std::getline(cells, cell, ',');) {
            row.push_back(cell);
        }
    }
    if (rows.empty()) {
        throw std::runtime_error("no rows in " + path);
    }
    return rows;
}

} // namespace support
