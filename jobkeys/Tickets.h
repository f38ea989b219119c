// SPDX-License-Identifier: Apache-2.0
// The types of tickets, and the names derived from their ids.
#pragma once

#include <string>
#include <string_view>

namespace jobkeys {

// Types of tickets. The id is that of the job or of the tolerance preset. There is one system
// ticket, with id 0.
inline constexpr int systemType = 0;
inline constexpr int jobType = 3;
inline constexpr int presetType = 27;

/// The id under which this tool logs in to the server.
inline constexpr int verifierApplication = 0x5071103;

/// Followed by the job's id, this is the name of a job's working folder.
inline constexpr std::string_view jobFolderPrefix = "JobID_";

inline std::string jobFolderName(int id) {
    return std::string(jobFolderPrefix) + std::to_string(id);
}

/// The name of a preset's file, such as "CVP_0007.xml", padded to four digits. A negative id has
/// its sign after three zeros.
inline std::string presetFileName(int id) {
    const char* const zeros = id <= 9 ? "000" : id <= 99 ? "00" : id <= 999 ? "0" : "";
    return "CVP_" + std::string(zeros) + std::to_string(id) + ".xml";
}

/// The preset's file on the server.
inline std::string presetPath(std::string_view installFolder, int id) {
    return std::string(installFolder) + "/tickets/" + presetFileName(id);
}

} // namespace jobkeys
