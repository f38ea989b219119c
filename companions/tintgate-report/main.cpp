// SPDX-License-Identifier: Apache-2.0
// Reports for people who have result files or a store: pages, trends, terminal summaries, patches
// as CSV, verdicts for scripts, and what exit codes mean.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <new>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include <CLI/CLI.hpp>

#include "companions/tintgate-report/Averaging.h"
#include "companions/tintgate-report/CheckPreset.h"
#include "companions/tintgate-report/Explain.h"
#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Files.h"
#include "companions/tintgate-report/Labels.h"
#include "companions/tintgate-report/PatchesCsv.h"
#include "companions/tintgate-report/SummaryText.h"
#include "companions/tintgate-report/Tidy.h"
#include "companions/tintgate-report/Trend.h"
#include "companions/tintgate-store/Bytes.h"
#include "platform/TemporaryFolder.h"
#include "report/Page.h"
#include "report/PageFile.h"
#include "report/TrendPage.h"

namespace {

namespace fs = std::filesystem;

using report::Failure;
using report::LabelOptions;
using report::Status;

constexpr const char* footer = R"(
Examples:
  tintgate-report result.json                     the page, beside the result
  tintgate-report --text result.json              what matters, in the terminal
  tintgate-report --csv result.json -o patches.csv
  tintgate-report --verdict result.json && echo passed
  tintgate-report results/ -o trend.html          the trend of all results below
  tintgate-report --store /srv/tintgate --since 30d --paper matt -o trend.html
  tintgate-report result.json --label proof.pdf --label-size 62x100mm --pdf sheet.pdf
  zbarimg -q --raw label.png | tintgate-report result.json --match -
  tintgate-report --explain $?                    behind a run of Tintgate
  tintgate-report --check-preset my-preset.xml    what is wrong with a preset, and where
  tintgate-report --tidy 30 --dry-run
  tintgate-report average first.txt second.txt -o mean.txt

A trend compares only results that were aimed at the same colours, and of one printer,
paper, preset, instrument, workflow and strip, with each other, and says which ink
drifts. A printer is known by what the measurement states (PRINTER), or by the folder
of its results with --series folder. Its table of jobs leads to their pages,
which stand in a folder beside it (trend.html has trend-jobs), or where the viewer
has made them. The times are those of the jobs, else those that the measurements
tell, else those of the files.

)";

struct Options {
    std::vector<std::string> results;
    std::string output;
    std::string meta;
    bool text = false;
    bool csv = false;
    bool verdict = false;
    bool trend = false;
    bool noPages = false;
    std::vector<std::string> stores;
    std::string since;
    std::string until;
    std::string series;
    std::string languageName;
    std::optional<languages::Language> language; ///< As asked for.
    report::Filter filter;
    std::optional<int> code;
    std::optional<int> tidyDays;
    std::string preset;
    LabelOptions labels;
    bool dryRun = false;
    bool averages = false;
    report::AverageOptions average;

    bool fromStore() const { return !stores.empty(); }
    /// For all that is not about one job alone.
    languages::Texts texts() const {
        return languages::Texts(language ? *language : languages::languageOfUser());
    }
};

void complain(const std::string& words) {
    std::fprintf(stderr, "tintgate-report: %s\n", admin::printable(words).c_str());
}

int fail(Status status, const std::string& words) {
    complain(words);
    return static_cast<int>(status);
}

int verdictOf(const Options& options) {
    try {
        std::string note;
        const auto loaded = report::loadResult(options.results[0], options.meta, note);
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
void keepPage(const report::LoadedResult& loaded, const std::string& page) {
    std::string problem;
    const std::string stem = loaded.meta ? report::pageStem(*loaded.meta) : loaded.stem();
    const std::string path = report::keepPage(loaded.folder(), stem, page, problem);
    if (path.empty()) {
        throw Failure(Status::NotWritten,
                      "can't write a page in " + loaded.folder() + ": " + problem);
    }
    report::writeOutput("-", path + '\n');
}

void reportOne(const Options& options) {
    std::string note;
    const auto loaded = report::loadResult(options.results[0], options.meta, note);
    if (!note.empty()) {
        complain(note);
    }
    const std::string output = options.output.empty() ? "-" : options.output;
    if (options.csv) {
        return report::writeOutput(output, report::patchesCsv(loaded.result));
    }
    if (options.text) {
        const report::Painter paint(output == "-" && report::terminalTakesColours());
        return report::writeOutput(output, report::summaryText(loaded.result, loaded.metaOrNull(),
                                                               paint, options.texts()));
    }
    const std::string page = report::pageOf(loaded, options.language);
    if (options.output.empty()) {
        return keepPage(loaded, page);
    }
    report::writeOutput(output, page);
}

/// "trend.html" becomes "trend-jobs".
report::PagePlace placeOf(const Options& options) {
    if (options.text || options.output == "-") {
        return {};
    }
    const fs::path output = options.output.empty() ? "trend.html" : options.output;
    report::PagePlace place;
    place.folder = output.has_parent_path() ? output.parent_path().string() : ".";
    if (!options.noPages) {
        place.name = output.stem().string() + "-jobs";
    }
    return place;
}

void writeTrend(const Options& options, const report::TrendModel& trend) {
    const std::string output = options.output.empty() ? "-" : options.output;
    if (options.text) {
        const report::Painter paint(output == "-" && report::terminalTakesColours());
        return report::writeOutput(output, report::trendText(trend, paint, options.texts()));
    }
    const std::string page = report::trendPageOf(trend, options.texts());
    if (!options.output.empty()) {
        return report::writeOutput(output, page);
    }
    std::string problem;
    const std::string path = report::keepPage(".", "trend", page, problem);
    if (path.empty()) {
        throw Failure(Status::NotWritten, "can't write a page in this folder: " + problem);
    }
    report::writeOutput("-", path + '\n');
}

Status reportTrend(const Options& options) {
    const report::PagePlace place = placeOf(options);
    const languages::Texts say = options.texts();
    report::Gathered gathered =
        options.fromStore()
            ? report::gatherStores(options.stores, options.filter, place, say)
            : report::gatherFiles(options.results, options.filter,
                                  options.series == "folder" ? report::SeriesBy::Folders
                                                             : report::SeriesBy::Statements,
                                  place, options.language, say, complain);
    if (gathered.samples.empty()) {
        throw Failure(gathered.leftOut != 0 ? Status::Unreadable : Status::NothingFound,
                      "there is no result that fits what was asked for");
    }
    std::string stores;
    for (const auto& store : options.stores) {
        stores += (stores.empty() ? "" : ", ") + store;
    }
    writeTrend(options, report::makeTrend(std::move(gathered.samples), stores,
                                          std::move(gathered.notes), say));
    return gathered.leftOut != 0 ? Status::SomeLeftOut : Status::Done;
}

Status tidyFolders(const Options& options) {
    constexpr std::int64_t secondsOfDay = 86400;
    const std::string temporary = platform::temporaryFolder();
    if (temporary.empty()) {
        throw Failure(Status::NotTidied, "there is no temporary folder that may be used");
    }
    const auto folders =
        report::tidy(temporary + "/Tintgate", *options.tidyDays * secondsOfDay, options.dryRun);
    report::writeOutput("-", report::tidiedText(folders, options.dryRun));
    const bool failed = std::any_of(folders.begin(), folders.end(), [](const auto& folder) {
        return folder.fate == report::Fate::Failed;
    });
    return failed ? Status::NotTidied : Status::Done;
}

bool wantsTrend(const Options& options) {
    std::error_code ignored;
    return options.trend || options.fromStore() || options.results.size() > 1 ||
           fs::is_directory(options.results[0], ignored);
}

int run(const Options& options) {
    if (options.verdict) {
        return verdictOf(options);
    }
    try {
        if (options.averages) {
            report::writeOutput("-", report::averageFiles(options.average));
        } else if (options.code) {
            report::writeOutput("-", report::explanationOf(*options.code));
        } else if (!options.preset.empty()) {
            report::writeOutput("-", report::presetSummary(options.preset));
        } else if (options.tidyDays) {
            return static_cast<int>(tidyFolders(options));
        } else if (options.labels.areDrawn()) {
            report::writeLabels(options.labels, options.results[0], options.meta, options.language,
                                complain);
        } else if (!options.labels.match.empty()) {
            return static_cast<int>(
                report::matchLabel(options.labels, options.results[0], options.meta));
        } else if (wantsTrend(options)) {
            return static_cast<int>(reportTrend(options));
        } else {
            reportOne(options);
        }
        return static_cast<int>(Status::Done);
    } catch (const Failure& failure) {
        return fail(failure.status, failure.what());
    } catch (const label::CannotDraw& failure) {
        return fail(Status::NotDrawn, failure.what());
    } catch (const std::bad_alloc&) {
        return fail(Status::Internal, "out of memory");
    } catch (const std::exception& failure) {
        return fail(Status::Internal, failure.what());
    }
}

void addOptions(CLI::App& program, Options& options) {
    constexpr std::size_t column = 26;
    program.get_formatter()->column_width(column);
    program
        .add_option("RESULT", options.results,
                    "Result files, and folders of them; \"-\" is\nstandard input")
        ->type_name("");
    program
        .add_option("-o,--output", options.output,
                    "Where to write; \"-\" is standard output. Without\n"
                    "it a page gets a name of its own, overwrites\n"
                    "nothing, and its path is printed")
        ->type_name("FILE");
    program.add_flag("--text", options.text, "A summary for a terminal");
    program.add_flag("--csv", options.csv, "The patches of one result as CSV");
    program.add_flag("--verdict", options.verdict,
                     "Print nothing; the exit status tells the verdict\nof one result");
    program
        .add_option("--meta", options.meta,
                    "What is known of one result's job; \"meta.json\"\n"
                    "beside an \"output.json\" is found without this")
        ->type_name("FILE");

    program
        .add_option("--language", options.languageName,
                    "Of pages and summaries: en, de, fr, es, it, ja or\n"
                    "zh. Without it, a job's page is in the job's\n"
                    "language, all else in that of your locale")
        ->type_name("LANGUAGE");

    const char* const trend = "Trend of several results, of folders or of a store";
    program.add_flag("--trend", options.trend, "A trend also of one result")->group(trend);
    program
        .add_option("--store", options.stores,
                    "The results that a store's jobs hold; given\n"
                    "several times, of these stores together. Where no\n"
                    "result is named, TINTGATE_STORE does the same")
        ->allow_extra_args(false)
        ->type_name("ADDRESS")
        ->group(trend);
    program
        .add_option("--since", options.since,
                    "From this day on: 2026-11-24, or 30d for 30 days\nago")
        ->type_name("DAY")
        ->group(trend);
    program.add_option("--until", options.until, "Up to this day, and with it")
        ->type_name("DAY")
        ->group(trend);
    for (const auto& [name, value, what] :
         {std::tuple{"--paper", &options.filter.paper, "Of papers whose names hold this text"},
          std::tuple{"--preset", &options.filter.preset,
                     "Of the preset of this number, or of those whose\nnames hold this text"},
          std::tuple{"--instrument", &options.filter.instrument,
                     "Of instruments whose names hold this text"},
          std::tuple{"--workflow", &options.filter.workflow,
                     "Of workflows whose names hold this text"}}) {
        program.add_option(name, *value, what)->type_name("TEXT")->group(trend);
    }
    program
        .add_option("--series", options.series,
                    "\"folder\": results in different folders are of\ndifferent printers")
        ->type_name("WHAT")
        ->check(CLI::IsMember({"folder"}))
        ->group(trend);
    program
        .add_flag("--no-pages", options.noPages,
                  "Make no pages of jobs; lead to those that are\nthere")
        ->group(trend);

    report::addLabelOptions(program, options.labels);

    const char* const upkeep = "Upkeep";
    program.add_option("--explain", options.code, "What an exit code of Tintgate means")
        ->type_name("CODE")
        ->group(upkeep);
    program
        .add_option("--check-preset", options.preset,
                    "Check a tolerance preset, and name the line and\n"
                    "the element of its first fault")
        ->type_name("FILE")
        ->group(upkeep);
    program
        .add_option("--tidy", options.tidyDays,
                    "Remove the folders of jobs in the temporary\n"
                    "folder in which nothing has changed for so many\n"
                    "days and that no process uses")
        ->type_name("DAYS")
        ->group(upkeep);
    program.add_flag("--dry-run", options.dryRun, "With --tidy: only say what would go")
        ->group(upkeep);
    CLI::App* const average = program.add_subcommand(
        "average", "Average several measurements of one chart, and report how far they lie apart");
    average->get_formatter()->column_width(column);
    average
        ->add_option("MEASUREMENT", options.average.measurements,
                     "Two or more measurements of one chart")
        ->type_name("")
        ->required()
        ->expected(2, -1);
    average->add_option("-o,--output", options.average.output, "Where the mean goes, as CGATS text")
        ->type_name("FILE")
        ->required();
    average
        ->add_option("--spread", options.average.spread,
                     "Where the spread of each patch goes, as CSV")
        ->type_name("FILE");
    average->callback([&options] { options.averages = true; });
    program.footer(std::string(footer) + tintgateReportStatusHelp);
}

/// Days in words become times, and what does not go together is refused.
void settle(Options& options) {
    constexpr std::int64_t secondsOfDay = 86400;
    const auto day = [](const std::string& text, const char* option) {
        const auto time = report::dayOf(text);
        if (!time) {
            throw CLI::ValidationError(option,
                                       "\"" + text + "\" is no day such as 2026-11-24 or 30d");
        }
        return *time;
    };
    if (!options.since.empty()) {
        options.filter.since = day(options.since, "--since");
    }
    if (!options.until.empty()) {
        options.filter.until = day(options.until, "--until") + secondsOfDay;
    }
    if (!options.languageName.empty()) {
        options.language = languages::languageNamed(options.languageName);
        if (!options.language) {
            throw CLI::ValidationError("--language", "\"" + options.languageName +
                                                         "\" is not en, de, fr, es, it, ja or zh");
        }
    }
    const char* const store = std::getenv("TINTGATE_STORE");
    if (!options.code && !options.tidyDays && options.preset.empty() && options.results.empty() &&
        options.stores.empty() && store != nullptr) {
        options.stores = {store};
    }
    if (options.code.has_value() + options.tidyDays.has_value() + !options.preset.empty() +
            options.fromStore() + !options.results.empty() !=
        1) {
        throw CLI::RequiredError("One of results, --store, --explain, --check-preset and --tidy");
    }
    if (options.text + options.csv + options.verdict > 1) {
        throw CLI::ExcludesError("--text, --csv and --verdict", "each other");
    }
    constexpr int mostDays = 36500;
    if (options.tidyDays && (*options.tidyDays < 1 || *options.tidyDays > mostDays)) {
        throw CLI::ValidationError("--tidy", "takes 1 to 36500 days");
    }
    if (options.dryRun && !options.tidyDays) {
        throw CLI::RequiresError("--dry-run", "--tidy");
    }
    if (options.fromStore() && !options.series.empty()) {
        throw CLI::ExcludesError("--series", "--store");
    }
    if ((options.csv || options.verdict || !options.meta.empty()) && wantsTrend(options)) {
        throw CLI::ValidationError("--csv, --verdict and --meta", "are for one result");
    }
    report::settle(options.labels);
    const bool isLabel = options.labels.areDrawn() || !options.labels.match.empty();
    if (isLabel && (options.results.size() != 1 || wantsTrend(options))) {
        throw CLI::ValidationError("--label, --pdf and --match", "are for one result");
    }
    if (isLabel && (options.text || options.csv || options.verdict || !options.output.empty())) {
        throw CLI::ExcludesError("--label, --pdf and --match", "--text, --csv, --verdict and -o");
    }
}

} // namespace

int main(int argumentCount, char** arguments) {
    Options options;
    CLI::App program("Shows results of colour verifications: one as a page, many as a trend.",
                     "tintgate-report");
    addOptions(program, options);
    try {
        program.parse(argumentCount, arguments);
        if (!options.averages) {
            settle(options);
        }
    } catch (const CLI::ParseError& failure) {
        return program.exit(failure) == 0 ? 0 : static_cast<int>(Status::BadCommand);
    }
    return run(options);
}
