// SPDX-License-Identifier: Apache-2.0
// Summarises a result, or a trend of many, in a few lines for a terminal.
#pragma once

#include <string>

#include "companions/tintgate-report/Terminal.h"
#include "report/Meta.h"
#include "report/Result.h"
#include "report/Trend.h"

namespace report {

/// The verdict with its reasons, the criteria that it rests on, the statistics, the patches that
/// differ most, and the warnings: the page's own words and numbers. `meta` may be null.
std::string summaryText(const Result& result, const Meta* meta, const Painter& paint,
                        const languages::Texts& say);

/// For each series: whether it drifts and which ink, the state of the inks, the criteria, and the
/// latest jobs.
std::string trendText(const TrendModel& trend, const Painter& paint, const languages::Texts& say);

} // namespace report
