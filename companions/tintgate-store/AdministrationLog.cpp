// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/AdministrationLog.h"

#include <algorithm>
#include <ctime>
#include <set>

#include "store/StoreEngine.h"

namespace admin {

namespace {

/// Those that only look. Any other is logged, so that a new command is unless it is put here. A
/// copy is made of stores that it names itself.
const std::set<std::string> readers = {
    "copy", "diagnose", "export",   "file get", "file list",   "file versions", "info",
    "jobs", "key get",  "key list", "log",      "ticket list", "user list",     "verify",
};

/// Arguments that are no part of what a command is about.
const std::set<std::string> unnamed = {"local", "type", "values", "version"};

} // namespace

std::string loggedCommand(const CLI::App& program) {
    std::string words;
    const CLI::App* command = &program;
    while (!command->get_subcommands().empty()) {
        command = command->get_subcommands().front();
        words += (words.empty() ? "" : " ") + command->get_name();
    }
    const auto* const dryRun = command->get_option_no_throw("--dry-run");
    if (readers.contains(words) || (dryRun != nullptr && dryRun->count() != 0)) {
        return {};
    }
    for (const auto* const option : command->get_options()) {
        if (!option->get_positional() || unnamed.contains(option->get_name())) {
            continue;
        }
        for (const auto& value : option->results()) {
            words += " " + value;
        }
    }
    return words;
}

void logCommand(const std::string& address, const std::string& command, const std::string& error) {
    if (command.empty() || address.empty()) {
        return;
    }
    try {
        const auto store = store::openStore(address, store::Access::Read);
        store->log({std::time(nullptr), store::Event::Administration, "", store::thisOrigin(),
                    command + (error.empty() ? "" : ": " + error)});
    } catch (const std::exception&) { // No store, or none that this user may write.
    }
}

} // namespace admin
