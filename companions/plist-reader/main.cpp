// SPDX-License-Identifier: Apache-2.0
// Prints one value of a property list. The tool looks for this program at usr/libexec/Plistbuddy
// below the system root.
#include <cstdio>
#include <string>

#include <CLI/CLI.hpp>

#include "CompanionStatuses.h"
#include "companions/plist-reader/EntryWay.h"
#include "platform/PropertyList.h"

namespace {

using Status = PlistbuddyStatus; ///< Listed in docs/companion-statuses.csv.

constexpr const char* footer = R"(
Examples:
  -c "Print :installed_path" apps.plist
  -c "Print :'Nerova Hue Workbench':library_path" packages.plist
  -c "Print :Folders:0" list.plist         first element of an array

)";

int end(Status status) {
    return static_cast<int>(status);
}

// A program reads the output, so messages are printed only on request.
int fail(Status status, bool verbose, const std::string& words) {
    if (verbose) {
        std::fprintf(stderr, "%s\n", words.c_str());
    }
    return end(status);
}

std::string namesAt(const platform::PropertyList& list, const platform::PropertyList::Way& way) {
    std::string text;
    for (const std::string& name : list.names(way).value_or(std::vector<std::string>())) {
        text += "\n  " + name;
    }
    return text;
}

} // namespace

int main(int argumentCount, char** arguments) {
    CLI::App app("Prints one value of a property list (XML or binary).");
    std::string command;
    std::string path;
    bool verbose = false;
    app.add_option("-c", command, "What to print: the word Print and the path of the value")
        ->required()
        ->type_name("COMMAND");
    app.add_option("file", path, "The property list")->required();
    app.add_flag("-v,--verbose", verbose, "Report errors on standard error");
    app.footer(std::string(footer) + plistbuddyStatusHelp);
    try {
        app.parse(argumentCount, arguments);
    } catch (const CLI::ParseError& failure) {
        return app.exit(failure) == 0 ? end(Status::Done) : end(Status::BadCommand);
    }

    const auto way = parsePrintCommand(command);
    if (!way) {
        return fail(Status::BadCommand, verbose, "Invalid command: " + command);
    }
    const auto list = platform::PropertyList::read(path);
    if (!list) {
        return fail(Status::NoPropertyList, verbose, "Not a property list: " + path);
    }
    const auto value = list->text(*way);
    if (!value) {
        return list->exists(*way) ? fail(Status::NoSuchValue, verbose,
                                         "Not a single value: " + command + namesAt(*list, *way))
                                  : fail(Status::NoSuchValue, verbose, "No such value: " + command);
    }
    std::fwrite(value->data(), 1, value->size(), stdout);
    std::fputc('\n', stdout);
    return std::fflush(stdout) == 0 && std::ferror(stdout) == 0
               ? end(Status::Done)
               : fail(Status::NotWritten, verbose, "Not written");
}
