// SPDX-License-Identifier: Apache-2.0
// The settings file: UTF-8 lines of a name and a value.
//
//     # Labels for the printer at the viewing booth
//     label = pdf
//     label-size = 62x100mm
//     certificate = no
//     when = passed
//     printer = Proofer 2
#include "companions/viewer/LabelSettings.h"

#include <set>

#include "colour/ColourFile.h"
#include "platform/SystemRoot.h"

namespace viewer {
namespace {

constexpr std::size_t largestFile = 1 << 16;

/// Some editors put it before UTF-8.
constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";

std::string_view trimmed(std::string_view text) {
    constexpr const char* blanks = " \t\r";
    const std::size_t first = text.find_first_not_of(blanks);
    return first == text.npos ? std::string_view()
                              : text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

struct Entry {
    const char* name;
    const char* expected;
    bool (*read)(const std::string&, LabelSettings&);
};

/// Passes a value on as an option. The program that gets the option checks it.
template<const char* const& option>
bool passOn(const std::string& text, LabelSettings& settings) {
    settings.options.push_back(std::string(option) + "=" + text);
    return !text.empty();
}

constexpr const char* sizeOption = "--label-size";
constexpr const char* dpiOption = "--label-dpi";
constexpr const char* sheetOption = "--sheet";

constexpr Entry entries[] = {
    {"label", "pdf, svg, png or no",
     [](const std::string& text, LabelSettings& settings) {
         settings.label = text == "no" ? "" : text;
         return text == "pdf" || text == "svg" || text == "png" || text == "no";
     }},
    {"certificate", "yes or no",
     [](const std::string& text, LabelSettings& settings) {
         settings.certificate = text == "yes";
         return text == "yes" || text == "no";
     }},
    {"when", "always or passed",
     [](const std::string& text, LabelSettings& settings) {
         settings.onlyPassed = text == "passed";
         return text == "passed" || text == "always";
     }},
    {"program", "a program",
     [](const std::string& text, LabelSettings& settings) {
         settings.program = text;
         return !text.empty();
     }},
    {"label-size", "a size", passOn<sizeOption>},
    {"label-dpi", "a number", passOn<dpiOption>},
    {"sheet", "A4 or Letter", passOn<sheetOption>},
};

/// Names of fields whose values are printed on the label. The program that makes labels has the
/// same list; it is repeated here because this program must not load that program's libraries.
constexpr const char* fields[] = {"calibrated", "colourants", "condition", "instrument",
                                  "intent",     "operator",   "paper",     "printer",
                                  "profile",    "software",   "workflow"};

/// Returns what is wrong with a line, or an empty text.
std::string readLine(std::string_view line, LabelSettings& settings, std::set<std::string>& seen) {
    line = trimmed(line);
    if (line.empty() || line.front() == '#') {
        return {};
    }
    const std::size_t equals = line.find('=');
    if (equals == line.npos) {
        return "has no =";
    }
    const std::string name(trimmed(line.substr(0, equals)));
    const std::string value(trimmed(line.substr(equals + 1)));
    if (!seen.insert(name).second) {
        return "has " + name + " a second time";
    }
    for (const Entry& entry : entries) {
        if (name == entry.name) {
            return entry.read(value, settings)
                       ? std::string()
                       : "expects " + std::string(entry.expected) + " for " + name;
        }
    }
    for (const char* const field : fields) {
        if (name == field) {
            settings.options.push_back("--label-field=" + name + "=" + value);
            return {};
        }
    }
    return "names \"" + name + "\", which is not a setting";
}

} // namespace

std::string labelSettingsPath() {
    return platform::underRoot("/etc/tintgate/viewer.conf");
}

std::optional<LabelSettings> readLabelSettings(const std::string& path, std::string& problem) {
    std::string bytes;
    const colour::Failure failure = colour::readWholeFile(path, largestFile, bytes);
    if (failure == colour::Failure::Missing) {
        return LabelSettings();
    }
    if (failure != colour::Failure::None || bytes.find('\0') != bytes.npos) {
        problem = path + " can't be read as text";
        return std::nullopt;
    }
    LabelSettings settings;
    std::set<std::string> seen;
    std::string_view rest = bytes;
    if (rest.starts_with(byteOrderMark)) {
        rest.remove_prefix(byteOrderMark.size());
    }
    for (int number = 1; !rest.empty(); ++number) {
        const std::size_t end = rest.find('\n');
        if (const std::string wrong = readLine(rest.substr(0, end), settings, seen);
            !wrong.empty()) {
            problem = path + " line " + std::to_string(number) + " " + wrong;
            return std::nullopt;
        }
        rest.remove_prefix(end == rest.npos ? rest.size() : end + 1);
    }
    return settings;
}

} // namespace viewer
