// SPDX-License-Identifier: Apache-2.0
// Tolerance presets as XML files. docs/presets.md states the format for whoever writes one.
#pragma once

#include <array>
#include <bitset>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Criteria.h"
#include "job/AnalysisLibrary.h"

namespace analysis {

/// illuminationCondition 0 to 3 is M0 to M3 of ISO 13655, -1 is any. Higher numbers are allowed,
/// for the sake of older presets, and mean nothing.
inline constexpr int largestMeasuringCondition = 3;

/// How one criterion is judged.
struct Setting {
    double tolerance = 0; ///< 0 also if the preset does not name the criterion.
    bool used = false;    ///< Takes part in the verdict.
    int decimals = 0;
};

/// What tone values are held against.
enum class ToneAims { Target, CurveA, CurveB, CurveC };

/// "target", "A", "B", "C".
const char* toneAimsName(ToneAims aims);

/// How much each grey counts in grey balance.
enum class GreyWeights {
    Equal,
    Falling, ///< 1 up to 50 percent, from there in a straight line to 0.25 at 100.
};

/// "equal", "falling".
const char* greyWeightsName(GreyWeights weights);

/// What a preset's file states beyond the record, which has no room for it.
struct PresetOptions {
    RepeatMode repeats = RepeatMode::Each;
    bool conditionRequired = false; ///< The measuring condition decides, and does not only warn.
    int minimumGreys = 5;           ///< Fewer CMY greys give no answer.

    /// Names of the inks after C, M, Y and K, in the order of the channels. UTF-8, different, none
    /// empty. For data that do not name them; they may be more or fewer than the data have inks.
    std::vector<std::string> inks;

    PaperAims paperAims = PaperAims::Absolute;
    ToneAims toneAims = ToneAims::Target;                 ///< Of cyan, magenta and yellow.
    std::optional<ToneAims> toneAimsBlack = std::nullopt; ///< That of the others if absent.
    bool spotToneFromTarget = false; ///< Aims of spot tone values: the target's, not the nominal.
    GreyWeights greyWeights = GreyWeights::Equal;

    /// Settings of the criteria without an entry, by their place in `criteria`.
    std::array<Setting, criterionCount> named{};
    /// Which criteria the file names, used or not, by their place.
    std::bitset<criterionCount> stated;

    /// True if a criterion is named that is answered on request only.
    bool asks(Quantity quantity) const;

    /// True if tone values of the target count, which are from its spectra if it has any.
    bool asksTargetSpectra() const;

    /// True if anything is asked for that results of older versions do not have.
    bool asksMeasures() const;
};

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

/// What the file of a record states beyond the record. filePath leads to it; a file that readPreset
/// has just read for this filePath is not read again. Without a filePath the options are the usual
/// ones. Gives the codes of readPreset; `options` is left as it was on failure.
int readPresetOptions(const tolerancePresetParameterRecord& preset, PresetOptions& options);

/// Which of several conditions of a file a preset asks for: "M0" to "M3"; empty leaves the choice
/// to the reader.
std::string conditionOf(const tolerancePresetParameterRecord& preset);

/// What a preset asks of a comparison. Spectra are wanted only if tone values are.
ComparisonWants wantsOf(const tolerancePresetParameterRecord& preset, const PresetOptions& options);

/// How a criterion is judged. With fograPSDPreset above 0 the PSD values of the record decide.
Setting settingOf(const Criterion& criterion, const tolerancePresetParameterRecord& preset,
                  const PresetOptions& options);

} // namespace analysis
