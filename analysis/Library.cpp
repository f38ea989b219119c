// SPDX-License-Identifier: Apache-2.0
// The ten functions. Nothing is thrown out of them: another program's code waits behind.
#include <exception>
#include <new>
#include <utility>

#include "ExitCodes.h"
#include "analysis/Comparison.h"
#include "analysis/Instruments.h"
#include "analysis/Judgement.h"
#include "analysis/LabWriter.h"
#include "analysis/MeasurementRecord.h"
#include "analysis/MetaJson.h"
#include "analysis/Presets.h"
#include "analysis/ResultJson.h"
#include "analysis/Status.h"
#include "base/WideBytes.h"
#include "colour/ColourFile.h"
#include "job/AnalysisLibrary.h"
#include "job/JobRecords.h"

namespace {

using namespace analysis;

/// Runs what may throw. The status of a failure is its own, or one of these two.
template<class Work>
int guarded(Work work) noexcept {
    try {
        return work();
    } catch (const std::bad_alloc&) {
        return exitOutOfMemory;
    } catch (...) {
        return exitInternalFailure;
    }
}

/// For functions without a status: what they give when memory is short.
template<class Result, class Work>
Result orEmpty(Work work) noexcept {
    try {
        return work();
    } catch (...) {
        return Result();
    }
}

int validate(const std::wstring& path) {
    colour::ColourFile file;
    const colour::CgatsWants wants{.spectra = false};
    if (const int status =
            statusOf(colour::loadColourFile(base::bytesFromWide(path), wants, file))) {
        return status;
    }
    // A text serves as target or measurement by its colours, as reference or patch set by its inks.
    const bool usable = file.profile || file.set->hasColour() || file.set->hasCmyk();
    return usable ? exitDone : exitNoColourValues;
}

int analyse(const ComparisonPaths& paths, const tolerancePresetParameterRecord& preset,
            analyseResultsRecord* results, std::wstring* json, KZJobDataStruct* job) {
    // Of a job, target and measurement are never one file unless a name has gone wrong: every patch
    // would pass. A person may compare a file with itself.
    const bool sameFile = isSameFile(paths.target, paths.measurement);
    if (sameFile && job) {
        return exitTargetIsMeasurement;
    }
    PresetOptions options;
    if (const int status = readPresetOptions(preset, options)) {
        return status;
    }
    Comparison comparison;
    ComparisonWants wants = wantsOf(preset, options);
    wants.spectra = wants.spectra || job != nullptr;
    wants.singleInks = job == nullptr; // its record takes all spectra
    if (const int status = compare(paths, wants, comparison)) {
        return status;
    }
    if (sameFile) {
        warnOfSameFile(comparison);
    }
    const Judgement judgement = judge(comparison, preset, options);

    // All that can fail comes before the first byte that a caller sees.
    MeasuredPatches patches;
    if (job) {
        patches = measuredPatches(comparison);
        const auto& set = comparison.measurement.file.set;
        if (set && set->axis.length > 0 && !patches.spectral) {
            comparison.warnings.push_back(
                {"spectraNotStored", "The job's record can't hold the measurement's spectra."});
        }
    }
    std::wstring text;
    if (json) {
        text = resultJson(comparison, judgement, preset, options);
    }

    if (job) {
        storeMeasurement(std::move(patches), preset.deltaEMode, job->measurement);
    }
    if (json) {
        json->swap(text);
    }
    if (results) {
        fillResults(judgement, preset, *results);
    }
    return exitDone;
}

} // namespace

int analyzeMeasurements(std::wstring target, std::wstring measurement, std::wstring patchSet,
                        tolerancePresetParameterRecord tolerance, analyseResultsRecord* results,
                        std::wstring* json, KZJobDataStruct* job) {
    return guarded([&] {
        return analyse({std::move(target), std::move(measurement), std::move(patchSet),
                        conditionOf(tolerance)},
                       tolerance, results, json, job);
    });
}

int parsePresetParameterXMLFile(std::wstring path, tolerancePresetParameterRecord* tolerance,
                                bool keepJobChoice) {
    return guarded([&]() -> int {
        return tolerance ? readPreset(base::bytesFromWide(path), keepJobChoice, *tolerance)
                         : exitInternalFailure;
    });
}

int validateInputFile(std::wstring path) {
    return guarded([&] { return validate(path); });
}

int writeLabFromReferencesAndICCProfile(std::wstring reference, std::wstring profile,
                                        std::wstring output) {
    return guarded([&] {
        return writeLab(base::bytesFromWide(reference), base::bytesFromWide(profile),
                        base::bytesFromWide(output));
    });
}

std::wstring getJsonMetaFileString(KZJobDataStruct* job) {
    return orEmpty<std::wstring>([&] { return job ? metaJson(*job) : std::wstring(); });
}

wxString GetInstrumentNameFromID(unsigned int deviceID) {
    return orEmpty<wxString>(
        [&] { return wxString(base::wideFromBytes(instrumentName(deviceID))); });
}

int getDeviceNameFromIt8ControlStripFile(wxString path, wxString* name) {
    return guarded([&] {
        std::string found;
        const int status = instrumentOfDefinition(base::bytesFromWide(path.ToStdWstring()), found);
        if (status == exitDone && name) {
            *name = wxString(base::wideFromBytes(found));
        }
        return status;
    });
}

void getLibVersion(unsigned int& major, unsigned int& minor, unsigned int& patch) {
    major = TINTGATE_LIBRARY_MAJOR;
    minor = TINTGATE_LIBRARY_MINOR;
    patch = TINTGATE_LIBRARY_PATCH;
}

std::wstring stringToWstring(const std::string& text) {
    return orEmpty<std::wstring>([&] { return base::wideFromBytes(text); });
}

std::string wstringToString(const std::wstring& text) {
    return orEmpty<std::string>([&] { return base::bytesFromWide(text); });
}
