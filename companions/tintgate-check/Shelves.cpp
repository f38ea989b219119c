// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Shelves.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <system_error>

#include <toml++/toml.h>

#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;

constexpr const char* debianDataSets = "/usr/share/color/icc";

/// Beside the conditions in use, of the user, of the system; each once, and only if it exists.
std::vector<std::string> foldersOf(const Conditions& conditions, const char* name) {
    std::vector<std::string> folders;
    std::error_code ignored;
    const fs::path own =
        conditions.file.empty() ? fs::path() : fs::absolute(conditions.file, ignored).parent_path();
    for (const std::string& parent : {own.string(), userFolder(), systemFolder()}) {
        const std::string folder = parent + "/" + name;
        if (!parent.empty() && fs::is_directory(folder, ignored) &&
            std::find(folders.begin(), folders.end(), folder) == folders.end()) {
            folders.push_back(folder);
        }
    }
    return folders;
}

std::string lowerCase(std::string text) {
    for (char& c : text) {
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c | 32) : c;
    }
    return text;
}

std::string fileName(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

std::string withoutEnding(const std::string& name) {
    const std::size_t dot = name.rfind('.');
    return dot == name.npos || dot == 0 ? name : name.substr(0, dot);
}

/// File names and their short names; none if the table is missing or broken.
std::map<std::string, std::string> shortNamesOf(const std::string& folder) {
    std::map<std::string, std::string> names;
    try {
        for (const auto& [name, file] : toml::parse_file(folder + "/short-names.toml")) {
            names[file.value_or(std::string())] = name.str();
        }
    } catch (const toml::parse_error&) {
    }
    return names;
}

/// How many letters are more, fewer, other, or swapped with their neighbours.
std::size_t editsBetween(std::string_view a, std::string_view b) {
    const std::size_t width = b.size() + 1;
    std::vector<std::size_t> edits((a.size() + 1) * width);
    for (std::size_t i = 0; i <= a.size(); ++i) {
        for (std::size_t j = 0; j <= b.size(); ++j) {
            std::size_t& least = edits[i * width + j];
            if (i == 0 || j == 0) {
                least = i + j;
                continue;
            }
            least = std::min({edits[(i - 1) * width + j] + 1, edits[i * width + j - 1] + 1,
                              edits[(i - 1) * width + j - 1] + (a[i - 1] == b[j - 1] ? 0 : 1)});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                least = std::min(least, edits[(i - 2) * width + j - 2] + 1);
            }
        }
    }
    return edits.back();
}

} // namespace

std::vector<std::string> dataSetFolders(const Conditions& conditions) {
    std::vector<std::string> folders = foldersOf(conditions, "references");
    std::error_code ignored;
    if (fs::is_directory(debianDataSets, ignored)) {
        folders.push_back(debianDataSets);
    }
    return folders;
}

std::vector<DataSetEntry> dataSetsIn(const std::string& folder) {
    std::vector<DataSetEntry> entries;
    std::error_code failure;
    constexpr auto options = fs::directory_options::skip_permission_denied;
    for (fs::recursive_directory_iterator at(folder, options, failure), end; !failure && at != end;
         at.increment(failure)) {
        std::error_code ignored;
        const std::string name = at->path().filename();
        if (at->is_regular_file(ignored) && !name.starts_with('.')) {
            entries.push_back({at->path().lexically_relative(folder), at->path()});
        }
    }
    std::sort(entries.begin(), entries.end(),
              [](const auto& a, const auto& b) { return a.name < b.name; });
    return entries;
}

std::string findDataSet(const Conditions& conditions, const std::string& name) {
    for (const bool exactly : {true, false}) {
        for (const std::string& folder : dataSetFolders(conditions)) {
            std::vector<std::string> found;
            for (const DataSetEntry& entry : dataSetsIn(folder)) {
                const std::string file = fileName(entry.name);
                if (exactly ? file == name || entry.name == name
                            : lowerCase(withoutEnding(file)) == lowerCase(name) ||
                                  lowerCase(file) == lowerCase(name)) {
                    found.push_back(entry.path);
                }
            }
            if (found.size() == 1) {
                return found.front();
            }
            if (found.size() > 1) {
                std::string list;
                for (const std::string& path : found) {
                    list += (list.empty() ? "" : ", ") + path;
                }
                throw Failure(Status::BadCommand, {0,
                                                   say(Say::AmbiguousDataSet, {name, list}),
                                                   {},
                                                   say(Say::AmbiguousDataSetRemedy)});
            }
        }
    }
    return {};
}

bool isDataSet(const Conditions& conditions, const std::string& path) {
    std::error_code failure;
    const std::string real = fs::canonical(path, failure);
    const auto folders = dataSetFolders(conditions);
    return !failure && std::any_of(folders.begin(), folders.end(), [&](const std::string& folder) {
        const std::string within = fs::canonical(folder, failure);
        return !failure && real.starts_with(within + "/");
    });
}

std::vector<std::string> presetFolders(const Conditions& conditions) {
    std::vector<std::string> folders = foldersOf(conditions, "presets");
    std::error_code ignored;
    const fs::path program = fs::read_symlink("/proc/self/exe", ignored);
    const fs::path installed =
        (program.parent_path() / TINTGATE_PRESETS_FROM_PROGRAM).lexically_normal();
    if (fs::is_directory(installed, ignored)) {
        folders.push_back(installed);
    }
    return folders;
}

std::vector<PresetEntry> presetsIn(const std::string& folder) {
    std::vector<PresetEntry> entries;
    const auto names = shortNamesOf(folder);
    std::error_code failure;
    for (fs::directory_iterator at(folder, failure), end; !failure && at != end;
         at.increment(failure)) {
        const std::string file = at->path().filename();
        if (file.ends_with(".xml")) {
            const auto found = names.find(file);
            entries.push_back(
                {found == names.end() ? withoutEnding(file) : found->second, at->path()});
        }
    }
    std::sort(entries.begin(), entries.end(),
              [](const auto& a, const auto& b) { return a.path < b.path; });
    return entries;
}

std::string findPreset(const Conditions& conditions, const std::string& name) {
    const bool isNumber =
        !name.empty() && name.size() <= 4 && name.find_first_not_of("0123456789") == name.npos;
    const std::string numbered = "CVP_" + std::string(isNumber ? 4 - name.size() : 0, '0') + name;
    for (const std::string& folder : presetFolders(conditions)) {
        for (const PresetEntry& entry : presetsIn(folder)) {
            const std::string file = withoutEnding(fileName(entry.path));
            if (entry.shortName == name || file == name || (isNumber && file == numbered)) {
                return entry.path;
            }
        }
    }
    return {};
}

std::string similarName(std::string_view name, const std::vector<std::string>& names) {
    const std::string wanted = lowerCase(std::string(name));
    std::string best;
    std::size_t least = wanted.size() / 3 + 2; // a third of the letters, and one
    for (const std::string& candidate : names) {
        const std::string lower = lowerCase(candidate);
        const std::size_t edits =
            wanted.size() > 2 && lower.starts_with(wanted) ? 1 : editsBetween(wanted, lower);
        if (edits < least && edits < lower.size()) {
            least = edits;
            best = candidate;
        }
    }
    return best;
}

} // namespace check
