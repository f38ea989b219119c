// Reports for people who have files: pages, terminal summaries, patches as CSV, verdicts for
// scripts, and what exit codes mean.
#include <cstdio>
#include <exception>
#include <iostream>
#include <new>
#include <optional>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

#include "companions/report/Page.h"
#include "companions/report/PageFile.h"
#include "companions/tintgate-report/Explain.h"
#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Files.h"
#include "companions/tintgate-report/PatchesCsv.h"
#include "companions/tintgate-report/SummaryText.h"
#include "companions/tintgate-store/Bytes.h"

namespace {

using reporting::Failure;
using reporting::Status;

constexpr const char* footer = R"(
Exit status:
   0  done; with --verdict: passed
   1  with --verdict: failed
   2  with --verdict: incomplete, or the result is missing or unreadable
   3  a result or meta file is missing or can't be read
   4  a result or meta file is broken
   5  the output could not be written
   9  there is no such exit code
  64  the command line is not understood
  70  out of memory)";

struct Options {
    std::vector<std::string> results;
    std::string output;
    std::string meta;
    bool text = false;
    bool csv = false;
    bool verdict = false;
    std::optional<int> code;
};

void say(const std::string& words) {
    std::fprintf(stderr, "tintgate-report: %s\n", admin::printable(words).c_str());
}

int fail(Status status, const std::string& words) {
    say(words);
    return static_cast<int>(status);
}

int verdictOf(const Options& options) {
    try {
        std::string note;
        const auto loaded = reporting::loadResult(options.results[0], options.meta, note);
        switch (loaded.result.verdict) {
        case report::Verdict::Passed:
            return static_cast<int>(Status::Done);
        case report::Verdict::Failed:
            return static_cast<int>(Status::Failed);
        case report::Verdict::Incomplete:
            break;
        }
    } catch (const std::exception&) {
    }
    return static_cast<int>(Status::Incomplete);
}

/// The page beside its result, under a name of its own; its path is printed. That of a job is the
/// very one that the viewer makes.
void keepPage(const reporting::LoadedResult& loaded, const std::string& page) {
    std::string problem;
    const std::string stem = loaded.meta ? report::pageStem(*loaded.meta) : loaded.stem();
    const std::string path = report::keepPage(loaded.folder(), stem, page, problem);
    if (path.empty())
        throw Failure(Status::NotWritten,
                      "can't write a page in " + loaded.folder() + ": " + problem);
    reporting::writeOutput("-", path + '\n');
}

void reportOne(const Options& options) {
    std::string note;
    const auto loaded = reporting::loadResult(options.results[0], options.meta, note);
    if (!note.empty())
        say(note);
    const std::string output = options.output.empty() ? "-" : options.output;
    if (options.csv)
        return reporting::writeOutput(output, reporting::patchesCsv(loaded.result));
    if (options.text) {
        const reporting::Painter paint(output == "-" && reporting::terminalTakesColours());
        return reporting::writeOutput(
            output, reporting::summaryText(loaded.result, loaded.metaOrNull(), paint));
    }
    const std::string page = report::pageOf(loaded.result, loaded.metaOrNull());
    if (options.output.empty())
        return keepPage(loaded, page);
    reporting::writeOutput(output, page);
}

int run(const Options& options) {
    if (options.verdict)
        return verdictOf(options);
    try {
        if (options.code)
            reporting::writeOutput("-", reporting::explanationOf(*options.code));
        else
            reportOne(options);
        return static_cast<int>(Status::Done);
    } catch (const Failure& failure) {
        return fail(failure.status, failure.what());
    } catch (const std::bad_alloc&) {
        return fail(Status::OutOfMemory, "out of memory");
    }
}

} // namespace

int main(int argumentCount, char** arguments) {
    CLI::App program("Shows the results of colour verifications to people.", "tintgate-report");
    Options options;
    program.add_option("RESULT", options.results, "Result files (\"-\" is standard input)");
    program.add_option("-o,--output", options.output, "Where to write; \"-\" is standard output");
    program.add_option("--meta", options.meta,
                       "What is known of the result's job (\"meta.json\" beside an \"output.json\" "
                       "is found without this)");
    auto* text = program.add_flag("--text", options.text, "A summary for a terminal");
    auto* csv = program.add_flag("--csv", options.csv, "The patches as CSV")->excludes(text);
    program.add_flag("--verdict", options.verdict, "Print nothing; the exit status tells")
        ->excludes(text)
        ->excludes(csv);
    program.add_option("--explain", options.code, "What an exit code of Tintgate means");
    program.footer(footer);
    try {
        program.parse(argumentCount, arguments);
        if (options.code.has_value() == !options.results.empty())
            throw CLI::RequiredError("One result file, or --explain,");
    } catch (const CLI::ParseError& failure) {
        return program.exit(failure) == 0 ? 0 : static_cast<int>(Status::BadCommand);
    }
    return run(options);
}
