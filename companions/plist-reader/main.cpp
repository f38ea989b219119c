// Prints one value of a property list. Below the system root this program stands at
// usr/libexec/Plistbuddy, where the tool looks for it.
#include <cstdio>
#include <string>

#include <CLI/CLI.hpp>

#include "companions/plist-reader/EntryWay.h"
#include "platform/PropertyList.h"

namespace {

enum : int { found = 0, noSuchValue = 1, noPropertyList = 2, noCommand = 64, notWritten = 74 };

constexpr const char* footer = R"(
Examples:
  -c "Print :installed_path" apps.plist
  -c "Print :'Nerova Hue Workbench':library_path" packages.plist
  -c "Print :Folders:0" list.plist         first element of an array

Exit codes:
   0  the value is on standard output, with a line feed behind it
   1  there is no such value, or it is a dictionary, an array or binary data
   2  the file can't be read or is no property list
  64  the command is not understood
  74  the value could not be written)";

// A program reads what comes from here, so there are no words but on request.
int fail(int code, bool verbose, const std::string& words) {
    if (verbose) {
        std::fprintf(stderr, "%s\n", words.c_str());
    }
    return code;
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
    app.add_option("-c", command, "What to print: the word Print and the way to the value")
        ->required()
        ->type_name("COMMAND");
    app.add_option("file", path, "The property list")->required();
    app.add_flag("-v,--verbose", verbose, "Say on standard error what is wrong");
    app.footer(footer);
    try {
        app.parse(argumentCount, arguments);
    } catch (const CLI::ParseError& failure) {
        return app.exit(failure) == 0 ? found : noCommand;
    }

    const auto way = parsePrintCommand(command);
    if (!way) {
        return fail(noCommand, verbose, "Not understood: " + command);
    }
    const auto list = platform::PropertyList::read(path);
    if (!list) {
        return fail(noPropertyList, verbose, "No property list: " + path);
    }
    const auto value = list->text(*way);
    if (!value) {
        return list->exists(*way) ? fail(noSuchValue, verbose,
                                         "Not a single value: " + command + namesAt(*list, *way))
                                  : fail(noSuchValue, verbose, "Not there: " + command);
    }
    std::fwrite(value->data(), 1, value->size(), stdout);
    std::fputc('\n', stdout);
    return std::fflush(stdout) == 0 && std::ferror(stdout) == 0
               ? found
               : fail(notWritten, verbose, "Not written");
}
