// SPDX-License-Identifier: Apache-2.0
// Commands and their options on the command line. The parser is a header-only library that takes
// longer to compile than any command, so only CommandLine.cpp and main include it.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
} // namespace CLI

namespace admin {

/// An option or a positional argument. A handle: copies refer to the same option.
class Option {
  public:
    explicit Option(CLI::Option* option) : m_option(option) {}
    void required();
    /// Rejects command lines with both options.
    void excludes(const std::string& name);
    /// Makes the current value the default, which --help shows.
    void showDefault();

  private:
    CLI::Option* m_option;
};

/// A command, or the program itself. A handle: copies refer to the same command. Values set by
/// options must live until the command line has been parsed and its command has run.
class Command {
  public:
    explicit Command(CLI::App* command) : m_command(command) {}

    /// A command that requires a subcommand.
    Command group(const std::string& name, const std::string& text);
    /// Adds a subcommand; `chosen` is called if it is on the command line.
    Command command(const std::string& name, const std::string& text, std::function<void()> chosen);

    /// Names without a dash are positional arguments.
    Option option(const std::string& names, std::string& value, const std::string& text);
    Option option(const std::string& names, std::vector<std::string>& values,
                  const std::string& text);
    Option flag(const std::string& names, bool& value, const std::string& text);

    /// Text at the end of --help.
    void footer(const std::string& text);

  private:
    CLI::App* m_command;
};

} // namespace admin
