// SPDX-License-Identifier: Apache-2.0
// Statements found in practice:
//
//     LGOMCCHANNEL05 "InkName = 'Orange' InkSample = '[0.4 0.3 0.1]'"
//     COLOR_REP "CMYKOGV"          or, in texts of ArgyllCMS, "CMYKOG_XYZ"
#include "colour/CgatsInks.h"

#include <algorithm>
#include <charconv>
#include <iterator>

#include "colour/CgatsLines.h"

namespace colour::cgats {
namespace {

constexpr std::string_view channelKeyword = "LGOMCCHANNEL";
constexpr std::string_view processInks[] = {"Cyan", "Magenta", "Yellow", "Black"};
constexpr int mostChannels = 64;

constexpr struct {
    char letter;
    const char* name;
} letterNames[] = {{'O', "Orange"},        {'G', "Green"},        {'V', "Violet"},
                   {'B', "Blue"},          {'R', "Red"},          {'c', "Light cyan"},
                   {'m', "Light magenta"}, {'y', "Light yellow"}, {'k', "Light black"}};

/// The quoted text after InkName.
std::string inkNameIn(std::string_view value) {
    const std::size_t key = value.find("InkName");
    const std::size_t open = value.find('\'', key == value.npos ? value.size() : key);
    const std::size_t close = open == value.npos ? open : value.find('\'', open + 1);
    return close == value.npos ? "" : std::string(value.substr(open + 1, close - open - 1));
}

} // namespace

void InkNames::see(std::string_view keyword, std::string_view value) {
    if (keyword.starts_with(channelKeyword)) {
        const std::string_view digits = keyword.substr(channelKeyword.size());
        int number = 0;
        const auto [end, error] =
            std::from_chars(digits.data(), digits.data() + digits.size(), number);
        std::string name = inkNameIn(value);
        if (error == std::errc() && number > 0 && number <= mostChannels && !name.empty()) {
            m_channels.try_emplace(number, std::move(name));
        }
    } else if (keyword == "COLOR_REP" && m_letters.empty() && value.starts_with("CMYK")) {
        const std::string_view letters = value.substr(4, value.find('_') - 4);
        for (const char letter : letters) {
            const auto found =
                std::find_if(std::begin(letterNames), std::end(letterNames),
                             [&](const auto& known) { return known.letter == letter; });
            m_letters.emplace_back(found == std::end(letterNames) ? "" : found->name);
        }
    }
}

void InkNames::name(DataSet& set) const {
    constexpr std::size_t process = std::size(processInks);
    const std::size_t count = set.channels.size();
    std::vector<std::string> names = m_letters;
    bool named = m_channels.size() == count;
    for (std::size_t i = 0; named && i < count; ++i) {
        const auto found = m_channels.find(static_cast<int>(i) + 1);
        named =
            found != m_channels.end() && (i >= process || sameWord(found->second, processInks[i]));
    }
    if (named) {
        names.clear();
        for (std::size_t i = process; i < count; ++i) {
            names.push_back(m_channels.at(static_cast<int>(i) + 1));
        }
    }
    const bool complete =
        count > process && names.size() == count - process &&
        std::none_of(names.begin(), names.end(), [](const auto& name) { return name.empty(); });
    for (std::size_t i = process; complete && i < count; ++i) {
        set.channels[i] = "SPOT_" + names[i - process];
    }
}

} // namespace colour::cgats
