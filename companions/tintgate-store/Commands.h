// The commands of tintgate-store. Each group of them is one source file.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

#include "comgui/StoreEngine.h"

namespace admin {

/// What the options in front of a command say, and what the command then is to do.
struct Invocation {
    std::string address;
    bool json = false;
    std::function<void()> action;

    /// The store. Throws Failure (BadCommand) where none is named.
    std::unique_ptr<store::StoreEngine> open() const;

    /// The address as it was given; the same failure.
    const std::string& givenAddress() const;
};

/// An address as it was typed, as clients give it. People may name a folder as a shell does, by a
/// path with a slash; what has none is a connection service.
std::string completeAddress(const std::string& typed);

void addStoreCommands(CLI::App& program, Invocation& invocation);  ///< make, upgrade, info
void addUserCommands(CLI::App& program, Invocation& invocation);   ///< user ...
void addTicketCommands(CLI::App& program, Invocation& invocation); ///< ticket ..., import, export
void addKeyCommands(CLI::App& program, Invocation& invocation);    ///< key ...
void addFileCommands(CLI::App& program, Invocation& invocation);   ///< file ...
void addJobCommands(CLI::App& program, Invocation& invocation);    ///< jobs, reset
void addJdfCommands(CLI::App& program, Invocation& invocation);    ///< jdf ...
void addCopyCommand(CLI::App& program, Invocation& invocation);    ///< copy

/// A command that needs one of its own below it.
CLI::App& addGroup(CLI::App& program, const std::string& name, const std::string& text);

/// A command with its options' values, which it is given when it is run.
template<class Options>
CLI::App& addCommand(CLI::App& group, Invocation& invocation, const std::string& name,
                     const std::string& text, std::shared_ptr<Options> options,
                     std::function<void(const Options&)> run) {
    auto* command = group.add_subcommand(name, text);
    command->callback([&invocation, options, run] { invocation.action = [=] { run(*options); }; });
    return *command;
}

/// A line on standard error for whoever waits: only on a terminal, and at most ten times a second.
/// It is gone when this goes.
class Progress {
  public:
    Progress(std::size_t total, std::string what);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    void done(std::size_t count);

  private:
    const std::size_t m_total;
    const std::string m_what;
    const bool m_shown;
    std::int64_t m_last = 0;
};

} // namespace admin
