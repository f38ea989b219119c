// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/CheckPreset.h"

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <system_error>

#include "ExitCodes.h"
#include "analysis/Presets.h"
#include "companions/tintgate-report/Failure.h"

namespace report {

std::string presetSummary(const std::string& path) {
    tolerancePresetParameterRecord preset;
    analysis::PresetFault fault;
    const int code = analysis::readPreset(path, false, preset, &fault);
    if (code == exitOutOfMemory) {
        throw Failure(Status::Internal, "out of memory");
    }
    if (code != exitDone) {
        const bool isThere = code != exitPresetMissing && code != exitPresetUnreadable;
        throw Failure(isThere ? Status::Broken : Status::Unreadable,
                      path + (fault.line != 0 ? ":" + std::to_string(fault.line) : "") + ": " +
                          fault.description + " (exit code " + std::to_string(code) + ")");
    }
    analysis::PresetOptions options;
    analysis::readPresetOptions(preset, options); // of the file that was just read
    const auto used =
        std::count_if(std::begin(analysis::criteria), std::end(analysis::criteria),
                      [&](const auto& c) { return analysis::settingOf(c, preset, options).used; });
    return path + ": sound; preset " + std::to_string(preset.presetID) + ", \"" +
           preset.name.utf8_string() + "\", judges by " + std::to_string(used) +
           (used == 1 ? " criterion\n" : " criteria\n");
}

std::string installedPresets() {
    namespace fs = std::filesystem;
    std::error_code error;
    const fs::path program = fs::read_symlink("/proc/self/exe", error);
    const fs::path folder =
        (program.parent_path() / TINTGATE_PRESETS_FROM_PROGRAM).lexically_normal();
    return fs::is_directory(folder, error) ? folder.native() : std::string();
}

} // namespace report
