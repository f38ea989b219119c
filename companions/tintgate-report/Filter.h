// SPDX-License-Identifier: Apache-2.0
// Selects the results of a trend.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "report/Sample.h"

namespace report {

/// Parses a text such as "2026-11-24", "2026-11-24 21:53", "2026-11-24T21:53:07+01:00" (the zone is
/// ignored), "Tue Nov 24 21:53:07 2026", "2026/11/24", "November 24, 2026 21:53", "11/24/2026 #
/// Time: 21:53" or "24.11.2026". Returns seconds since 1970 in the room's local time. Nothing for
/// any other text and for ambiguous day and month.
std::optional<std::int64_t> timeOf(const std::string& text);

/// Same for a time of this machine, in its time zone.
std::int64_t localTime(std::int64_t secondsSince1970);

/// A text matches if it is part of the result's text, ignoring the case of ASCII letters. Empty
/// members match everything.
struct Filter {
    std::optional<std::int64_t> since;
    std::optional<std::int64_t> until; ///< The first time that is too late.
    std::string paper;
    std::string preset; ///< Part of its name, or its number.
    std::string instrument;
    std::string workflow;

    bool takesTime(std::int64_t time) const;
    bool takes(const Sample& sample) const;
};

/// The start of a day: "2026-11-24", or "30d" for 30 days before today. Nothing for any other text.
std::optional<std::int64_t> dayOf(const std::string& text);

} // namespace report
