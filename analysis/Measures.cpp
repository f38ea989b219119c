// SPDX-License-Identifier: Apache-2.0
#include "analysis/Measures.h"

#include <algorithm>
#include <cmath>
#include <functional>
#include <map>

#include "analysis/PatchKinds.h"
#include "colour/Density.h"
#include "colour/Spectra.h"
#include "colour/ToneValue.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;
using colour::ProcessInk;
using colour::Xyz;

using Indices = std::vector<std::uint32_t>; ///< Into Readings.

constexpr std::ptrdiff_t processInks = 4;
constexpr double perPercent = 100; ///< Tints differ from 0.01 percent on, as in pairing.

// ---- Which readings are which tint

struct Tint {
    double nominal;
    Indices readings;
};

struct Ramp {
    std::vector<Tint> tints;
    Indices solids;
};

/// Paper, and tints and solids of each channel alone.
struct Ramps {
    Indices papers;
    std::vector<Ramp> inks;
};

const DataSet& deviceSet(const Comparison& c) {
    return *c.devices->file.set;
}

const double* deviceOfReading(const Comparison& c, std::size_t reading) {
    return &deviceSet(c).device[c.readings.deviceRow[reading] * deviceSet(c).channels.size()];
}

Ramps rampsOf(const Comparison& c) {
    Ramps ramps;
    const std::size_t channels = deviceSet(c).channels.size();
    ramps.inks.resize(channels);
    std::vector<std::map<long, Indices>> tints(channels);
    for (std::uint32_t i = 0; i < c.readings.deviceRow.size(); ++i) {
        const double* const device = deviceOfReading(c, i);
        const auto ink = onlyInk(device, channels);
        if (!ink) {
            if (isPaper(device, channels)) {
                ramps.papers.push_back(i);
            }
            continue;
        }
        if (device[*ink] >= 100 - deviceTolerance) {
            ramps.inks[*ink].solids.push_back(i);
        } else {
            tints[*ink][std::lround(device[*ink] * perPercent)].push_back(i);
        }
    }
    for (std::size_t ink = 0; ink < channels; ++ink) {
        for (auto& [nominal, readings] : tints[ink]) {
            ramps.inks[ink].tints.push_back(
                {static_cast<double>(nominal) / perPercent, std::move(readings)});
        }
    }
    return ramps;
}

// ---- One side of the comparison

/// The colours of one side as they are: no aims adjusted, no readings averaged.
struct Side {
    const Input& input;
    const std::vector<Lab>& lab;
    const Indices& rows; ///< Empty for a profile.

    /// True if every reading of paper and of the process inks alone has a usable spectrum.
    bool hasSpectra(const Ramps& ramps) const {
        if (!input.file.set || !colour::spectraUsable(input.file.set->axis)) {
            return false;
        }
        const auto have = [&](const Indices& readings) {
            return std::all_of(readings.begin(), readings.end(), [&](std::uint32_t reading) {
                return input.file.set->spectrumOf(rows[reading]) != nullptr;
            });
        };
        return have(ramps.papers) &&
               std::all_of(ramps.inks.begin(), ramps.inks.begin() + processInks,
                           [&](const Ramp& ramp) {
                               return have(ramp.solids) &&
                                      std::all_of(ramp.tints.begin(), ramp.tints.end(),
                                                  [&](const Tint& t) { return have(t.readings); });
                           });
    }

    /// The readings that are of different rows. A profile gives equal values, so one is enough.
    Indices different(Indices readings) const {
        if (rows.empty()) {
            readings.resize(1);
            return readings;
        }
        const auto row = [&](std::uint32_t reading) { return rows[reading]; };
        std::stable_sort(readings.begin(), readings.end(),
                         [&](auto a, auto b) { return row(a) < row(b); });
        readings.erase(std::unique(readings.begin(), readings.end(),
                                   [&](auto a, auto b) { return row(a) == row(b); }),
                       readings.end());
        return readings;
    }

    Xyz meanXyz(const Indices& readings) const {
        const Indices some = different(readings);
        Xyz sum;
        for (const std::uint32_t reading : some) {
            const Xyz xyz = colour::xyzFromLab(lab[reading]);
            sum = {sum.X + xyz.X, sum.Y + xyz.Y, sum.Z + xyz.Z};
        }
        const auto count = static_cast<double>(some.size());
        return {sum.X / count, sum.Y / count, sum.Z / count};
    }
};

/// What comes back of a filter's light, averaged over readings.
using Reflectance = std::function<double(const Indices&)>;

Reflectance reflectanceOf(const Side& side, ProcessInk ink, bool byDensity) {
    if (!byDensity) {
        return [&side, ink](const Indices& readings) {
            return colour::colorimetricReflectance(ink, side.meanXyz(readings));
        };
    }
    constexpr colour::DensityFilter filters[] = {
        colour::DensityFilter::Red, colour::DensityFilter::Green, colour::DensityFilter::Blue,
        colour::DensityFilter::Visual};
    const DataSet& set = *side.input.file.set;
    return [&side, &set,
            weights = colour::DensityWeights(set.axis, filters[static_cast<std::size_t>(ink)])](
               const Indices& readings) {
        double sum = 0;
        const Indices some = side.different(readings);
        for (const std::uint32_t reading : some) {
            sum += weights.reflectance(set.spectrumOf(side.rows[reading]));
        }
        return sum / static_cast<double>(some.size());
    };
}

// ---- Tone values

double aimOfCurve(ToneAims aims, double nominal) {
    const auto curve = aims == ToneAims::CurveA   ? colour::ToneCurve::A
                       : aims == ToneAims::CurveB ? colour::ToneCurve::B
                                                  : colour::ToneCurve::C;
    return nominal + colour::toneIncrease(curve, nominal);
}

/// Adds the tints of one ink. `measured` and `aim` give the tone value of a tint, or nothing.
template<class Measured, class Aim>
void addSteps(const Comparison& c, const Ramp& ramp, Measured measured, Aim aim, InkTones& ink) {
    for (const Tint& tint : ramp.tints) {
        const std::optional<double> value = measured(tint);
        const std::optional<double> wanted = aim(tint);
        if (value && wanted) {
            ink.steps.push_back({tint.nominal, *value, *wanted, tint.readings.size(),
                                 c.readings.patch[tint.readings.front()]});
        }
    }
}

InkTones processTones(const Comparison& c, const Ramps& ramps, ProcessInk ink, ToneAims aims,
                      const Side& target, const Side& measurement, bool byDensity) {
    InkTones tones;
    tones.channel = static_cast<std::size_t>(ink);
    tones.aims = aims;
    const Ramp& ramp = ramps.inks[tones.channel];
    if (ramps.papers.empty() || ramp.solids.empty()) {
        return tones;
    }
    const auto valuesOf = [&](const Side& side) {
        const Reflectance reflectance = reflectanceOf(side, ink, byDensity);
        return [reflectance, paper = reflectance(ramps.papers),
                solid = reflectance(ramp.solids)](const Tint& tint) {
            return colour::toneValue(paper, solid, reflectance(tint.readings));
        };
    };
    if (aims == ToneAims::Target) {
        addSteps(c, ramp, valuesOf(measurement), valuesOf(target), tones);
    } else {
        addSteps(
            c, ramp, valuesOf(measurement),
            [&](const Tint& tint) { return std::optional(aimOfCurve(aims, tint.nominal)); }, tones);
    }
    return tones;
}

std::vector<MidToneSpread> spreadsOf(const std::vector<InkTones>& tones) {
    constexpr std::size_t chromaticInks = 3;
    std::vector<MidToneSpread> spreads;
    for (const ToneStep& cyan : tones[0].steps) {
        if (!isOf(Tones::MidTones, cyan.nominal)) {
            continue;
        }
        MidToneSpread spread{cyan.nominal, 0, 0, cyan.patch};
        double least = cyan.deviation();
        double most = least;
        double furthest = -1;
        std::size_t inks = 0;
        for (std::size_t ink = 0; ink < chromaticInks; ++ink) {
            const auto& steps = tones[ink].steps;
            const auto step = std::find_if(steps.begin(), steps.end(), [&](const ToneStep& other) {
                return std::abs(other.nominal - cyan.nominal) <= deviceTolerance;
            });
            if (step == steps.end()) {
                break;
            }
            ++inks;
            least = std::min(least, step->deviation());
            most = std::max(most, step->deviation());
            spread.readings += step->readings;
            if (std::abs(step->deviation()) > furthest) {
                furthest = std::abs(step->deviation());
                spread.patch = step->patch;
            }
        }
        if (inks == chromaticInks) {
            spread.spread = most - least;
            spreads.push_back(spread);
        }
    }
    return spreads;
}

void addTones(const Comparison& c, const Ramps& ramps, const PresetOptions& options,
              const Side& target, const Side& measurement, Measures& measures) {
    const ToneAims ofBlack = options.toneAimsBlack.value_or(options.toneAims);
    const bool targetCounts = options.toneAims == ToneAims::Target || ofBlack == ToneAims::Target;
    measures.byDensity =
        measurement.hasSpectra(ramps) && (!targetCounts || target.hasSpectra(ramps));
    for (const ProcessInk ink :
         {ProcessInk::Cyan, ProcessInk::Magenta, ProcessInk::Yellow, ProcessInk::Black}) {
        measures.tones.push_back(processTones(c, ramps, ink,
                                              ink == ProcessInk::Black ? ofBlack : options.toneAims,
                                              target, measurement, measures.byDensity));
    }
    measures.spreads = spreadsOf(measures.tones);
}

void addSpotTones(const Comparison& c, const Ramps& ramps, bool fromTarget, const Side& target,
                  const Side& measurement, Measures& measures) {
    for (std::size_t channel = 0; channel < ramps.inks.size(); ++channel) {
        InkTones& ink = measures.spotTones.emplace_back();
        ink.channel = channel;
        const Ramp& ramp = ramps.inks[channel];
        if (ramps.papers.empty() || ramp.solids.empty()) {
            continue;
        }
        const auto valuesOf = [&](const Side& side) {
            const auto labOf = [&side](const Indices& readings) {
                return colour::labFromXyz(side.meanXyz(readings));
            };
            return
                [labOf, paper = labOf(ramps.papers), solid = labOf(ramp.solids)](const Tint& tint) {
                    return colour::spotToneValue(paper, solid, labOf(tint.readings));
                };
        };
        if (fromTarget) {
            addSteps(c, ramp, valuesOf(measurement), valuesOf(target), ink);
        } else {
            addSteps(
                c, ramp, valuesOf(measurement),
                [](const Tint& tint) { return std::optional(tint.nominal); }, ink);
        }
    }
}

// ---- Greys and ramps

/// 1 up to 50 percent, from there in a straight line to 0.25 at 100. From general knowledge of the
/// method, without a source that could be named.
double fallingWeight(double tone) {
    constexpr double half = 50;
    constexpr double loss = 0.75;
    return 1 - loss * std::max(0.0, tone - half) / half;
}

void addPatches(const Comparison& c, const PresetOptions& options, Measures& measures) {
    const std::size_t channels = deviceSet(c).channels.size();
    const auto weightOf = [&](double tone) {
        return options.greyWeights == GreyWeights::Falling ? fallingWeight(tone) : 1.0;
    };
    for (std::size_t patch = 0; patch < c.patchCount(); ++patch) {
        const double* const device = c.deviceOf(patch);
        if (const auto ink = onlyInk(device, channels)) {
            const double tone = device[*ink];
            if (isOf(Tones::Ramp, tone)) {
                measures.ramp.push_back(patch);
            }
            if (*ink == static_cast<std::size_t>(ProcessInk::Black) &&
                tone < 100 - deviceTolerance) {
                measures.blacks.push_back({patch, tone, weightOf(tone)});
            }
        } else if (isBalancedGrey(device, channels)) {
            measures.greys.push_back({patch, device[0], weightOf(device[0])});
        }
    }
    if (!c.papers.measured) {
        return;
    }
    const Lab& paper = *c.papers.measured;
    for (const Grey& grey : measures.greys) {
        const double uncovered = 1 - grey.tone / 100;
        measures.greyAims.push_back({0, paper.a * uncovered, paper.b * uncovered});
    }
}

} // namespace

bool isOf(Tones tones, double nominal) {
    const auto within = [&](double from, double to) {
        return nominal >= from - deviceTolerance && nominal <= to + deviceTolerance;
    };
    switch (tones) {
    case Tones::MidTones:
        return within(40, 40) || within(50, 50);
    case Tones::ThreeQuarters:
        return within(70, 80);
    case Tones::Ramp:
        return within(30, 70);
    case Tones::All:
        break;
    }
    return true;
}

Measures measuresOf(const Comparison& c, const PresetOptions& options) {
    Measures measures;
    if (!c.devices || !c.devices->file.set->hasCmyk()) {
        return measures;
    }
    if (options.asks(Quantity::DeltaL) || options.asks(Quantity::GreyCh)) {
        addPatches(c, options, measures);
    }
    const bool asksTones = options.asks(Quantity::Tone);
    const bool asksSpotTones = options.asks(Quantity::SpotTone);
    if (!asksTones && !asksSpotTones) {
        return measures;
    }
    const Side target{c.target, c.readings.target, c.readings.targetRow};
    const Side measurement{c.measurement, c.readings.measured, c.readings.measuredRow};
    const Ramps ramps = rampsOf(c);
    if (asksTones) {
        addTones(c, ramps, options, target, measurement, measures);
    }
    if (asksSpotTones) {
        addSpotTones(c, ramps, options.spotToneFromTarget, target, measurement, measures);
    }
    return measures;
}

} // namespace analysis
