// SPDX-License-Identifier: Apache-2.0
// Days, as tickets and command lines have them.
#pragma once

#include <cstdint>
#include <string>

namespace admin {

/// Whether a text is a day such as 2024-05-01.
bool isDay(const std::string& text);

/// The number of days in "90d". Throws Failure (BadInput), which calls it `what`, for anything
/// else.
int daysOf(const std::string& text, const std::string& what);

/// The day that was so many days before today, here.
std::string dayBefore(int days);

/// The moment that was so many days before now, in seconds since 1970.
std::int64_t timeBefore(int days);

/// A moment as people read it, here.
std::string shownTime(std::int64_t seconds);

} // namespace admin
