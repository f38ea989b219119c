// SPDX-License-Identifier: Apache-2.0
// Which results a trend is made of.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "report/Sample.h"

namespace report {

/// Seconds since 1970 on the room's own clock of a text such as "2026-11-24", "2026-11-24 21:53",
/// "2026-11-24T21:53:07+01:00" (the zone counts for nothing), "Tue Nov 24 21:53:07 2026",
/// "2026/11/24", "November 24, 2026  21:53", "11/24/2026 # Time: 21:53" or "24.11.2026"; nothing
/// for any other, nor for one whose day and month may have changed places.
std::optional<std::int64_t> timeOf(const std::string& text);

/// The same of a time of this machine, in its own zone.
std::int64_t localTime(std::int64_t secondsSince1970);

/// Texts match where they are a part of what a result has, whatever the case of ASCII letters. What
/// is empty takes everything.
struct Filter {
    std::optional<std::int64_t> since;
    std::optional<std::int64_t> until; ///< The first time that is too late.
    std::string paper;
    std::string preset; ///< A part of its name, or its number.
    std::string instrument;
    std::string workflow;

    bool takesTime(std::int64_t time) const;
    bool takes(const Sample& sample) const;
};

/// The begin of a day: "2026-11-24", or "30d" for so many days before today. Nothing for any other
/// text.
std::optional<std::int64_t> dayOf(const std::string& text);

} // namespace report
