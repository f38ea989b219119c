// SPDX-License-Identifier: Apache-2.0
#include "report/OwnFile.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <system_error>

#include "report/Page.h"

namespace report {
namespace {

constexpr std::size_t jsonMarkWithin = 512;

} // namespace

bool carriesMark(OwnKind kind, std::string_view start) {
    if (kind == OwnKind::Page) {
        return summaryIn(start).has_value();
    }
    const std::string_view mark =
        kind == OwnKind::Result ? "\"tintgate-result\"" : "\"tintgate-error\"";
    return start.substr(0, jsonMarkWithin).find(mark) != start.npos;
}

bool isOwnFile(OwnKind kind, const std::string& path) {
    std::error_code ignored;
    if (!std::filesystem::is_regular_file(path, ignored)) {
        return false;
    }
    std::string start(kind == OwnKind::Page ? summaryWithin : jsonMarkWithin, '\0');
    std::ifstream file(path, std::ios::binary);
    file.read(start.data(), static_cast<std::streamsize>(start.size()));
    start.resize(static_cast<std::size_t>(std::max(file.gcount(), std::streamsize{0})));
    return carriesMark(kind, start);
}

} // namespace report
