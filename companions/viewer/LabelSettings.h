// SPDX-License-Identifier: Apache-2.0
// Whether the jobs of this machine get labels and certificates: the settings file "viewer.conf".
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace viewer {

struct LabelSettings {
    std::string label;                       ///< "pdf", "svg" or "png"; empty for no labels.
    bool certificate = false;                ///< Whether a certificate is made too.
    bool onlyPassed = false;                 ///< None for jobs that failed or are incomplete.
    std::string program = "tintgate-report"; ///< A path, or a name to find in PATH.
    std::vector<std::string> options;        ///< Further options of that program, in order.

    bool areWanted() const { return !label.empty() || certificate; }
};

/// /etc/tintgate/viewer.conf below the system root.
std::string labelSettingsPath();

/// Reads a settings file. A missing file means that nothing is wanted. Returns nothing, with the
/// reason in `problem`, if the file can't be read or a line is not as described in docs/labels.md.
std::optional<LabelSettings> readLabelSettings(const std::string& path, std::string& problem);

} // namespace viewer
