#include "analysis/LabWriter.h"

#include <cmath>
#include <utility>

#include "ExitCodes.h"
#include "analysis/OutputFile.h"
#include "analysis/Status.h"
#include "colour/CgatsText.h"
#include "colour/ColourFile.h"

namespace analysis {
namespace {

/// Six decimals: more than a profile's floating road can mean, and short enough to read.
double sixDecimals(double value) {
    return std::round(value * 1e6) / 1e6;
}

} // namespace

int writeLab(const std::string& reference, const std::string& profile, const std::string& output) {
    colour::ColourFile file;
    const colour::CgatsWants wants{.spectra = false};
    if (const int status = statusOf(colour::loadColourFile(reference, wants, file)))
        return status;
    if (!file.set)
        return exitPatchSetNotText;
    if (!file.set->hasCmyk())
        return exitNoDeviceValues;
    colour::DataSet chart = colour::chartOf(std::move(*file.set));
    chart.originator = "Tintgate";
    chart.conditions = {.illuminant = "D50", .observer = "2", .measurement = {}};

    colour::ColourFile profileFile;
    if (const int status = statusOf(colour::loadColourFile(profile, wants, profileFile)))
        return status;
    if (!profileFile.profile)
        return exitProfileDamaged;

    chart.descriptor = profileFile.profile->description();
    chart.lab.resize(chart.patchCount);
    if (const int status = statusOf(profileFile.profile->evaluate(
            chart.device.data(), chart.patchCount, chart.channels.size(), chart.lab.data())))
        return status;
    for (colour::Lab& lab : chart.lab)
        lab = {sixDecimals(lab.L), sixDecimals(lab.a), sixDecimals(lab.b)};
    return writeOutputFile(output, colour::writeCgats(chart));
}

} // namespace analysis
