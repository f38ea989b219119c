// SPDX-License-Identifier: Apache-2.0
// Measures the patches of a definition. This program is
// "/Applications/Nerova/NerovaMeasure.app/Contents/MacOS/NerovaMeasure" below the system root. A
// property list in Library refers the tool to it.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <new>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "base/WholeFile.h"
#include "colour/CgatsText.h"
#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Definition.h"
#include "companions/measure-tool/ExportedMeasurement.h"
#include "companions/measure-tool/Failure.h"
#include "companions/measure-tool/MeasureAll.h"
#include "companions/measure-tool/Operator.h"
#include "companions/measure-tool/Options.h"
#include "companions/measure-tool/Progress.h"
#include "companions/measure-tool/RunLog.h"
#include "companions/measure-tool/Settings.h"
#include "companions/measure-tool/Text.h"
#include "companions/measure-tool/VirtualInstrument.h"

namespace {

using namespace measuretool;

constexpr const char* help =
    R"(Measures the patches of a definition, with a virtual instrument or by
handing over what an instrument's own software has exported.

  NerovaMeasure OPTIONS     OPTIONS is a file: a line with an option, a line with its value, ...

  -m          measure
  -patch      path of the definition
  -o          path of the measurement, which appears complete or not at all
  -patchname  the strip's name for people
  -i          the instrument's name
Other options are ignored. On a terminal, the progress is shown. All messages are
also written to NerovaMeasure.log, in the folder of the measurement.

The settings file selects the instrument. It is the first of: the file that TINTGATE_MEASURE names,
Library/Preferences/NerovaMeasure.conf below TINTGATE_ROOT, ~/.config/tintgate/measure.conf.

  instrument = virtual      profile = FILE.icc, error = SIZE, bias = L a b, seed = NUMBER,
                            spectra = yes
  instrument = file         file = EXPORT.txt, wait = SECONDS, match = ids
  delay = MILLISECONDS      for each patch
  mishap = fail             or cancel, hang, crash; mishap-at = PATCH

)";

int end(Status status) {
    return static_cast<int>(status);
}

int fail(Status status, const std::string& words, const RunLog& log) {
    std::fprintf(stderr, "NerovaMeasure: %s\n", printable(words).c_str());
    log.add(words);
    return end(status);
}

/// True if both names lead to one file, even if it does not exist yet.
bool isSameFile(const std::string& left, const std::string& right) {
    namespace fs = std::filesystem;
    std::error_code ignored;
    if (fs::equivalent(left, right, ignored)) {
        return true;
    }
    std::error_code failed;
    const fs::path first = fs::weakly_canonical(left, failed);
    return !failed && first == fs::weakly_canonical(right, failed) && !failed;
}

/// Checks before the first patch whether the result can be written, and protects the input files.
void checkOutput(const std::string& output, const std::vector<std::string>& inputs) {
    for (const std::string& input : inputs) {
        if (!input.empty() && isSameFile(input, output)) {
            throw Failure(Status::BadOptions, "the measurement would replace " + input);
        }
    }
    struct stat status {};
    if (lstat(output.c_str(), &status) == 0 && !S_ISREG(status.st_mode)) {
        throw Failure(Status::NotWritten, output + " is not a regular file");
    }
    const std::filesystem::path parent = std::filesystem::path(output).parent_path();
    const std::string folder = parent.empty() ? "./" : parent.string();
    if (access(folder.c_str(), W_OK | X_OK) != 0) {
        throw Failure(Status::NotWritten, "can't write in " + folder);
    }
}

std::unique_ptr<Instrument> connect(const Settings& settings, const Options& options,
                                    const Definition& definition, Operator& person) {
    if (settings.instrument == Settings::Instrument::Virtual) {
        return std::make_unique<VirtualInstrument>(settings, options.instrument, definition.chart);
    }
    return std::make_unique<ExportedMeasurement>(settings, definition, person);
}

/// Each step that reads can be cancelled, because a share's server may be lost.
void measure(const std::string& optionsFile, RunLog& log) {
    listenForCancel();
    const Options options = unlessCancelled([optionsFile] { return readOptions(optionsFile); });
    const char* const named = std::getenv("TINTGATE_MEASURE");
    log.start(options.output,
              {optionsFile, options.definition, std::string(named == nullptr ? "" : named)});
    const std::string settingsFile = unlessCancelled([] { return settingsPath(); });
    const Settings settings =
        unlessCancelled([settingsFile] { return readSettings(settingsFile); });
    unlessCancelled([output = options.output, inputs = std::vector<std::string>{
                                                  optionsFile, settingsFile, options.definition,
                                                  settings.profile, settings.file}] {
        checkOutput(output, inputs);
        return true;
    });
    const Definition definition =
        unlessCancelled([path = options.definition] { return readDefinition(path); });
    Progress progress;
    colour::DataSet measurement = [&] {
        Operator person(options.title, progress, log);
        const auto instrument = connect(settings, options, definition, person);
        return measureAll(definition.chart, *instrument, settings, progress);
    }();
    if (measurement.descriptor.empty()) {
        measurement.descriptor = options.title;
    }
    if (measurement.created.empty()) {
        measurement.created = timeText(std::chrono::system_clock::now());
    }
    checkCancelled();
    if (!base::replaceWholeFile(options.output, colour::writeCgats(measurement))) {
        throw Failure(Status::NotWritten,
                      "can't write " + options.output + ": " + std::strerror(errno));
    }
}

int run(const std::vector<std::string_view>& words, RunLog& log) {
    if (words.size() != 1) {
        return fail(Status::BadCommand, "invalid arguments; see --help", log);
    }
    if (words[0] == "--help" || words[0] == "-h") {
        return end(std::fputs((std::string(help) + nerovaMeasureStatusHelp).c_str(), stdout) < 0
                       ? Status::NotWritten
                       : Status::Done);
    }
    measure(std::string(words[0]), log);
    return end(Status::Done);
}

int runAndReport(const std::vector<std::string_view>& words) {
    RunLog log;
    try {
        return run(words, log);
    } catch (const Failure& failure) {
        return fail(failure.status, failure.what(), log);
    } catch (const std::bad_alloc&) {
        return fail(Status::OutOfMemory, "out of memory", log);
    } catch (const std::length_error&) {
        return fail(Status::OutOfMemory, "out of memory", log);
    } catch (const std::system_error& error) { // out of threads or descriptors
        return fail(Status::OutOfMemory, error.what(), log);
    }
}

} // namespace

int main(int argumentCount, char** arguments) {
    const int status = runAndReport({arguments + (argumentCount > 0), arguments + argumentCount});
    if (!hasLeftWork()) {
        return status;
    }
    std::fflush(stdout);
    _exit(status);
}
