// SPDX-License-Identifier: Apache-2.0
// What this program did to a store, for the store's log.
#pragma once

#include <string>

#include <CLI/CLI.hpp>

namespace admin {

/// The command with what it is about, such as "user add anna"; empty for one that changes nothing.
/// Values that are stored are left out.
std::string loggedCommand(const CLI::App& program);

/// Notes a command in the log of the store. Best effort; error is empty if it was done.
void logCommand(const std::string& address, const std::string& command, const std::string& error);

} // namespace admin
