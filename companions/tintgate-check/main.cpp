// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string>

#include <unistd.h>

#include "ExitCodes.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-check/Aim.h"
#include "companions/tintgate-check/Batch.h"
#include "companions/tintgate-check/Conditions.h"
#include "companions/tintgate-check/ListText.h"
#include "companions/tintgate-check/Measurements.h"
#include "companions/tintgate-check/Options.h"
#include "companions/tintgate-check/Outputs.h"
#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Screen.h"
#include "companions/tintgate-check/Shelves.h"
#include "companions/tintgate-check/Verification.h"
#include "companions/tintgate-check/Watch.h"
#include "companions/tintgate-check/Words.h"
#include "companions/tintgate-report/Terminal.h"

namespace {

using namespace check;

/// Standard output. A failure is remembered, and ends the run as not done.
class Printer {
  public:
    bool print(const std::string& text) {
        if (m_ok && (std::fwrite(text.data(), 1, text.size(), stdout) != text.size() ||
                     (m_isTerminal && std::fflush(stdout) != 0))) {
            fail();
        }
        return m_ok;
    }

    bool finish() {
        if (m_ok && std::fflush(stdout) != 0) {
            fail();
        }
        return m_ok;
    }

  private:
    void fail() {
        m_ok = false;
        const std::string reason = std::strerror(errno);
        const std::string words = say(Say::OutputNotWritten, {say(Say::StandardOutput), reason});
        std::fprintf(stderr, "tintgate-check: %s\n", words.c_str());
    }

    const bool m_isTerminal = isatty(STDOUT_FILENO) != 0;
    bool m_ok = true;
};

/// How far the run is, on a terminal's last line.
class Progress {
  public:
    Progress(bool isWanted, std::optional<std::size_t> total)
        : m_isShown(isWanted && isatty(STDERR_FILENO) != 0), m_total(total) {}
    ~Progress() { clear(); }
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    void clear() {
        if (m_isThere) {
            std::fputs("\r\x1b[K", stderr);
            m_isThere = false;
        }
    }

    void show(std::size_t done) {
        constexpr std::chrono::milliseconds pause{100};
        const auto now = std::chrono::steady_clock::now();
        if (!m_isShown || now - m_last < pause) {
            return;
        }
        m_last = now;
        const std::string words =
            m_total ? say(Say::Progress, {std::to_string(done), std::to_string(*m_total)})
                    : say(Say::ProgressOfUnknown, {std::to_string(done)});
        std::fprintf(stderr, "\r\x1b[K%s", words.c_str());
        m_isThere = true;
    }

  private:
    const bool m_isShown;
    const std::optional<std::size_t> m_total;
    std::chrono::steady_clock::time_point m_last;
    bool m_isThere = false;
};

bool errorTakesColours() {
    return isatty(STDERR_FILENO) != 0 && report::terminalTakesColours();
}

int fail(const Failure& failure) {
    const std::string text =
        problemText(failure.problem, report::Painter(errorTakesColours()), screenWidth());
    std::fputs(text.c_str(), stderr);
    return static_cast<int>(failure.status);
}

std::vector<std::string> inputsOf(const Conditions& conditions, const Aim& aim) {
    return {aim.targetPath, aim.presetPath, aim.patchSetPath, conditions.file};
}

bool isReferenceData(const Conditions& conditions, const std::string& path) {
    colour::ColourFile file;
    return isDataSet(conditions, path) ||
           (colour::loadColourFile(path, {.spectra = false}, file) == colour::Failure::None &&
            file.profile);
}

/// One file that was named: a whole screen.
Status showOne(const Options& options, const Conditions& conditions, const Aim& aim,
               const report::Painter& paint, Printer& printer) {
    Outputs outputs(options.out, options.page, options.result, options.labels,
                    inputsOf(conditions, aim));
    const std::string& path = options.measurements.front();
    const Outcome outcome =
        verify(aim, {path, relativeOf(path)}, outputs, {.json = false, .result = true});
    const bool isSwapped = outcome.result && isReferenceData(conditions, path);
    const std::string text = screenText(outcome, aim, isSwapped, paint, screenWidth());
    if (outcome.result) {
        printer.print(text);
    } else {
        std::fputs(text.c_str(), stderr);
    }
    return outcome.status();
}

Status showMany(const Options& options, const Conditions& conditions, const Aim& aim,
                const report::Painter& paint, Printer& printer) {
    Outputs outputs(options.out, options.page, options.result, options.labels,
                    inputsOf(conditions, aim));
    MeasurementWalk walk(options.measurements);
    Totals totals;
    const bool isTable = !options.json && !options.quiet;
    Progress progress(!options.quiet, walk.total());
    const std::size_t width = isatty(STDOUT_FILENO) != 0 ? screenWidth() : 0;
    const Wanted wanted{.json = options.json, .result = false};
    verifyAll(
        [&] {
            auto measurement = walk.next();
            if (measurement) {
                outputs.claim(*measurement);
            }
            return measurement;
        },
        [&](const Measurement& measurement) { return verify(aim, measurement, outputs, wanted); },
        [&](Outcome&& outcome) {
            totals.add(outcome);
            if (!options.quiet) {
                progress.clear();
                const bool printed =
                    printer.print(isTable ? lineText(outcome, paint, width) : outcome.json);
                progress.show(totals.count());
                return printed;
            }
            return true;
        },
        options.threads);
    progress.clear();
    if (isTable) {
        printer.print(totals.text(paint, screenWidth()));
    }
    return totals.status();
}

Status watchFolder(const Options& options, const Conditions& conditions, const Aim& aim,
                   const report::Painter& paint, Printer& printer) {
    const WatchWanted wanted{
        options.watch,    options.out,     options.page, options.poll,
        options.interval, options.threads, options.json, inputsOf(conditions, aim),
        options.labels};
    const auto start = [&] {
        if (!options.quiet && !options.json) {
            const std::string& results = options.out.empty() ? options.watch : options.out;
            printer.print(say(Say::WatchStarts, {options.watch, results}) + '\n');
            printer.finish();
        }
    };
    const std::size_t width = isatty(STDOUT_FILENO) != 0 ? screenWidth() : 0;
    watch(aim, wanted, start, [&](const Outcome& outcome) {
        if (options.quiet) {
            return true;
        }
        std::string text = options.json ? outcome.json : lineText(outcome, paint, width);
        if (!options.json && outcome.problem) {
            text += problemText(*outcome.problem, paint, screenWidth());
        }
        return printer.print(text) && printer.finish();
    });
    return Status::Passed;
}

int run(const Options& options) {
    const Conditions conditions =
        options.conditionsFile.empty() ? findConditions() : readConditions(options.conditionsFile);
    const report::Painter paint(report::terminalTakesColours());
    Printer printer;
    if (options.list) {
        printer.print(listText(conditions, paint));
        return static_cast<int>(printer.finish() ? Status::Passed : Status::NotDone);
    }
    if (options.aim.target.empty() && options.aim.condition.empty() &&
        conditions.defaultName.empty()) {
        const Problem problem{
            0, say(Say::NothingToHoldAgainst), {}, say(Say::NothingToHoldAgainstRemedy)};
        const int status = fail(Failure(Status::BadCommand, problem));
        const report::Painter paintError(errorTakesColours());
        std::fputs(('\n' + listText(conditions, paintError)).c_str(), stderr);
        return status;
    }
    const Aim aim = loadAim(conditions, options.aim);

    if (!options.watch.empty()) {
        const Status status = watchFolder(options, conditions, aim, paint, printer);
        return static_cast<int>(printer.finish() ? status : Status::NotDone);
    }
    std::error_code ignored;
    const bool isOne = options.measurements.size() == 1 && !options.json && !options.quiet &&
                       !std::filesystem::is_directory(options.measurements.front(), ignored);
    const Status status = isOne ? showOne(options, conditions, aim, paint, printer)
                                : showMany(options, conditions, aim, paint, printer);
    return static_cast<int>(printer.finish() ? status : Status::NotDone);
}

} // namespace

int main(int argumentCount, char** arguments) {
    Options options;
    if (const auto status = readOptions(argumentCount, arguments, options)) {
        return *status;
    }
    try {
        return run(options);
    } catch (const Failure& failure) {
        return fail(failure);
    } catch (const std::bad_alloc&) {
        return fail(Failure(Status::NotDone, problemOf(exitOutOfMemory)));
    } catch (const std::exception& failure) {
        Problem problem = problemOf(exitInternalFailure);
        problem.cause = failure.what();
        return fail(Failure(Status::NotDone, problem));
    }
}
