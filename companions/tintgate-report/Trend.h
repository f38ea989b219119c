// SPDX-License-Identifier: Apache-2.0
// The trend of many results, from files or a store.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "companions/tintgate-report/Filter.h"
#include "report/Trend.h"

namespace report {

/// Samples, with what a person should know of where they come from.
struct Gathered {
    std::vector<Sample> samples;
    std::vector<std::string> notes;
    std::size_t leftOut = 0; ///< Results that could not be read.
};

/// Where the pages of jobs go, and how a trend's page leads to them.
struct PagePlace {
    std::string folder; ///< Of the trend's page; empty where jobs get no links.
    std::string
        name; ///< Of the folder of jobs' pages in it, made for the first; empty: none is made.
};

/// What tells printers apart, beside what measurements state.
enum class SeriesBy { Statements, Folders };

/// Reads result files, or all below folders, and makes the page of each job where the viewer has
/// not made it already, in `language` or, without one, in that of the job. What can't be read is
/// reported to `complain` and left out. Throws Failure (Unreadable for a folder, NotWritten).
Gathered gatherFiles(const std::vector<std::string>& arguments, const Filter& filter,
                     SeriesBy seriesBy, const PagePlace& place,
                     std::optional<languages::Language> language, const languages::Texts& say,
                     const std::function<void(const std::string&)>& complain);

/// Reads the results that the jobs of stores hold, such as of a room and its archive. Links lead to
/// the pages that lie in the tool's folder on this machine. Throws Failure (Store).
Gathered gatherStores(const std::vector<std::string>& addresses, const Filter& filter,
                      const PagePlace& place, const languages::Texts& say);

} // namespace report
