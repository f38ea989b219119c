// Measures the patches of a definition. Below the system root this program stands at
// "/Applications/Nerova/NerovaMeasure.app/Contents/MacOS/NerovaMeasure", and a property list of the
// Library leads the tool to it.
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <filesystem>
#include <memory>
#include <new>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "colour/CgatsText.h"
#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Definition.h"
#include "companions/measure-tool/ExportedMeasurement.h"
#include "companions/measure-tool/Failure.h"
#include "companions/measure-tool/MeasureAll.h"
#include "companions/measure-tool/Options.h"
#include "companions/measure-tool/Progress.h"
#include "companions/measure-tool/Settings.h"
#include "companions/measure-tool/VirtualInstrument.h"
#include "report/PageFile.h"

namespace {

using namespace measuring;

constexpr const char* help =
    R"(Measures the patches of a definition, with a virtual instrument or by
handing over what an instrument's own software has exported.

  NerovaMeasure OPTIONS     OPTIONS is a file: a line with an option, a line with its value, ...

  -m          measure
  -patch      path of the definition
  -o          path of the measurement, which appears whole or not at all
  -patchname  what people call the strip
  -i          the instrument's name
Other options are read over. On a terminal the progress is shown.

Which instrument measures stands in the settings file: TINTGATE_MEASURE names it, else it is
Library/Preferences/NerovaMeasure.conf below TINTGATE_ROOT, else ~/.config/tintgate/measure.conf.

  instrument = virtual      profile = FILE.icc, error = SIZE, bias = L a b, seed = NUMBER,
                            spectra = yes
  instrument = file         file = EXPORT.txt, wait = SECONDS
  delay = MILLISECONDS      for each patch
  mishap = fail             or cancel, hang, crash; mishap-at = PATCH

)";

int end(Status status) {
    return static_cast<int>(status);
}

/// Ids and names of foreign files may stand in the words: a terminal is not to obey them.
int fail(Status status, std::string words) {
    std::replace_if(
        words.begin(), words.end(), [](unsigned char c) { return c < 0x20 || c == 0x7F; }, '?');
    std::fprintf(stderr, "NerovaMeasure: %s\n", words.c_str());
    return end(status);
}

/// Finds out before the first patch what would stop the result at the last one, and keeps what is
/// read from being written over.
void checkOutput(const Options& options, const Settings& settings) {
    for (const std::string& input : {options.definition, settings.profile, settings.file}) {
        std::error_code ignored;
        if (!input.empty() && std::filesystem::equivalent(input, options.output, ignored))
            throw Failure(Status::BadOptions, "the measurement would replace " + input);
    }
    struct stat status {};
    if (lstat(options.output.c_str(), &status) == 0 && !S_ISREG(status.st_mode))
        throw Failure(Status::NotWritten, options.output + " is no ordinary file");
    const std::filesystem::path parent = std::filesystem::path(options.output).parent_path();
    const std::string folder = parent.empty() ? "./" : parent.string();
    if (access(folder.c_str(), W_OK | X_OK) != 0)
        throw Failure(Status::NotWritten, "nothing can be written in " + folder);
}

std::unique_ptr<Instrument> connect(const Settings& settings, const Options& options,
                                    const colour::DataSet& chart, Progress& progress) {
    if (settings.instrument == Settings::Instrument::Virtual)
        return std::make_unique<VirtualInstrument>(settings, options.instrument, chart);
    if (settings.wait.count() > 0)
        progress.say(("Waiting for " + settings.file).c_str());
    return std::make_unique<ExportedMeasurement>(settings, chart);
}

std::string timeNow() {
    const std::time_t now = std::time(nullptr);
    std::tm parts{};
    gmtime_r(&now, &parts);
    char text[sizeof "2024-05-01T12:34:56Z"];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

void measure(const Options& options) {
    listenForCancel();
    const Settings settings = readSettings(settingsPath());
    checkOutput(options, settings);
    const colour::DataSet chart = readDefinition(options.definition);
    Progress progress;
    const auto instrument = connect(settings, options, chart, progress);
    colour::DataSet measurement = measureAll(chart, *instrument, settings, progress);
    if (measurement.descriptor.empty())
        measurement.descriptor = options.title;
    if (measurement.created.empty())
        measurement.created = timeNow();
    checkCancelled();
    std::string problem;
    if (!report::replacePage(options.output, colour::writeCgats(measurement), problem))
        throw Failure(Status::NotWritten, "can't write " + options.output + ": " + problem);
}

int run(const std::vector<std::string_view>& words) {
    if (words.size() != 1)
        return fail(Status::BadCommand, "not understood; --help tells how it is called");
    if (words[0] == "--help" || words[0] == "-h")
        return end(std::fputs((std::string(help) + nerovaMeasureStatusHelp).c_str(), stdout) < 0
                       ? Status::NotWritten
                       : Status::Done);
    measure(readOptions(std::string(words[0])));
    return end(Status::Done);
}

} // namespace

int main(int argumentCount, char** arguments) {
    try {
        return run({arguments + (argumentCount > 0), arguments + argumentCount});
    } catch (const Failure& failure) {
        return fail(failure.status, failure.what());
    } catch (const std::bad_alloc&) {
        return fail(Status::OutOfMemory, "out of memory");
    } catch (const std::length_error&) {
        return fail(Status::OutOfMemory, "out of memory");
    }
}
