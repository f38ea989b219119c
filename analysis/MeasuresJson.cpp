// SPDX-License-Identifier: Apache-2.0
//   "papers": {"aims": "corrected", "adjusted": true, "target": [95, 1, -4],
//              "measured": [93, 0, -1], "difference": 2.9, "darkest": [9, 0, 0]},
//   "tones": {"method": "density", "inks": [{"channel": 0, "aims": "A", "steps": [
//       [50, 66.3, 66, 1, 12]]}], "midToneSpreads": [[50, 1.2]]},
//   "spotTones": {"aims": "nominal", "inks": [{"channel": 4, "steps": [[50, 51, 50, 1, 7]]}]},
//   "greys": {"weights": "equal", "rows": [[3, 50, 1, [58, 0.4, -2], [0.5, -2]]]}
#include "analysis/MeasuresJson.h"

#include <algorithm>
#include <optional>

namespace analysis {
namespace {

using colour::Lab;

void writeLab(JsonWriter& json, const char* key, const std::optional<Lab>& lab) {
    json.key(key);
    if (!lab) {
        return json.null();
    }
    json.beginArray();
    json.number(lab->L);
    json.number(lab->a);
    json.number(lab->b);
    json.endArray();
}

void writePapers(JsonWriter& json, const Papers& papers) {
    json.key("papers");
    json.beginCompactObject();
    json.member("aims", paperAimsName(papers.aims));
    json.member("adjusted", papers.adjusted);
    writeLab(json, "target", papers.target);
    writeLab(json, "measured", papers.measured);
    json.key("difference");
    if (papers.target && papers.measured) {
        json.number(colour::deltaE2000(*papers.target, *papers.measured));
    } else {
        json.null();
    }
    writeLab(json, "darkest", papers.darkest);
    json.endObject();
}

void writeInk(JsonWriter& json, const InkTones& ink, const char* aims) {
    json.beginCompactObject();
    json.member("channel", static_cast<std::int64_t>(ink.channel));
    if (aims != nullptr) {
        json.member("aims", aims);
    }
    json.key("steps");
    json.beginArray();
    for (const ToneStep& step : ink.steps) {
        json.beginArray();
        json.number(step.nominal);
        json.number(step.measured);
        json.number(step.aim);
        json.integer(static_cast<std::int64_t>(step.readings));
        json.integer(static_cast<std::int64_t>(step.patch));
        json.endArray();
    }
    json.endArray();
    json.endObject();
}

void writeTones(JsonWriter& json, const Measures& measures) {
    json.key("tones");
    json.beginObject();
    const bool isAnswered = std::any_of(measures.tones.begin(), measures.tones.end(),
                                        [](const InkTones& ink) { return !ink.steps.empty(); });
    json.key("method");
    if (isAnswered) {
        json.text(measures.byDensity ? "density" : "colorimetric");
    } else {
        json.null();
    }
    json.key("inks");
    json.beginArray();
    for (const InkTones& ink : measures.tones) {
        writeInk(json, ink, toneAimsName(ink.aims));
    }
    json.endArray();
    json.key("midToneSpreads");
    json.beginCompactArray();
    for (const MidToneSpread& spread : measures.spreads) {
        json.beginArray();
        json.number(spread.nominal);
        json.number(spread.spread);
        json.endArray();
    }
    json.endArray();
    json.endObject();
}

void writeSpotTones(JsonWriter& json, const Measures& measures, bool fromTarget) {
    json.key("spotTones");
    json.beginObject();
    json.member("aims", fromTarget ? "target" : "nominal");
    json.key("inks");
    json.beginArray();
    for (const InkTones& ink : measures.spotTones) {
        writeInk(json, ink, nullptr);
    }
    json.endArray();
    json.endObject();
}

void writeGreys(JsonWriter& json, const Comparison& c, const Measures& measures,
                GreyWeights weights) {
    json.key("greys");
    json.beginObject();
    json.member("weights", greyWeightsName(weights));
    json.key("rows");
    json.beginArray();
    for (std::size_t i = 0; i < measures.greys.size(); ++i) {
        const Grey& grey = measures.greys[i];
        const Lab& measured = c.measuredAsIs(grey.patch);
        json.beginCompactArray();
        json.integer(static_cast<std::int64_t>(grey.patch));
        json.number(grey.tone);
        json.number(grey.weight);
        json.beginArray();
        json.number(measured.L);
        json.number(measured.a);
        json.number(measured.b);
        json.endArray();
        if (measures.greyAims.empty()) {
            json.null();
        } else {
            json.beginArray();
            json.number(measures.greyAims[i].a);
            json.number(measures.greyAims[i].b);
            json.endArray();
        }
        json.endArray();
    }
    json.endArray();
    json.endObject();
}

} // namespace

void writeMeasureOptions(JsonWriter& json, const PresetOptions& options) {
    json.member("paper", paperAimsName(options.paperAims));
    json.member("toneAims", toneAimsName(options.toneAims));
    json.member("toneAimsBlack", toneAimsName(options.toneAimsBlack.value_or(options.toneAims)));
    json.member("spotToneAims", options.spotToneFromTarget ? "target" : "nominal");
    json.member("greyWeights", greyWeightsName(options.greyWeights));
}

void writeRepeatedPatches(JsonWriter& json, const RepeatSpread& spread) {
    json.key("each");
    json.beginArray();
    for (const RepeatedPatch& repeated : spread.each) {
        json.beginCompactArray();
        json.integer(static_cast<std::int64_t>(repeated.patch));
        json.integer(static_cast<std::int64_t>(repeated.readings));
        json.number(repeated.mean);
        json.number(repeated.largest);
        json.endArray();
    }
    json.endArray();
}

void writeMeasures(JsonWriter& json, const Comparison& c, const Measures& measures,
                   const PresetOptions& options) {
    writePapers(json, c.papers);
    if (options.asks(Quantity::Tone)) {
        writeTones(json, measures);
    }
    if (options.asks(Quantity::SpotTone)) {
        writeSpotTones(json, measures, options.spotToneFromTarget);
    }
    if (options.asks(Quantity::GreyCh)) {
        writeGreys(json, c, measures, options.greyWeights);
    }
}

} // namespace analysis
