// SPDX-License-Identifier: Apache-2.0
// The page of one report, and the index of many: HTML in one piece that fetches nothing.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "report/Model.h"

namespace report {

/// The language of a job's page: the job's own, if it has texts, otherwise the user's. `meta` may
/// be null.
languages::Language languageOf(const Meta* meta);

/// The whole page as UTF-8. The same result, meta file and language give the same bytes.
///
/// Texts of tickets and files can't become markup or scripts: in the body they are escaped
/// (report/Html.h), and in the data of the page's scripts, which are JSON, "<", ">" and "&" are. A
/// Content-Security-Policy lets nothing run but the page's own scripts, by their hashes, and
/// nothing be fetched.
std::string pageOf(const Result& result, const Meta* meta,
                   const languages::Texts& say = languages::english(), const Facts& print = {});

/// What an index shows of a report. Texts are for people.
struct Summary {
    Verdict verdict = Verdict::Incomplete;
    std::string word;
    std::string sentence;
    std::string title;
    std::string subtitle;
    std::string created;  ///< Sorts by time as text; empty for a result without a job.
    std::string language; ///< Of these texts, as a tag.
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
/// Verdicts are in the language of `say`; the rest of a summary is in that of its page.
std::string indexOf(const std::vector<Listed>& reports, const std::string& folder,
                    const languages::Texts& say);

} // namespace report
