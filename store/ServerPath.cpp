// SPDX-License-Identifier: Apache-2.0
#include "store/ServerPath.h"

#include <algorithm>

#include "store/StoreEngine.h"

namespace store {

namespace {

constexpr std::size_t longestPath = 2'048;
constexpr std::size_t longestPart = 255;

[[noreturn]] void refuse(std::string_view path) {
    throw StoreFailure(Fault::BadPath, shownServerPath(path) + " names no file of the store");
}

} // namespace

std::vector<std::string> partsOfServerPath(std::string_view path) {
    if (path.size() > longestPath || path.find('\0') != std::string_view::npos || path.empty() ||
        path.back() == '/') {
        refuse(path);
    }
    std::vector<std::string> parts;
    for (std::size_t start = 0; start < path.size();) {
        const std::size_t end = std::min(path.find('/', start), path.size());
        const std::string_view part = path.substr(start, end - start);
        start = end + 1;
        if (part.empty() || part == ".") {
            continue;
        }
        if (part == ".." || part.size() > longestPart || part.starts_with(ownPrefix)) {
            refuse(path);
        }
        parts.emplace_back(part);
    }
    if (parts.empty()) {
        refuse(path);
    }
    return parts;
}

std::string joinedParts(const std::vector<std::string>& parts, std::size_t count) {
    std::string joined;
    for (std::size_t i = 0; i < count; ++i) {
        joined += (i == 0 ? "" : "/") + parts[i];
    }
    return joined;
}

std::string shownServerPath(std::string_view path) {
    std::string text(path.substr(0, 100));
    std::replace_if(
        text.begin(), text.end(), [](unsigned char c) { return c < 0x20 || c == 0x7F; }, '?');
    return "server path \"" + text + (path.size() > 100 ? "..." : "") + "\"";
}

} // namespace store
