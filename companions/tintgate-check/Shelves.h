// SPDX-License-Identifier: Apache-2.0
// Where data sets and presets are looked up by their names.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "companions/tintgate-check/Conditions.h"

namespace check {

/// Folders of data sets in the order of search: "references" next to the conditions in use, next to
/// the user's, and next to the system's, then Debian's data sets.
std::vector<std::string> dataSetFolders(const Conditions& conditions);

struct DataSetEntry {
    std::string name; ///< Of the file, below its folder.
    std::string path;
};

/// The files of a folder and the folders below it, by name.
std::vector<DataSetEntry> dataSetsIn(const std::string& folder);

/// The path of the data set that `name` means: a file's name, or that without its ending in any
/// case of letters. Empty if there is none. Throws Failure (BadCommand) if a folder has several.
std::string findDataSet(const Conditions& conditions, const std::string& name);

/// True if `path` is in one of the folders of data sets.
bool isDataSet(const Conditions& conditions, const std::string& path);

struct PresetEntry {
    std::string shortName; ///< Such as "contract-proof".
    std::string path;
};

/// Folders of presets in the order of search: "presets" next to the conditions in use, next to the
/// user's, and next to the system's, then the one that came with this program.
std::vector<std::string> presetFolders(const Conditions& conditions);

/// The presets of a folder by their files' names. The short name is that of short-names.toml in the
/// same folder, otherwise the file's name without its ending.
std::vector<PresetEntry> presetsIn(const std::string& folder);

/// The path of a preset by its short name or number ("1" is CVP_0001.xml); empty if there is none.
std::string findPreset(const Conditions& conditions, const std::string& name);

/// The most similar of the names, if one is close enough to be a slip; otherwise empty.
std::string similarName(std::string_view name, const std::vector<std::string>& names);

} // namespace check
