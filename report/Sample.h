// SPDX-License-Identifier: Apache-2.0
// One result as a point in time: what a trend is made of.
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

/// The patches whose colours tell where a printer stands.
enum class Ink { Paper, Cyan, Magenta, Yellow, Black };
inline constexpr std::size_t inkCount = 5;
inline constexpr Ink allInks[inkCount] = {Ink::Paper, Ink::Cyan, Ink::Magenta, Ink::Yellow,
                                          Ink::Black};

/// The criterion that holds the ink against its target, such as "solidCyan".
const char* inkCriterion(Ink ink);

/// What a patch is by its device values in percent, of which the first four are C, M, Y, K: paper
/// or one solid alone, each within 0.5 as criteria count them (docs/criteria.md); else nothing.
std::optional<Ink> inkOf(const double* device, std::size_t channels);

/// The mean colour of each ink's patches; nothing where there are none.
using InkColours = std::array<std::optional<colour::Lab>, inkCount>;

/// Gathers colours patch by patch. Colours that are not finite are passed over.
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

/// One strip of one job, or one file's comparison. Texts are empty where nothing is known.
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
    std::string formula; ///< Such as "CIE2000".
    std::string target;  ///< Name of its file.
    /// Equal for the same target: its identity; without one, its name and what it says of itself.
    std::string targetKey;
    std::string printer; ///< Or printing conditions, as the measurement states them.
    std::string folder;  ///< Of one printer's results, where folders tell printers apart.
    Verdict verdict = Verdict::Incomplete;
    std::vector<Criterion> criteria; ///< Their worstPatch says nothing here.
    InkColours inks;                 ///< As measured.
    InkColours aims;                 ///< Of the same patches in the target.
    std::string page;                ///< Bytes: where the job's page is, relative to the trend's.
};

/// What the names of the tone values at 50 percent begin with, which sampleOf adds to the criteria:
/// figures of each process ink, in percent, never judged.
inline constexpr const char* toneAtHalf = "toneAtHalf";

/// Without time and page. `meta` may be null; then instrument and title come from the measurement.
Sample sampleOf(const Result& result, const Meta* meta);

} // namespace report
