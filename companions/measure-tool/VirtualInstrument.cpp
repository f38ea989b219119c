// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/VirtualInstrument.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <utility>

#include "colour/ColourFile.h"
#include "colour/Difference.h"
#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

/// Six decimals: more precise than any print, and still readable.
double sixDecimals(double value) {
    return std::round(value * 1e6) / 1e6 + 0.0; // avoids negative zero
}

/// A patch with an error can't be darker than black.
colour::Lab possible(const colour::Lab& lab) {
    return lab.L > 0 ? lab : colour::Lab{};
}

colour::Profile openProfile(const std::string& path) {
    colour::ColourFile file = unlessCancelled([path] {
        colour::ColourFile loaded;
        expectUsable(colour::loadColourFile(path, {.spectra = false}, loaded), Status::BadProfile,
                     path);
        return loaded;
    });
    if (!file.profile) {
        throw Failure(Status::BadProfile, path + " is not an ICC profile");
    }
    return std::move(*file.profile);
}

/// A CMYK profile has no spot inks; patches without spot ink can still be printed.
void checkPrintable(const colour::DataSet& chart) {
    const std::size_t channels = chart.channels.size();
    bool printable = chart.hasCmyk() || chart.deviceSpace == colour::DeviceSpace::Rgb;
    for (std::size_t i = 0; chart.hasCmyk() && i < chart.device.size(); ++i) {
        printable = printable && (i % channels < 4 || chart.device[i] == 0);
    }
    if (!printable) {
        throw Failure(Status::NotMeasurable,
                      "the virtual instrument prints CMYK and RGB, but the definition has patches "
                      "of other colorants");
    }
}

/// Uniform in 0 to 1, both excluded. The standard library's distributions differ between
/// implementations; its engines do not.
double uniform(std::mt19937_64& engine) {
    return (static_cast<double>(engine() >> 12) + 0.5) * 0x1p-52;
}

/// The mean length of a vector of three normal deviates with deviation 1 (Maxwell's distribution).
const double meanLength = std::sqrt(8 / std::numbers::pi);

} // namespace

VirtualInstrument::VirtualInstrument(const Settings& settings, const std::string& name,
                                     const colour::DataSet& chart)
    : m_chart(chart), m_path(settings.profile), m_name(name),
      m_deviation(settings.error / meanLength), m_bias(settings.bias), m_spectra(settings.spectra),
      m_profile(openProfile(settings.profile)), m_engine(settings.seed) {
    checkPrintable(chart);
}

void VirtualInstrument::describe(colour::DataSet& measurement) const {
    // Nobody must mistake this for a measurement.
    measurement.originator = "NerovaMeasure, virtual instrument";
    measurement.instrumentation =
        m_name.empty() ? "Virtual instrument" : "Virtual instrument in place of " + m_name;
    measurement.conditions = {.illuminant = "D50", .observer = "2", .measurement = {}};
    if (m_spectra) {
        measurement.axis = ReflectanceMaker::axis;
    }
}

/// The profile's Lab of a patch.
colour::Lab VirtualInstrument::print(std::size_t patch) const {
    const double* const values = &m_chart.device[patch * m_chart.channels.size()];
    std::array<double, 4> inks{};
    if (m_chart.hasCmyk()) {
        std::copy(values, values + 4, inks.begin());
    } else { // Each ink absorbs its complement; there is no black, and white stays paper.
        std::transform(values, values + 3, inks.begin(), [](double value) { return 100 - value; });
    }
    colour::Lab lab;
    expectUsable(m_profile.evaluate(inks.data(), 1, inks.size(), &lab), Status::BadProfile, m_path);
    return lab;
}

/// Normal deviates by Box and Muller, in pairs. The fourth deviate is not used.
colour::Lab VirtualInstrument::randomError() {
    std::array<double, 4> deviates{};
    for (std::size_t i = 0; i < deviates.size(); i += 2) {
        const double radius = m_deviation * std::sqrt(-2 * std::log(uniform(m_engine)));
        const double angle = 2 * std::numbers::pi * uniform(m_engine);
        deviates[i] = radius * std::cos(angle);
        deviates[i + 1] = radius * std::sin(angle);
    }
    return {deviates[0], deviates[1], deviates[2]};
}

Reading VirtualInstrument::measure(std::size_t patch) {
    const colour::Lab printed = print(patch);
    const colour::Lab error = randomError();
    Reading reading;
    const colour::Lab lab =
        possible({printed.L + m_bias.L + error.L, printed.a + m_bias.a + error.a,
                  printed.b + m_bias.b + error.b});
    reading.lab = {sixDecimals(lab.L), sixDecimals(lab.a), sixDecimals(lab.b)};
    const colour::Xyz xyz = colour::xyzFromLab(reading.lab);
    reading.xyz = {sixDecimals(xyz.X), sixDecimals(xyz.Y), sixDecimals(xyz.Z)};
    if (m_spectra && !m_reflectances.make(xyz, reading.spectrum)) {
        throw Failure(Status::NotMeasurable, "no spectrum has the colour of patch " +
                                                 std::to_string(patch + 1) +
                                                 "; try a smaller error or bias");
    }
    return reading;
}

} // namespace measuretool
