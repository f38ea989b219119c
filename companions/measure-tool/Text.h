// SPDX-License-Identifier: Apache-2.0
// Words for people.
#pragma once

#include <chrono>
#include <string>
#include <string_view>

namespace measuretool {

/// A text as valid UTF-8 without control characters, each of which becomes a question mark: paths
/// and ids of foreign files must not command a terminal.
std::string printable(std::string_view text);

/// Minutes and seconds, such as "14:05"; whole hours count as minutes.
std::string minutesText(std::chrono::seconds time);

/// Hours and minutes of local time, such as "15:32".
std::string clockText(std::chrono::system_clock::time_point time);

/// The time in UTC as ISO 8601 has it: "2024-05-01T12:34:56Z".
std::string timeText(std::chrono::system_clock::time_point time);

} // namespace measuretool
