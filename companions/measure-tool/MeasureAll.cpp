// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/MeasureAll.h"

#include <sys/resource.h>

#include <algorithm>
#include <cstdlib>
#include <string>

#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

[[noreturn]] void crash() {
    const rlimit none{0, 0};
    setrlimit(RLIMIT_CORE, &none); // an intended crash needs no core file
    std::abort();
}

/// Performs the mishap before a patch is measured.
void meet(Mishap mishap, std::size_t patch) {
    switch (mishap) {
    case Mishap::None:
        return;
    case Mishap::Fail:
        throw Failure(Status::InstrumentFailed, "the instrument failed at patch " +
                                                    std::to_string(patch + 1) +
                                                    ", as the settings request");
    case Mishap::Cancel:
        throw Failure(Status::Cancelled, "cancelled at patch " + std::to_string(patch + 1) +
                                             ", as the settings request");
    case Mishap::Hang:
        while (true) {
            pauseFor(std::chrono::hours(1));
        }
    case Mishap::Crash:
        crash();
    }
}

void append(const Reading& reading, colour::DataSet& measurement) {
    measurement.lab.push_back(reading.lab);
    measurement.xyz.push_back(reading.xyz);
    measurement.spectra.insert(measurement.spectra.end(), reading.spectrum.begin(),
                               reading.spectrum.end());
}

} // namespace

colour::DataSet measureAll(const colour::DataSet& chart, Instrument& instrument,
                           const Settings& settings, Progress& progress) {
    const std::size_t count = chart.patchCount;
    const std::size_t middle = (count + 1) / 2;
    const std::size_t mishapAt = std::min(settings.mishapAt.value_or(middle), count) - 1;
    colour::DataSet measurement = chart;
    instrument.describe(measurement);
    progress.begin(chart);
    for (std::size_t patch = 0; patch < count; ++patch) {
        if (patch == mishapAt) {
            meet(settings.mishap, patch);
        }
        pauseFor(settings.delay);
        append(instrument.measure(patch), measurement);
        progress.show(measurement, patch + 1, count);
    }
    return measurement;
}

} // namespace measuretool
