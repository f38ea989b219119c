// SPDX-License-Identifier: Apache-2.0
#include "analysis/ConditionWarnings.h"

namespace analysis {
namespace {

using colour::Conditions;

constexpr const char* usualIlluminant = "D50";
constexpr const char* usualObserver = "2";

/// The conditions that the colours of one side apply to.
struct Side {
    const char* role;
    Conditions stated;       ///< In the file.
    Conditions counted;      ///< Illuminant and observer are never empty.
    bool calculated = false; ///< From spectra, because the file states other conditions.
};

Side sideOf(const char* role, const Input& input) {
    Side side{.role = role, .stated = {}, .counted = {}};
    if (input.file.set) {
        side.stated = input.file.set->conditions;
        side.calculated = input.file.set->calculated;
    }
    side.counted = side.stated;
    if (side.calculated || side.counted.illuminant.empty()) {
        side.counted.illuminant = usualIlluminant;
    }
    if (side.calculated || side.counted.observer.empty()) {
        side.counted.observer = usualObserver;
    }
    return side;
}

/// "D65, 10 degrees"
std::string lightOf(const Conditions& conditions) {
    std::string text = conditions.illuminant;
    if (!conditions.observer.empty()) {
        text += (text.empty() ? "" : ", ") + conditions.observer + " degrees";
    }
    return text;
}

void warnOfLight(const Side& side, std::vector<Warning>& warnings) {
    const std::string what = std::string("The ") + side.role + " states " + lightOf(side.stated);
    if (side.calculated) {
        warnings.push_back(
            {"calculatedFromSpectra", what + "; its colours were calculated from its spectra for "
                                             "D50, 2 degrees instead."});
    } else if (side.counted.illuminant != usualIlluminant ||
               side.counted.observer != usualObserver) {
        warnings.push_back({"otherLightOrObserver",
                            what + " and has no spectra to calculate from, so its colours are not "
                                   "those for D50, 2 degrees that the tolerances are meant for."});
    }
}

void warnOfDifference(const Side& target, const Side& measured, std::vector<Warning>& warnings) {
    const auto warn = [&](const char* code, const char* what, const std::string& a,
                          const std::string& b, const char* unit) {
        if (a != b) {
            warnings.push_back({code,
                                std::string("Target and measurement are for different ") + what +
                                    ": " + a + " and " + b + unit + ".",
                                true});
        }
    };
    warn("illuminantsDiffer", "illuminants", target.counted.illuminant, measured.counted.illuminant,
         "");
    warn("observersDiffer", "observers", target.counted.observer, measured.counted.observer,
         " degrees");
}

void warnOfMeasuring(const Side& target, const Side& measured,
                     const tolerancePresetParameterRecord& preset, bool required,
                     std::vector<Warning>& warnings) {
    const std::string& ofTarget = target.stated.measurement;
    const std::string& ofMeasured = measured.stated.measurement;
    if (!ofTarget.empty() && !ofMeasured.empty() && ofTarget != ofMeasured) {
        warnings.push_back({"measurementConditionsDiffer",
                            "Target and measurement state different measurement conditions: " +
                                ofTarget + " and " + ofMeasured + ".",
                            required});
    }
    const int wanted = preset.illuminationCondition;
    if (wanted < 0 || wanted > largestMeasuringCondition) {
        return;
    }
    const std::string asked = "M" + std::to_string(wanted);
    for (const Side* side : {&target, &measured}) {
        if (const std::string& stated = side->stated.measurement;
            !stated.empty() && stated != asked) {
            warnings.push_back({"presetConditionDiffers",
                                "The preset is meant for the measurement condition " + asked +
                                    ", and the " + side->role + " states " + stated + ".",
                                required});
        }
    }
    if (required && ofMeasured.empty()) {
        warnings.push_back({"measurementConditionUnknown",
                            "The preset requires the measurement condition " + asked +
                                ", and the measurement states none.",
                            true});
    }
}

} // namespace

std::vector<Warning> conditionWarnings(const Comparison& c,
                                       const tolerancePresetParameterRecord& preset,
                                       const PresetOptions& options) {
    const Side target = sideOf("target", c.target);
    const Side measured = sideOf("measurement", c.measurement);
    std::vector<Warning> warnings;
    warnOfLight(target, warnings);
    warnOfLight(measured, warnings);
    warnOfDifference(target, measured, warnings);
    warnOfMeasuring(target, measured, preset, options.conditionRequired, warnings);
    return warnings;
}

} // namespace analysis
