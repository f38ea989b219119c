// SPDX-License-Identifier: Apache-2.0
// Tolerance presets as XML files. docs/presets.md describes the format.
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

/// illuminationCondition 0 to 3 is M0 to M3 of ISO 13655, -1 is any. Higher numbers are allowed for
/// older presets, and mean nothing.
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
    bool conditionRequired = false; ///< The verdict requires the measuring condition.
    int minimumGreys = 5;           ///< With fewer CMY greys there is no answer.

    /// Names of the inks after C, M, Y and K, in channel order. UTF-8, distinct, not empty. For
    /// data without ink names. There may be more or fewer names than inks.
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

/// Longer files are rejected.
inline constexpr std::size_t maxPresetBytes = std::size_t{1} << 20;

/// The first fault in a file, for people who have to correct it.
struct PresetFault {
    std::size_t line = 0;    ///< From 1; 0 if the fault has no position in the file.
    std::string description; ///< For example "tolerance of <average> is not a number: 2,5"; UTF-8.
};

/// Reads the preset file at `path` (bytes of the file system) into `preset`.
///
/// With keepJobChoice, presetID and deltaEMode of the record stay. Everything else comes from the
/// file; an entry that the file does not name is 0. A filePath set by the caller stays, an empty
/// one becomes `path`. Returns exitDone, exitOutOfMemory or one of the codes from exitPresetMissing
/// to exitPresetUnknownEntry. On failure `preset` is unchanged, and *fault (if not null) describes
/// the fault.
int readPreset(const std::string& path, bool keepJobChoice, tolerancePresetParameterRecord& preset,
               PresetFault* fault = nullptr);

/// The same for the contents of a file. filePath stays.
int parsePreset(std::string_view bytes, bool keepJobChoice, tolerancePresetParameterRecord& preset,
                PresetFault* fault = nullptr);

/// Reads the settings of a record's file that the record lacks. filePath is the file; if readPreset
/// has just read it for this filePath, it is not read again. Without a filePath, the options are
/// the defaults. Returns the codes of readPreset. On failure `options` is unchanged.
int readPresetOptions(const tolerancePresetParameterRecord& preset, PresetOptions& options);

/// The condition that a preset selects from several in a file: "M0" to "M3". Empty leaves the
/// choice to the reader.
std::string conditionOf(const tolerancePresetParameterRecord& preset);

/// What a preset asks of a comparison. Spectra are wanted only if tone values are.
ComparisonWants wantsOf(const tolerancePresetParameterRecord& preset, const PresetOptions& options);

/// How a criterion is judged. If fograPSDPreset is above 0, the PSD values of the record are used.
Setting settingOf(const Criterion& criterion, const tolerancePresetParameterRecord& preset,
                  const PresetOptions& options);

} // namespace analysis
