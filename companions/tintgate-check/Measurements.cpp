// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Measurements.h"

#include <algorithm>
#include <filesystem>
#include <system_error>

namespace check {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view endings[] = {".txt", ".it8", ".ti3", ".cgats", ".cgt", ".cie",
                                        ".cxf", ".mxf", ".csv", ".tsv",   ".xls", ".xlsx"};

std::string lowerCase(std::string_view text) {
    std::string lower(text);
    for (char& c : lower) {
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c | 32) : c;
    }
    return lower;
}

bool isFolder(const std::string& path) {
    std::error_code ignored;
    return fs::is_directory(path, ignored);
}

} // namespace

// Workbooks are among them so that one among the exports is refused in words and not passed over.
bool looksLikeMeasurement(std::string_view fileName) {
    const std::string name = lowerCase(fileName);
    return !name.starts_with('.') &&
           std::any_of(std::begin(endings), std::end(endings),
                       [&](std::string_view ending) { return name.ends_with(ending); });
}

std::string measurementEndings() {
    std::string list;
    for (const std::string_view ending : endings) {
        list += (list.empty() ? "" : ", ") + std::string(ending);
    }
    return list;
}

std::string relativeOf(const std::string& path) {
    const fs::path plain = fs::path(path).lexically_normal();
    const bool leadsElsewhere = plain.is_absolute() || *plain.begin() == "..";
    return leadsElsewhere ? plain.filename() : plain;
}

MeasurementWalk::MeasurementWalk(std::vector<std::string> arguments)
    : m_arguments(std::move(arguments)) {
    if (std::none_of(m_arguments.begin(), m_arguments.end(), isFolder)) {
        m_total = m_arguments.size();
    }
    std::reverse(m_arguments.begin(), m_arguments.end());
}

/// False if the folder can't be read.
bool MeasurementWalk::enter(const std::string& folder) {
    Level level{folder, {}};
    std::error_code failure;
    for (fs::directory_iterator at(folder, failure), end; !failure && at != end;
         at.increment(failure)) {
        std::error_code ignored;
        const std::string name = at->path().filename();
        const bool isPlainFolder = at->symlink_status(ignored).type() == fs::file_type::directory;
        if ((isPlainFolder && !name.starts_with('.')) ||
            (!isPlainFolder && looksLikeMeasurement(name) && !at->is_directory(ignored))) {
            level.names.push_back(name);
        }
    }
    std::sort(level.names.rbegin(), level.names.rend());
    m_levels.push_back(std::move(level));
    return !failure;
}

std::optional<Measurement> MeasurementWalk::next() {
    while (true) {
        if (m_levels.empty()) {
            if (m_arguments.empty()) {
                return std::nullopt;
            }
            m_root = std::move(m_arguments.back());
            m_arguments.pop_back();
            if (!isFolder(m_root)) {
                return Measurement{m_root, relativeOf(m_root)};
            }
            m_anyBelowRoot = false;
            if (!enter(m_root)) {
                m_levels.clear();
                return Measurement{m_root, relativeOf(m_root), true};
            }
            continue;
        }
        Level& level = m_levels.back();
        if (level.names.empty()) {
            m_levels.pop_back();
            if (m_levels.empty() && !m_anyBelowRoot) {
                return Measurement{m_root, relativeOf(m_root), true};
            }
            continue;
        }
        const std::string path =
            level.folder + (level.folder.ends_with('/') ? "" : "/") + level.names.back();
        level.names.pop_back();
        const std::string relative = fs::path(path).lexically_relative(m_root);
        if (!isFolder(path) || fs::is_symlink(path)) {
            m_anyBelowRoot = true;
            return Measurement{path, relative, true};
        }
        if (!enter(path)) {
            m_levels.back().names.clear();
            m_anyBelowRoot = true;
            return Measurement{path, relative, true};
        }
    }
}

} // namespace check
