// SPDX-License-Identifier: Apache-2.0
// The options file: a line with a name, a line with its value, and so on. Nothing is escaped; only
// the value of -pwd is quoted.
//
//     -apnm
//     Nerova Verify
//     -pwd
//     ""
//     -m
//     measure
//     -o
//     /tmp/Tintgate/JobID_7/Measured sample.txt
//     -patch
//     /tmp/Tintgate/JobID_7/NMPatchSetDefinition.it8
#include "companions/measure-tool/Options.h"

#include <map>
#include <string_view>

#include "colour/ColourFile.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

constexpr std::size_t largestFile = 1 << 20;

std::string takeLine(std::string_view& rest) {
    const std::size_t end = rest.find('\n');
    std::string line(rest.substr(0, end));
    rest.remove_prefix(end == rest.npos ? rest.size() : end + 1);
    return line;
}

std::map<std::string, std::string> pairsOf(const std::string& path) {
    const auto refuse = [&](const std::string& problem) {
        throw Failure(Status::BadOptions, path + " has " + problem);
    };
    std::string bytes;
    expectUsable(colour::readWholeFile(path, largestFile, bytes), Status::BadOptions, path);
    std::map<std::string, std::string> pairs;
    for (std::string_view rest = bytes; !rest.empty();) {
        const std::string name = takeLine(rest);
        // A value with a line break shifts all following lines.
        if (name.size() < 2 || name.front() != '-') {
            refuse("\"" + name + "\" as an option name");
        }
        if (rest.empty()) {
            refuse("no value for " + name);
        }
        if (!pairs.emplace(name, takeLine(rest)).second) {
            refuse(name + " twice");
        }
    }
    return pairs;
}

} // namespace

Options readOptions(const std::string& path) {
    const std::map<std::string, std::string> pairs = pairsOf(path);
    const auto valueOf = [&](const char* name) {
        const auto found = pairs.find(name);
        return found == pairs.end() ? std::string() : found->second;
    };
    const auto needed = [&](const char* name) {
        std::string value = valueOf(name);
        if (value.empty()) {
            throw Failure(Status::BadOptions, path + " has no " + name);
        }
        return value;
    };
    if (needed("-m") != "measure") {
        throw Failure(Status::BadOptions, path + " requests something other than measuring");
    }
    return {needed("-patch"), needed("-o"), valueOf("-patchname"), valueOf("-i")};
}

} // namespace measuretool
