// SPDX-License-Identifier: Apache-2.0
// The settings file: UTF-8 text, one name and value per line.
//
//     # A printer that drifts towards yellow
//     instrument = virtual
//     profile = /usr/share/color/icc/ghostscript/default_cmyk.icc
//     error = 0.4
//     bias = 0 0 1.5
#include "companions/measure-tool/Settings.h"

#include <charconv>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string_view>
#include <utility>

#include "base/Trim.h"
#include "colour/ColourFile.h"
#include "companions/measure-tool/Failure.h"
#include "platform/SystemRoot.h"

namespace measuretool {
namespace {

constexpr std::size_t largestFile = 1 << 20;
constexpr double largestError = 50; ///< In CIELAB units, for both error and bias.
constexpr int longestDelay = 60'000;
constexpr int longestWait = 86'400;
constexpr std::size_t lastPatch = 10'000'000;

/// Some editors write it at the start of UTF-8 files.
constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";

template<class Number>
bool readNumber(std::string_view text, Number least, Number most, Number& number) {
    Number value{};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    // This order of comparisons also refuses NaN.
    if (error != std::errc() || end != text.data() + text.size() ||
        !(value >= least && value <= most)) {
        return false;
    }
    number = value;
    return true;
}

template<class Unit>
bool readTime(std::string_view text, int most, Unit& time) {
    int count = 0;
    if (!readNumber(text, 0, most, count)) {
        return false;
    }
    time = Unit(count);
    return true;
}

bool readLab(std::string_view text, colour::Lab& lab) {
    for (double* value : {&lab.L, &lab.a, &lab.b}) {
        text = base::trimmed(text);
        const std::string_view number = text.substr(0, text.find_first_of(" \t"));
        if (!readNumber(number, -largestError, largestError, *value)) {
            return false;
        }
        text.remove_prefix(number.size());
    }
    return base::trimmed(text).empty();
}

template<class Value, std::size_t N>
bool choose(std::string_view text, const std::pair<const char*, Value> (&choices)[N],
            Value& value) {
    for (const auto& [word, chosen] : choices) {
        if (text == word) {
            value = chosen;
            return true;
        }
    }
    return false;
}

bool readPath(std::string_view text, std::string& path) {
    path = text;
    return !path.empty();
}

struct Entry {
    const char* name;
    const char* expected;
    bool (*read)(std::string_view, Settings&);
};

constexpr std::pair<const char*, Settings::Instrument> instruments[] = {
    {"virtual", Settings::Instrument::Virtual}, {"file", Settings::Instrument::File}};
constexpr std::pair<const char*, bool> proofs[] = {{"patches", false}, {"ids", true}};
constexpr std::pair<const char*, bool> truths[] = {{"yes", true}, {"no", false}};
constexpr std::pair<const char*, Mishap> mishaps[] = {{"none", Mishap::None},
                                                      {"fail", Mishap::Fail},
                                                      {"cancel", Mishap::Cancel},
                                                      {"hang", Mishap::Hang},
                                                      {"crash", Mishap::Crash}};

constexpr Entry entries[] = {
    {"instrument", "virtual or file",
     [](std::string_view text, Settings& s) { return choose(text, instruments, s.instrument); }},
    {"profile", "a path",
     [](std::string_view text, Settings& s) { return readPath(text, s.profile); }},
    {"error", "a number from 0 to 50",
     [](std::string_view text, Settings& s) {
         return readNumber(text, 0.0, largestError, s.error);
     }},
    {"bias", "three numbers from -50 to 50",
     [](std::string_view text, Settings& s) { return readLab(text, s.bias); }},
    {"seed", "a whole number",
     [](std::string_view text, Settings& s) {
         return readNumber(text, std::uint64_t{0}, UINT64_MAX, s.seed);
     }},
    {"spectra", "yes or no",
     [](std::string_view text, Settings& s) { return choose(text, truths, s.spectra); }},
    {"file", "a path", [](std::string_view text, Settings& s) { return readPath(text, s.file); }},
    {"wait", "seconds, up to 86400",
     [](std::string_view text, Settings& s) { return readTime(text, longestWait, s.wait); }},
    {"match", "patches or ids",
     [](std::string_view text, Settings& s) { return choose(text, proofs, s.bareIds); }},
    {"delay", "milliseconds, up to 60000",
     [](std::string_view text, Settings& s) { return readTime(text, longestDelay, s.delay); }},
    {"mishap", "none, fail, cancel, hang or crash",
     [](std::string_view text, Settings& s) { return choose(text, mishaps, s.mishap); }},
    {"mishap-at", "the number of a patch, from 1",
     [](std::string_view text, Settings& s) {
         return readNumber(text, std::size_t{1}, lastPatch, s.mishapAt.emplace());
     }},
};

const Entry* entryOf(std::string_view name) {
    for (const Entry& entry : entries) {
        if (name == entry.name) {
            return &entry;
        }
    }
    return nullptr;
}

/// Describes an error in a line. Empty if there is none.
std::string readLine(std::string_view line, Settings& settings, std::set<const Entry*>& seen) {
    line = base::trimmed(line);
    if (line.empty() || line.front() == '#') {
        return {};
    }
    const std::size_t equals = line.find('=');
    if (equals == line.npos) {
        return "has no =";
    }
    const std::string name(base::trimmed(line.substr(0, equals)));
    const Entry* const entry = entryOf(name);
    if (entry == nullptr) {
        return "names \"" + name + "\", which is not a setting";
    }
    if (!seen.insert(entry).second) {
        return "repeats " + name;
    }
    return entry->read(base::trimmed(line.substr(equals + 1)), settings)
               ? std::string()
               : "requires " + std::string(entry->expected) + " for " + name;
}

void checkComplete(const Settings& settings, const std::string& path) {
    const char* missing = nullptr;
    if (settings.instrument == Settings::Instrument::None) {
        missing = "instrument";
    } else if (settings.instrument == Settings::Instrument::Virtual && settings.profile.empty()) {
        missing = "profile";
    } else if (settings.instrument == Settings::Instrument::File && settings.file.empty()) {
        missing = "file";
    }
    if (missing != nullptr) {
        throw Failure(Status::BadSettings, path + " has no " + missing);
    }
}

std::string valueOf(const char* variable) {
    const char* const value = std::getenv(variable);
    return value == nullptr ? std::string() : std::string(value);
}

/// A relative path is ignored, as the XDG base directory rules require.
std::string configurationFolder() {
    const std::string folder = valueOf("XDG_CONFIG_HOME");
    return folder.starts_with('/') ? folder : valueOf("HOME") + "/.config";
}

} // namespace

std::string settingsPath() {
    if (std::string named = valueOf("TINTGATE_MEASURE"); !named.empty()) {
        return named;
    }
    const std::string places[] = {
        platform::underRoot("/Library/Preferences/NerovaMeasure.conf"),
        configurationFolder() + "/tintgate/measure.conf",
    };
    for (const std::string& place : places) {
        std::error_code ignored;
        if (std::filesystem::exists(place, ignored)) {
            return place;
        }
    }
    throw Failure(Status::BadSettings,
                  "no instrument is selected: there is no TINTGATE_MEASURE, no " + places[0] +
                      " and no " + places[1]);
}

Settings readSettings(const std::string& path) {
    std::string bytes;
    expectUsable(colour::readWholeFile(path, largestFile, bytes), Status::BadSettings, path);
    Settings settings;
    std::set<const Entry*> seen;
    std::string_view rest = bytes;
    if (rest.starts_with(byteOrderMark)) {
        rest.remove_prefix(byteOrderMark.size());
    }
    if (rest.find('\0') != rest.npos) {
        throw Failure(Status::BadSettings, path + " is not UTF-8 text");
    }
    for (int number = 1; !rest.empty(); ++number) {
        const std::size_t end = rest.find('\n');
        if (const std::string problem = readLine(rest.substr(0, end), settings, seen);
            !problem.empty()) {
            throw Failure(Status::BadSettings,
                          path + " line " + std::to_string(number) + " " + problem);
        }
        rest.remove_prefix(end == rest.npos ? rest.size() : end + 1);
    }
    checkComplete(settings, path);
    const std::filesystem::path folder = std::filesystem::path(path).parent_path();
    for (std::string* name : {&settings.profile, &settings.file}) {
        if (!name->empty()) {
            *name = folder / *name; // an absolute path stays unchanged
        }
    }
    return settings;
}

} // namespace measuretool
