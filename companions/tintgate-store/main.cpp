// SPDX-License-Identifier: Apache-2.0
// The administration tool of a store: users, tickets, files and jobs.
#include <algorithm>
#include <csignal>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <new>
#include <string>
#include <utility>
#include <vector>

#include <CLI/CLI.hpp>

#include "companions/tintgate-store/AdministrationLog.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/LocalFile.h"

namespace {

using admin::Status;

constexpr const char* footer = R"(
Examples:
  tintgate-store --store /srv/tintgate make --name "Print room"
  tintgate-store copy /srv/tintgate room  to the PostgreSQL server of the service "room"
  export TINTGATE_STORE=/srv/tintgate     from here on --store may be left out
  tintgate-store user add anna            asks for the password
  tintgate-store import tickets.json
  tintgate-store file put chart.it8 /server/ControlCharts/chart.it8
  tintgate-store jobs
  tintgate-store key list job/7 Workflow/
  tintgate-store key set job/7 Input/Title string "Summer catalogue"
  tintgate-store export job/7 -o job-7.json
  tintgate-store file versions /jobs/7/job.jdf
  tintgate-store reset 7 --strip 1
  tintgate-store jdf ready 7 --updates 6
  tintgate-store backup /backup/monday
  tintgate-store archive --closed 90d /srv/archive
  tintgate-store diagnose 7 --strip 2

Each command has a --help of its own. docs/stores.md shows how to set up a whole job.

)";

int end(Status status) {
    return static_cast<int>(status);
}

int fail(Status status, const char* text, std::string& error) {
    error = text;
    std::fprintf(stderr, "tintgate-store: %s\n", admin::printable(text).c_str());
    return end(status);
}

// CLI11 takes "[a,b]" for a list of two values, "-Infinity" for options, and lets an inner command
// have nothing of what stands behind "--". Such arguments are marked while it parses.
constexpr char mark = '\x01';

std::vector<std::string> markedArguments(int count, char** arguments) {
    std::vector<std::string> result;
    bool values = false; // "--" has been.
    for (int i = 1; i < count; ++i) {
        const std::string argument = arguments[i];
        if (!values && argument == "--") {
            values = true;
            continue;
        }
        const bool list = !argument.empty() && argument.front() == '[' && argument.back() == ']';
        const bool marks = values || list || argument == "-Infinity" || argument[0] == mark;
        result.push_back(marks ? mark + argument : argument);
    }
    return result;
}

std::string unmarked(const std::string& argument) {
    return argument[0] == mark ? argument.substr(1) : argument;
}

void unmarkOptions(CLI::App& command) {
    for (auto* option : command.get_options()) {
        if (option->get_items_expected_max() > 0) {
            option->transform(unmarked);
        }
    }
    for (auto* below : command.get_subcommands([](CLI::App*) { return true; })) {
        unmarkOptions(*below);
    }
}

int run(admin::Invocation& invocation, std::string& error) {
    try {
        invocation.address = admin::completeAddress(invocation.address);
        invocation.action();
        admin::finishStandardOutput();
        return end(Status::Done);
    } catch (const admin::Failure& failure) {
        return fail(failure.status, failure.what(), error);
    } catch (const store::StoreFailure& failure) {
        return fail(admin::statusOf(failure.status), failure.what(), error);
    } catch (const std::bad_alloc&) {
        return fail(Status::Full, "there is not enough memory", error);
    } catch (const std::filesystem::filesystem_error& failure) {
        return fail(Status::LocalFile, failure.what(), error);
    } catch (const std::exception& failure) {
        return fail(Status::Other, failure.what(), error);
    }
}

} // namespace

int main(int argumentCount, char** arguments) {
    // A limit on the size of files is to be a failure like a full disk.
    std::signal(SIGXFSZ, SIG_IGN);
    CLI::App program("Sets up and looks after a store: the tickets, users and files of a server.",
                     "tintgate-store");
    admin::Invocation invocation;
    program.fallthrough();
    program.require_subcommand(1);
    program
        .add_option("-s,--store", invocation.address,
                    "Folder of the store, a path with a slash, or connection service of its "
                    "PostgreSQL server")
        ->envname("TINTGATE_STORE");
    program.add_flag("--json", invocation.json, "Lists and values as JSON, for scripts");
    const admin::Command commands(&program);
    admin::addStoreCommands(commands, invocation);
    admin::addUserCommands(commands, invocation);
    admin::addTicketCommands(commands, invocation);
    admin::addKeyCommands(commands, invocation);
    admin::addFileCommands(commands, invocation);
    admin::addJobCommands(commands, invocation);
    admin::addJdfCommands(commands, invocation);
    admin::addCopyCommand(commands, invocation);
    admin::addBackupCommands(commands, invocation);
    admin::addArchiveCommand(commands, invocation);
    admin::addDiagnoseCommand(commands, invocation);
    admin::addGrantCommand(commands, invocation);
    admin::addLogCommand(commands, invocation);
    program.footer(std::string(footer) + tintgateStoreStatusHelp);
    unmarkOptions(program);
    auto words = markedArguments(argumentCount, arguments);
    std::reverse(words.begin(), words.end()); // As CLI11 wants them.
    try {
        program.parse(std::move(words));
    } catch (const CLI::ParseError& failure) {
        return program.exit(failure) == 0 ? end(Status::Done) : end(Status::BadCommand);
    }
    const std::string command = admin::loggedCommand(program);
    std::string error;
    const int status = run(invocation, error);
    admin::logCommand(invocation.address, command, error);
    return status;
}
