// SPDX-License-Identifier: Apache-2.0
// Server paths of the files that a job's ticket names.
#pragma once

#include <string>
#include <string_view>

namespace jobkeys {

/// The file of a control strip that a ticket names, with or without a folder and an extension. A
/// leading dot does not start an extension.
inline std::string controlStripPath(std::string_view installFolder, std::string_view strip) {
    std::string_view name = strip.substr(strip.rfind('/') + 1);
    if (const std::size_t dot = name.rfind('.'); dot != 0) {
        name = name.substr(0, dot);
    }
    return std::string(installFolder).append("/ControlCharts/").append(name).append(".it8");
}

/// Whether a ticket's characterization data is a complete path.
inline bool isWholePath(std::string_view characterisation) {
    return characterisation.find("(TEMP)/") != characterisation.npos;
}

/// The file of a ticket's characterization data. A version in the value selects the folder; the
/// versions are tried in the order below.
inline std::string characterisationPath(std::string_view installFolder, std::string_view value) {
    if (isWholePath(value)) {
        return std::string(value);
    }
    std::string folder = std::string(installFolder) + "/IT8_CharacterizationData/";
    for (const char* version : {"MKCheck10", "MKCheck11"}) {
        if (value.find(version) != value.npos) {
            return folder.append("Fogra_").append(version).append("/").append(value);
        }
    }
    return folder.append(value);
}

} // namespace jobkeys
