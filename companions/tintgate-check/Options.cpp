// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Options.h"

#include <filesystem>

#include <CLI/CLI.hpp>

#include "companions/tintgate-check/Batch.h"
#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Words.h"
#include "report/label/Label.h"

namespace check {
namespace {

constexpr const char* footer = R"(
Examples:
  tintgate-check proof.txt                            against the default condition
  tintgate-check -t FOGRA39L proof.txt                against a known data set
  tintgate-check -c coated-proof *.txt                many
  tintgate-check -t FOGRA39L.ti3 -p contract-proof proof.txt --page
  tintgate-check -c coated-proof proof.txt --label --operator Anna
  tintgate-check --watch /srv/exports -c coated-proof --out /srv/results
  tintgate-check --list                               conditions, presets, data sets

)";

void addFiles(CLI::App& program, Options& options) {
    program
        .add_option("MEASUREMENT", options.measurements,
                    "Measurements (CGATS text or CxF3), and folders of\nthem")
        ->type_name("");
    program
        .add_option("-c,--condition", options.aim.condition,
                    "What the print is held against, by its name in\nconditions.toml")
        ->type_name("NAME");
    program
        .add_option("-t,--target", options.aim.target,
                    "The target: a file (text, CxF3, ICC profile) or\na known data set")
        ->type_name("FILE");
    program
        .add_option("-p,--preset", options.aim.preset,
                    "The tolerances: short name, number or file; the\ncontract proof if left out")
        ->type_name("PRESET");
    program
        .add_option("--patch-set", options.aim.patchSet,
                    "Only the patches of this list; needed if both\nsides are profiles")
        ->type_name("FILE");
    program
        .add_option("--conditions", options.conditionsFile,
                    "The file of conditions. Without it\n"
                    "~/.config/tintgate/conditions.toml, otherwise\n"
                    "/etc/tintgate/conditions.toml")
        ->type_name("FILE");
    program.add_flag("--list", options.list, "Show conditions, presets and data sets");
    program
        .add_option("--language", options.language,
                    "Of screens and pages: en, de, fr, es, it, ja or\n"
                    "zh; without it, that of your locale")
        ->type_name("LANGUAGE");
}

void addOutputs(CLI::App& program, Options& options) {
    const char* const outputs = "Output";
    program.add_flag("--page", options.page, "Write NAME.html: charts and all patches")
        ->group(outputs);
    program.add_flag("--result", options.result, "Write NAME.json: the whole result")
        ->group(outputs);
    program
        .add_option("--out", options.out,
                    "Write below this folder, in the same tree, and\nnot next to the measurements")
        ->type_name("FOLDER")
        ->group(outputs);
    program.add_flag("--json", options.json, "Print a line of JSON for each file")->group(outputs);
    program.add_flag("-q,--quiet", options.quiet, "Print nothing; the exit status tells")
        ->group(outputs);
    program
        .add_option("-j,--jobs", options.threads,
                    "How many files at a time; as many as there are\nprocessors if left out")
        ->type_name("NUMBER")
        ->check(CLI::Range(1U, 256U))
        ->group(outputs);
}

void addWatch(CLI::App& program, Options& options) {
    const char* const watching = "Watching";
    program
        .add_option("--watch", options.watch,
                    "Verify each new measurement in this folder and\n"
                    "below, as soon as it is complete. Writes results")
        ->type_name("FOLDER")
        ->group(watching);
    program
        .add_flag("--poll", options.poll,
                  "Look at the folder again and again: for network\n"
                  "shares, which report no changes")
        ->group(watching);
    program.add_option("--interval", options.interval, "Seconds between two looks; 2 if left out")
        ->type_name("SECONDS")
        ->check(CLI::Range(0.05, 3600.0))
        ->group(watching);
}

void chooseLanguage(const Options& options) {
    const auto named = languages::languageNamed(options.language);
    const languages::Language language = named ? *named : languages::languageOfUser();
    useLanguages(options.json ? languages::Language::English : language, language);
    label::useLanguage(language);
    if (!options.language.empty() && !named) {
        throw CLI::ValidationError("--language", say(Say::NoSuchLanguage, {options.language}));
    }
}

/// What does not go together.
void settle(const CLI::App& program, const Options& options) {
    chooseLanguage(options);
    if (options.measurements.empty() && options.watch.empty() && !options.list) {
        throw CLI::ValidationError(say(Say::NothingToVerify));
    }
    if (!options.watch.empty() && !options.measurements.empty()) {
        throw CLI::ValidationError(say(Say::WatchAndFiles));
    }
    for (const char* name : {"--poll", "--interval"}) {
        if (options.watch.empty() && program.count(name) > 0) {
            throw CLI::ValidationError(say(Say::OnlyWithWatch, {name}));
        }
    }
    if (options.quiet && options.json) {
        throw CLI::ValidationError(say(Say::QuietOrJson));
    }
    std::error_code ignored;
    if (!options.out.empty() && std::filesystem::exists(options.out, ignored) &&
        !std::filesystem::is_directory(options.out, ignored)) {
        throw CLI::ValidationError(say(Say::OutIsFile, {options.out}));
    }
}

} // namespace

std::optional<int> readOptions(int argumentCount, char** arguments, Options& options) {
    constexpr std::size_t column = 26;
    options.threads = availableProcessors();
    CLI::App program("Verifies the colours of measured prints.", "tintgate-check");
    program.get_formatter()->column_width(column);
    addFiles(program, options);
    addOutputs(program, options);
    LabelWords labels;
    addLabelOptions(program, labels);
    addWatch(program, options);
    program.footer(std::string(footer) + tintgateCheckStatusHelp);
    try {
        program.parse(argumentCount, arguments);
        settle(program, options);
        options.labels = readLabelWords(labels);
    } catch (const CLI::ParseError& failure) {
        return program.exit(failure) == 0 ? 0 : static_cast<int>(Status::BadCommand);
    }
    return std::nullopt;
}

} // namespace check
