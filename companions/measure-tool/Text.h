// SPDX-License-Identifier: Apache-2.0
// Formats text for people.
#pragma once

#include <chrono>
#include <string>
#include <string_view>

namespace measuretool {

/// Returns valid UTF-8 with each control character replaced by a question mark: paths and ids of
/// foreign files must not control a terminal.
std::string printable(std::string_view text);

/// Minutes and seconds, such as "14:05". Hours are counted in minutes.
std::string minutesText(std::chrono::seconds time);

/// Hours and minutes in local time, such as "15:32".
std::string clockText(std::chrono::system_clock::time_point time);

/// UTC in ISO 8601 form: "2024-05-01T12:34:56Z".
std::string timeText(std::chrono::system_clock::time_point time);

} // namespace measuretool
