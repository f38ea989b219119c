// SPDX-License-Identifier: Apache-2.0
// One result as a point of a trend.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "colour/DataSet.h"
#include "report/Meta.h"
#include "report/Result.h"

namespace report {

/// The patches whose colours show the state of a printer.
enum class Ink { Paper, Cyan, Magenta, Yellow, Black };
inline constexpr std::size_t inkCount = 5;
inline constexpr Ink allInks[inkCount] = {Ink::Paper, Ink::Cyan, Ink::Magenta, Ink::Yellow,
                                          Ink::Black};

/// The criterion that holds the ink against its target, such as "solidCyan".
const char* inkCriterion(Ink ink);

/// Classifies a patch by its device values in percent, starting with C, M, Y, K: paper, or one
/// solid, each within 0.5 as for criteria (docs/criteria.md); otherwise nothing.
std::optional<Ink> inkOf(const double* device, std::size_t channels);

/// The mean colour of each ink's patches; nothing if there are none.
using InkColours = std::array<std::optional<colour::Lab>, inkCount>;

/// Collects colours patch by patch. Skips colours that are not finite.
class InkMeans {
  public:
    void add(Ink ink, const colour::Lab& lab);
    InkColours means() const;

  private:
    struct Sum {
        colour::Lab lab;
        std::size_t count = 0;
    };
    std::array<Sum, inkCount> m_sums;
};

/// One strip of one job, or one file's comparison. Texts are empty if unknown.
struct Sample {
    std::int64_t time = 0; ///< Seconds since 1970 on the room's own clock, whatever its zone.
    std::string title;     ///< Empty for a job without one.
    std::optional<std::int64_t> jobId;
    int strip = 1;
    std::string paper;
    std::string instrument;
    std::string workflow;
    std::string preset;
    std::int64_t presetId = 0;
    std::string formula; ///< For example "CIE2000".
    std::string target;  ///< Name of its file.
    /// Equal for the same target: its identity or, without one, its name and its own statements.
    std::string targetKey;
    std::string printer; ///< Or printing conditions, as stated by the measurement.
    std::string folder;  ///< Folder of one printer's results, if folders distinguish printers.
    Verdict verdict = Verdict::Incomplete;
    std::vector<Criterion> criteria; ///< worstPatch is not used.
    InkColours inks;                 ///< As measured.
    InkColours aims;                 ///< The target's colours of the same patches.
    std::string page; ///< Bytes: path of the job's page relative to the trend's page.
};

/// What the names of the tone values at 50 percent begin with, which sampleOf adds to the criteria:
/// figures of each process ink, in percent, never judged.
inline constexpr const char* toneAtHalf = "toneAtHalf";

/// Without time and page. `meta` may be null; then instrument and title come from the measurement.
Sample sampleOf(const Result& result, const Meta* meta);

} // namespace report
