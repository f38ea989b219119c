// SPDX-License-Identifier: Apache-2.0
#include "analysis/Instruments.h"

#include <charconv>
#include <cstdlib>
#include <optional>
#include <string_view>

#include <dlfcn.h>

#include "ExitCodes.h"
#include "analysis/Status.h"
#include "base/Trim.h"
#include "colour/CgatsText.h"
#include "colour/ColourFile.h"

namespace analysis {
namespace {

constexpr std::size_t largestNamesFile = 1 << 20;
constexpr std::size_t largestDefinition = 64 << 20;

/// Parses a text that is a number and nothing else.
std::optional<unsigned int> numberOf(std::string_view text) {
    text = base::trimmed(text);
    unsigned int number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size()) {
        return std::nullopt;
    }
    return number;
}

/// The folder of this library, with a slash at the end.
std::string ownFolder() {
    Dl_info self{};
    if (!::dladdr(reinterpret_cast<const void*>(&instrumentOfDefinition), &self) ||
        !self.dli_fname) {
        return {};
    }
    const std::string path = self.dli_fname;
    return path.substr(0, path.rfind('/') + 1);
}

std::string namesFile(const std::string& presets) {
    const char* const named = std::getenv("TINTGATE_INSTRUMENTS");
    return named != nullptr ? named : presets + "/instruments.txt";
}

/// The name of `id` in the lines of a names file. Empty if there is none.
std::string_view nameIn(std::string_view lines, unsigned int id) {
    constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF"; // some editors put it before UTF-8
    if (lines.starts_with(byteOrderMark)) {
        lines.remove_prefix(byteOrderMark.size());
    }
    while (!lines.empty()) {
        const std::size_t end = lines.find('\n');
        const std::string_view line = base::trimmed(lines.substr(0, end));
        lines.remove_prefix(end == std::string_view::npos ? lines.size() : end + 1);
        const std::size_t equals = line.find('=');
        if (equals != std::string_view::npos && numberOf(line.substr(0, equals)) == id) {
            return base::trimmed(line.substr(equals + 1));
        }
    }
    return {};
}

} // namespace

std::string instrumentName(unsigned int id) {
    return instrumentName(id, ownFolder() + TINTGATE_PRESETS_FROM_LIBRARY);
}

std::string instrumentName(unsigned int id, const std::string& presets) {
    std::string lines;
    if (colour::readWholeFile(namesFile(presets), largestNamesFile, lines) ==
        colour::Failure::None) {
        if (const std::string_view name = nameIn(lines, id); !name.empty()) {
            return std::string(name);
        }
    }
    return "Instrument " + std::to_string(id);
}

int instrumentOfDefinition(const std::string& path, std::string& name) {
    std::string bytes;
    if (const int status = statusOf(colour::readWholeFile(path, largestDefinition, bytes))) {
        return status;
    }
    const std::optional<std::string> device = colour::cgatsKeyword(bytes, "DEVICE");
    if (!device) {
        return exitInputDamaged;
    }
    const std::optional<unsigned int> id = numberOf(*device);
    if (!id) {
        return exitValueNotNumeric;
    }
    name = instrumentName(*id);
    return exitDone;
}

} // namespace analysis
