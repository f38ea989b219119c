// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/CommandLine.h"

#include <utility>

#include <CLI/CLI.hpp>

namespace admin {

void Option::required() {
    m_option->required();
}

void Option::excludes(const std::string& name) {
    m_option->excludes(name);
}

void Option::showDefault() {
    m_option->capture_default_str();
}

Command Command::group(const std::string& name, const std::string& text) {
    auto* below = m_command->add_subcommand(name, text);
    below->require_subcommand(1);
    return Command(below);
}

Command Command::command(const std::string& name, const std::string& text,
                         std::function<void()> chosen) {
    auto* below = m_command->add_subcommand(name, text);
    below->callback(std::move(chosen));
    return Command(below);
}

Option Command::option(const std::string& names, std::string& value, const std::string& text) {
    return Option(m_command->add_option(names, value, text));
}

Option Command::option(const std::string& names, std::vector<std::string>& values,
                       const std::string& text) {
    return Option(m_command->add_option(names, values, text));
}

Option Command::flag(const std::string& names, bool& value, const std::string& text) {
    return Option(m_command->add_flag(names, value, text));
}

void Command::footer(const std::string& text) {
    m_command->footer(text);
}

} // namespace admin
