// SPDX-License-Identifier: Apache-2.0
// Commands and their options, as the command line knows them. The parser behind them is a library
// of headers that takes longer to compile than any command, so only CommandLine.cpp and main see
// it.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
} // namespace CLI

namespace admin {

/// An option, or an argument known by its place. A handle: copies are the same option.
class Option {
  public:
    explicit Option(CLI::Option* option) : m_option(option) {}
    void required();
    /// Refuses the command line where both stand.
    void excludes(const std::string& name);
    /// The value that is there already is the default, and shown by --help.
    void showDefault();

  private:
    CLI::Option* m_option;
};

/// A command, or the program itself. A handle: copies are the same command. Values that options
/// fill must live until the command line has been read and its command run.
class Command {
  public:
    explicit Command(CLI::App* command) : m_command(command) {}

    /// A command that needs one of its own below it.
    Command group(const std::string& name, const std::string& text);
    /// A command below this one; `chosen` is called when it stands on the command line.
    Command command(const std::string& name, const std::string& text, std::function<void()> chosen);

    /// Names without a dash are arguments known by their place.
    Option option(const std::string& names, std::string& value, const std::string& text);
    Option option(const std::string& names, std::vector<std::string>& values,
                  const std::string& text);
    Option flag(const std::string& names, bool& value, const std::string& text);

    /// What --help says behind all else.
    void footer(const std::string& text);

  private:
    CLI::App* m_command;
};

} // namespace admin
