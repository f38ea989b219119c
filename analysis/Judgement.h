// SPDX-License-Identifier: Apache-2.0
// A comparison judged by the criteria of a preset.
#pragma once

#include <cstddef>
#include <vector>

#include "analysis/Comparison.h"
#include "analysis/Criteria.h"
#include "analysis/Measures.h"
#include "analysis/Presets.h"

namespace analysis {

/// What one criterion says.
struct Finding {
    const Criterion* criterion = nullptr;
    bool answered = false; ///< False if the data have too few such patches.
    double value = -1.0;   ///< As calculated; -1.0 without an answer.
    double rounded = -1.0; ///< To the decimals of the preset; this is held against the tolerance.
    int decimals = 0;
    double tolerance = 0;    ///< 0 also where the preset does not name the criterion.
    bool used = false;       ///< Takes part in the verdict.
    bool passed = false;     ///< Answered, and not above the tolerance.
    std::size_t patches = 0; ///< Such patches in the data, of which the value was made.
    std::size_t needed = 1;  ///< Different patches that an answer takes.
    std::size_t found = 0;   ///< Different patches that there are.
    std::size_t listed = 0;  ///< Length of the list that the patches are chosen by; 0 without one.
    std::size_t worst = 0;   ///< Of these, the patch with the largest figure. Only if answered.
};

enum class Verdict {
    Passed,
    Failed,
    Incomplete, ///< Nothing failed, but something needed for "passed" is missing.
};

/// "passed", "failed", "incomplete".
const char* verdictName(Verdict verdict);

/// Of the colour differences of all patches.
struct Statistics {
    std::size_t count = 0;
    double mean = 0;
    double median = 0;       ///< Of an even count the mean of the two in the middle.
    double percentile95 = 0; ///< Nearest rank.
    double maximum = 0;
    double standardDeviation = 0; ///< Of the patches as the whole population (divisor n).
};

struct Judgement {
    /// One a criterion, in the order of `criteria`, without those that nobody requested.
    std::vector<Finding> findings;
    Measures measures; ///< What the requested ones are answered from.
    Statistics statistics;
    Verdict verdict = Verdict::Incomplete;
    std::vector<Warning> warnings; ///< Of conditions, and of what the preset asks.
};

/// Judges by the settings of settingOf. "Failed" as soon as a criterion that takes part is above
/// its tolerance; "incomplete" if one of them has no answer, none takes part, or a warning keeps
/// the verdict open. REQUIRES: a comparison with patches.
Judgement judge(const Comparison& comparison, const tolerancePresetParameterRecord& preset,
                const PresetOptions& options);

/// The judgement as the record that tickets are written from: values of criteria at their entries,
/// -1.0 at all others.
void fillResults(const Judgement& judgement, const tolerancePresetParameterRecord& preset,
                 analyseResultsRecord& results);

/// Half up at so many decimals; as it is where there are more than 15.
double roundedTo(double value, int decimals);

} // namespace analysis
