// SPDX-License-Identifier: Apache-2.0
#include "analysis/LabWriter.h"

#include <cmath>
#include <utility>

#include "ExitCodes.h"
#include "analysis/OutputFile.h"
#include "analysis/PatchKinds.h"
#include "analysis/Status.h"
#include "colour/CgatsText.h"
#include "colour/ColourFile.h"

namespace analysis {
namespace {

/// Six decimals: more than the precision of a profile, and short enough to read.
double sixDecimals(double value) {
    return std::round(value * 1e6) / 1e6;
}

} // namespace

int writeLab(const std::string& reference, const std::string& profile, const std::string& output) {
    if (const int status = checkOutput(output, {reference, profile})) {
        return status;
    }
    colour::ColourFile file;
    const colour::CgatsWants wants{.spectra = false};
    const colour::Failure failure = colour::loadColourFile(reference, wants, file);
    if (failure == colour::Failure::NotRecognised || file.profile) {
        return exitReferenceNotText;
    }
    if (failure != colour::Failure::None) {
        return statusOf(failure);
    }
    if (!file.set->hasCmyk()) {
        return exitNoDeviceValues;
    }
    for (std::size_t row = 0; row < file.set->patchCount; ++row) {
        if (!isProcessOnly(*file.set, row)) {
            return exitNoDeviceValues;
        }
    }
    colour::DataSet chart = colour::chartOf(std::move(*file.set));
    chart.originator = "Tintgate";
    chart.conditions = {.illuminant = "D50", .observer = "2", .measurement = {}};

    colour::Profile icc;
    const colour::Failure profileFailure = colour::loadProfile(profile, icc);
    if (profileFailure == colour::Failure::NotRecognised) {
        return exitNotAProfile;
    }
    if (profileFailure != colour::Failure::None) {
        return statusOf(profileFailure);
    }
    chart.descriptor = icc.description();
    chart.lab.resize(chart.patchCount);
    if (const int status = statusOf(icc.evaluate(chart.device.data(), chart.patchCount,
                                                 chart.channels.size(), chart.lab.data()))) {
        return status;
    }
    for (colour::Lab& lab : chart.lab) {
        lab = {sixDecimals(lab.L), sixDecimals(lab.a), sixDecimals(lab.b)};
    }
    return writeOutputFile(output, colour::writeCgats(chart));
}

} // namespace analysis
