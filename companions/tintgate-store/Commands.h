// SPDX-License-Identifier: Apache-2.0
// The commands of tintgate-store. Each group has its own source file.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "companions/tintgate-store/CommandLine.h"
#include "store/StoreEngine.h"

namespace admin {

/// The options that precede a command, and the action of the command.
struct Invocation {
    std::string address;
    bool json = false;
    std::function<void()> action;

    /// Opens the store. Throws Failure (BadCommand) if none is named.
    std::unique_ptr<store::StoreEngine> open() const;

    /// The address as given. Same failure.
    const std::string& givenAddress() const;
};

/// Completes a typed address to the form that clients use. As in a shell, a path with a slash is a
/// folder; anything else is a connection service.
std::string completeAddress(const std::string& typed);

void addStoreCommands(Command program, Invocation& invocation);  ///< make, upgrade, info
void addUserCommands(Command program, Invocation& invocation);   ///< user ...
void addTicketCommands(Command program, Invocation& invocation); ///< ticket ..., import, export
void addKeyCommands(Command program, Invocation& invocation);    ///< key ...
void addFileCommands(Command program, Invocation& invocation);   ///< file ...
void addJobCommands(Command program, Invocation& invocation);    ///< jobs, reset
void addArchiveCommand(Command program, Invocation& invocation); ///< archive
void addBackupCommands(Command program, Invocation& invocation); ///< backup, restore
void addJdfCommands(Command program, Invocation& invocation);    ///< jdf ...
void addCopyCommand(Command program, Invocation& invocation);    ///< copy

void addGrantCommand(Command program, Invocation& invocation); ///< grant
void addLogCommand(Command program, Invocation& invocation);   ///< log

/// diagnose
void addDiagnoseCommand(Command program, Invocation& invocation);

/// Adds a command with its own options; `run` is called with their values.
template<class Options>
Command addCommand(Command group, Invocation& invocation, const std::string& name,
                   const std::string& text, std::shared_ptr<Options> options,
                   std::function<void(const Options&)> run) {
    return group.command(
        name, text, [&invocation, options, run] { invocation.action = [=] { run(*options); }; });
}

/// Shows a progress line on standard error for waiting people: only on a terminal, and at most ten
/// times a second. Removes the line when destroyed.
class Progress {
  public:
    Progress(std::size_t total, std::string what);
    /// Where the total is not known yet.
    explicit Progress(std::string what) : Progress(0, std::move(what)) {}
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    void done(std::size_t count) { done(count, m_total); }
    void done(std::size_t count, std::size_t total);

  private:
    const std::size_t m_total;
    const std::string m_what;
    const bool m_shown;
    std::int64_t m_last = 0;
};

} // namespace admin
