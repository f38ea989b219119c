// SPDX-License-Identifier: Apache-2.0
#include "companions/plist-reader/EntryWay.h"

#include <algorithm>
#include <string_view>

namespace {

constexpr std::string_view verb = "Print";

void skipBlanks(std::string_view& text) {
    text.remove_prefix(std::min(text.find_first_not_of(" \t"), text.size()));
}

// Takes a name from the front of the text, up to a colon outside quotes.
std::optional<std::string> takeName(std::string_view& text) {
    char end = ':';
    if (!text.empty() && (text.front() == '"' || text.front() == '\'')) {
        end = text.front();
        text.remove_prefix(1);
    }
    std::string name;
    while (!text.empty() && text.front() != end) {
        if (text.front() == '\\' && text.size() > 1) {
            text.remove_prefix(1);
        }
        name += text.front();
        text.remove_prefix(1);
    }
    if (end != ':') {
        const bool closed = !text.empty();
        text.remove_prefix(closed ? 1 : 0);
        if (!closed || (!text.empty() && text.front() != ':')) {
            return std::nullopt;
        }
    }
    return name;
}

} // namespace

std::optional<std::vector<std::string>> parsePrintCommand(const std::string& command) {
    std::string_view rest = command;
    skipBlanks(rest);
    if (rest.substr(0, verb.size()) != verb) {
        return std::nullopt;
    }
    rest.remove_prefix(verb.size());
    if (!rest.empty() && rest.front() != ' ' && rest.front() != '\t') {
        return std::nullopt;
    }
    skipBlanks(rest);

    std::vector<std::string> way;
    if (!rest.empty() && rest.front() == ':') {
        rest.remove_prefix(1);
    }
    while (!rest.empty()) {
        std::optional<std::string> name = takeName(rest);
        if (!name) {
            return std::nullopt;
        }
        way.push_back(std::move(*name));
        if (!rest.empty()) {
            rest.remove_prefix(1);
        }
    }
    return way;
}
