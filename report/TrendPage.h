// SPDX-License-Identifier: Apache-2.0
// The page of a trend: self-contained HTML.
#pragma once

#include <string>

#include "report/Trend.h"

namespace report {

/// The whole page as UTF-8; the same samples and language give the same bytes. As with pageOf,
/// texts are data, and nothing runs but the page's own scripts.
std::string trendPageOf(const TrendModel& model, const languages::Texts& say);

} // namespace report
