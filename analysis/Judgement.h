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

/// The result of one criterion.
struct Finding {
    const Criterion* criterion = nullptr;
    bool answered = false; ///< False if the data have too few of its patches.
    double value = -1.0;   ///< As calculated; -1.0 if not answered.
    double rounded = -1.0; ///< With the preset's decimals. Compared with the tolerance.
    int decimals = 0;
    double tolerance = 0;    ///< 0 also if the preset does not name the criterion.
    bool used = false;       ///< Takes part in the verdict.
    bool passed = false;     ///< Answered, and not above the tolerance.
    std::size_t patches = 0; ///< Patches in the data that the value is based on.
    std::size_t needed = 1;  ///< Number of different patches needed for an answer.
    std::size_t found = 0;   ///< Number of different patches in the data.
    std::size_t listed = 0;  ///< Length of the list that selects the patches; 0 if there is none.
    std::size_t worst = 0;   ///< The one of these with the largest value. Only if answered.
};

enum class Verdict {
    Passed,
    Failed,
    Incomplete, ///< Nothing failed, but something required for "passed" is missing.
};

/// "passed", "failed", "incomplete".
const char* verdictName(Verdict verdict);

/// Statistics of the colour differences of all patches.
struct Statistics {
    std::size_t count = 0;
    double mean = 0;
    double median = 0;       ///< For an even count, the mean of the two in the middle.
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
    std::vector<Warning> warnings; ///< About conditions, and about what the preset requires.
};

/// Judges with the settings of settingOf. "Failed" if any criterion in use is above its tolerance;
/// "incomplete" if one of them has no answer, none is in use, or a warning keeps the verdict open.
/// REQUIRES: a comparison with patches.
Judgement judge(const Comparison& comparison, const tolerancePresetParameterRecord& preset,
                const PresetOptions& options);

/// Converts the judgement to the record that tickets are written from: values of criteria at their
/// entries, -1.0 at all others.
void fillResults(const Judgement& judgement, const tolerancePresetParameterRecord& preset,
                 analyseResultsRecord& results);

/// Rounds half up to this many decimals. Unchanged for more than 15.
double roundedTo(double value, int decimals);

} // namespace analysis
