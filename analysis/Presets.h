// Tolerance presets as XML files. docs/presets.md states the format for whoever writes one.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "job/AnalysisLibrary.h"

namespace analysis {

/// A longer file is no preset.
inline constexpr std::size_t maxPresetBytes = std::size_t{1} << 20;

/// Where a file's first fault is, for a person who mends it.
struct PresetFault {
    std::size_t line = 0;    ///< From 1; 0 if the fault is not in a place of the file.
    std::string description; ///< Such as "tolerance of <average> is not a number: 2,5"; UTF-8.
};

/// Reads the preset file at `path` (bytes as the file system has them) into `preset`.
///
/// With keepJobChoice presetID and deltaEMode of the record stay, and all else comes from the file;
/// an entry that the file does not name is 0. A filePath that the caller has given stays, an empty
/// one becomes `path`. Gives exitDone or one of the codes exitPresetMissing to
/// exitPresetUnknownEntry, or exitOutOfMemory; on failure `preset` is left as it was, and *fault
/// (if not null) describes the fault.
int readPreset(const std::string& path, bool keepJobChoice, tolerancePresetParameterRecord& preset,
               PresetFault* fault = nullptr);

/// The same from the contents of a file; filePath stays.
int parsePreset(std::string_view bytes, bool keepJobChoice, tolerancePresetParameterRecord& preset,
                PresetFault* fault = nullptr);

} // namespace analysis
