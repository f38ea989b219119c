// SPDX-License-Identifier: Apache-2.0
// The page of one report, and the index of many: HTML in one piece that fetches nothing.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "report/Model.h"

namespace report {

/// The whole page as UTF-8. The same result and meta file give the same bytes.
///
/// Texts of tickets and files stand in it as JSON alone, in a script element that is not run, with
/// "<", ">" and "&" escaped; the page shows them as text. A Content-Security-Policy lets nothing
/// run but the page's own scripts, by their hashes, and nothing be fetched.
std::string pageOf(const Result& result, const Meta* meta, const Facts& print = {});

/// What an index shows of a report. Texts are for people.
struct Summary {
    Verdict verdict = Verdict::Incomplete;
    std::string word;
    std::string sentence;
    std::string title;
    std::string subtitle;
    std::string created; ///< Sorts by time as text; empty for a result without a job.
};

/// Bytes at the start of a page in which its summary stands.
inline constexpr std::size_t summaryWithin = 65536;

/// The summary of a page from its first bytes, or nothing where they are no page of ours.
std::optional<Summary> summaryIn(std::string_view startOfPage);

struct Listed {
    std::string path; ///< Bytes, relative to the index.
    Summary summary;
};

/// The index, in the given order. `folder` is where reports were looked for, as text.
std::string indexOf(const std::vector<Listed>& reports, const std::string& folder);

} // namespace report
