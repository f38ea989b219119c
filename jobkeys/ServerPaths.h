// SPDX-License-Identifier: Apache-2.0
// Where the server keeps the files that a job's ticket names.
#pragma once

#include <string>
#include <string_view>

namespace jobkeys {

/// The file of a control strip that a ticket names, with or without a folder and an extension. A
/// dot at the start of a name starts no extension.
inline std::string controlStripPath(std::string_view installFolder, std::string_view strip) {
    std::string_view name = strip.substr(strip.rfind('/') + 1);
    if (const std::size_t dot = name.rfind('.'); dot != 0) {
        name = name.substr(0, dot);
    }
    return std::string(installFolder).append("/ControlCharts/").append(name).append(".it8");
}

/// Whether a ticket's characterisation data is a path of its own.
inline bool isWholePath(std::string_view characterisation) {
    return characterisation.find("(TEMP)/") != characterisation.npos;
}

/// The file of a ticket's characterisation data. The first version that the value contains decides
/// the folder.
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
