// SPDX-License-Identifier: Apache-2.0
#include "analysis/ResultJson.h"

#include "analysis/InkNames.h"
#include "analysis/JsonWriter.h"
#include "analysis/MeasuresJson.h"
#include "analysis/Version.h"
#include "base/WideBytes.h"
#include "colour/Identity.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;

/// Texts that may be absent are null then, so that an empty text always means a stated one.
void optionalMember(JsonWriter& json, std::string_view name, const std::string& text) {
    json.key(name);
    if (text.empty()) {
        json.null();
    } else {
        json.text(text);
    }
}

template<class Write>
void memberIf(JsonWriter& json, bool given, std::string_view name, Write write) {
    json.key(name);
    if (given) {
        write();
    } else {
        json.null();
    }
}

void writeProgram(JsonWriter& json, const char* key, const char* name, const char* version) {
    json.key(key);
    json.beginCompactObject();
    json.member("name", name);
    json.member("version", version);
    json.endObject();
}

void writePreset(JsonWriter& json, const tolerancePresetParameterRecord& preset,
                 const PresetOptions& options) {
    json.key("preset");
    json.beginObject();
    json.member("id", std::int64_t{preset.presetID});
    json.member("name", base::utf8FromWide(preset.name.ToStdWstring()));
    json.member("file", base::utf8FromWide(preset.filePath.ToStdWstring()));
    json.member("psd", preset.fograPSDPreset > 0);
    json.member("illuminationCondition", std::int64_t{preset.illuminationCondition});
    json.member("conditionRequired", options.conditionRequired);
    json.member("repeats", repeatModeName(options.repeats));
    json.member("minimumGreys", std::int64_t{options.minimumGreys});
    json.key("inks");
    json.beginCompactArray();
    for (const std::string& ink : options.inks) {
        json.text(ink);
    }
    json.endArray();
    if (options.asksMeasures()) {
        writeMeasureOptions(json, options);
    }
    json.endObject();
}

std::string identityOf(const SharedFile& file) {
    return !file.identity.empty() ? file.identity
           : file.set             ? colour::identityOf(*file.set)
                                  : colour::identityOf(*file.profile);
}

void writeInput(JsonWriter& json, const char* key, const Input& input) {
    json.key(key);
    if (!input.file.isGiven()) {
        return json.null();
    }
    const bool isTarget = std::string_view(key) == "target";
    json.beginObject();
    json.member("path", base::utf8FromWide(input.path));
    json.member("kind", input.file.profile ? "profile" : "text");
    if (isTarget) {
        optionalMember(json, "identity", identityOf(input.file));
    }
    json.key("patches");
    if (!input.file.set) {
        json.null();
        optionalMember(json, "description", input.file.profile->description());
        json.endObject();
        return;
    }
    const DataSet& set = *input.file.set;
    json.integer(static_cast<std::int64_t>(set.patchCount));
    optionalMember(json, "description", set.descriptor);
    optionalMember(json, "originator", set.originator);
    optionalMember(json, "created", set.created);
    optionalMember(json, "instrumentation", set.instrumentation);
    optionalMember(json, "printing", set.printing);
    optionalMember(json, "illuminant", set.conditions.illuminant);
    optionalMember(json, "observer", set.conditions.observer);
    optionalMember(json, "measurementCondition", set.conditions.measurement);
    json.member("calculatedFromSpectra", set.calculated);
    json.endObject();
}

void writePairing(JsonWriter& json, const Comparison& c) {
    const auto count = [](const auto& rows) { return static_cast<std::int64_t>(rows.size()); };
    json.key("pairing");
    json.beginObject();
    json.member("selection", c.selection == &c.patchSet ? "patchSet"
                             : c.selection == &c.target ? "target"
                                                        : "measurement");
    json.member("target", pairedByName(c.target.pairing.by));
    json.member("measurement", pairedByName(c.measurement.pairing.by));
    json.member("paired", static_cast<std::int64_t>(c.patchCount()));
    json.member("unpairedTarget", count(c.target.unpaired));
    json.member("unpairedMeasurement", count(c.measurement.unpaired));
    json.member("unpairedPatchSet", count(c.patchSet.unpaired));
    json.endObject();
}

void writeRepeats(JsonWriter& json, const RepeatSpread& spread, bool each) {
    json.key("repeats");
    json.beginObject();
    json.member("patches", static_cast<std::int64_t>(spread.patches));
    json.member("readings", static_cast<std::int64_t>(spread.readings));
    memberIf(json, spread.patches > 0, "meanDistance", [&] { json.number(spread.mean); });
    memberIf(json, spread.patches > 0, "largestDistance", [&] { json.number(spread.largest); });
    memberIf(json, spread.patches > 0, "worstPatch",
             [&] { json.integer(static_cast<std::int64_t>(spread.worst)); });
    if (each) {
        writeRepeatedPatches(json, spread);
    }
    json.endObject();
}

void writeStatistics(JsonWriter& json, const Statistics& s) {
    json.key("statistics");
    json.beginObject();
    json.member("count", static_cast<std::int64_t>(s.count));
    json.member("mean", s.mean);
    json.member("median", s.median);
    json.member("percentile95", s.percentile95);
    json.member("maximum", s.maximum);
    json.member("standardDeviation", s.standardDeviation);
    json.endObject();
}

/// A criterion that the preset does not name is a figure and no judgement, whatever its tolerance
/// of 0 would make of it.
const char* outcomeOf(const Finding& finding, bool named) {
    if (!finding.answered) {
        return "unanswered";
    }
    if (!named) {
        return "unjudged";
    }
    return finding.passed ? "pass" : "fail";
}

void writeFinding(JsonWriter& json, const Finding& finding) {
    const Criterion& criterion = *finding.criterion;
    const bool named = finding.used || finding.tolerance != 0;
    json.beginCompactObject();
    memberIf(json, criterion.index != noEntry, "index", [&] { json.integer(criterion.index); });
    json.member("name", criterion.name);
    json.member("title", criterion.title);
    json.member("unit", unit(criterion.quantity));
    json.member("used", finding.used);
    json.member("outcome", outcomeOf(finding, named));
    memberIf(json, named, "tolerance", [&] { json.number(finding.tolerance); });
    memberIf(json, named, "decimals", [&] { json.integer(finding.decimals); });
    memberIf(json, finding.answered, "value", [&] { json.number(finding.value); });
    memberIf(json, finding.answered && named, "rounded", [&] { json.number(finding.rounded); });
    json.member("patches", static_cast<std::int64_t>(finding.patches));
    memberIf(json, finding.answered, "worstPatch",
             [&] { json.integer(static_cast<std::int64_t>(finding.worst)); });
    json.member("needed", static_cast<std::int64_t>(finding.needed));
    json.member("found", static_cast<std::int64_t>(finding.found));
    memberIf(json, finding.listed > 0, "listed",
             [&] { json.integer(static_cast<std::int64_t>(finding.listed)); });
    json.endObject();
}

void writeCriteria(JsonWriter& json, const std::vector<Finding>& findings) {
    json.key("criteria");
    json.beginArray();
    for (const Finding& finding : findings) {
        writeFinding(json, finding);
    }
    json.endArray();
}

void writeWarnings(JsonWriter& json, const std::vector<Warning>& ofComparison,
                   const std::vector<Warning>& ofPreset) {
    json.key("warnings");
    json.beginArray();
    for (const auto* warnings : {&ofComparison, &ofPreset}) {
        for (const Warning& warning : *warnings) {
            json.beginCompactObject();
            json.member("code", warning.code);
            json.member("text", warning.text);
            json.member("keepsOpen", warning.keepsOpen);
            json.endObject();
        }
    }
    json.endArray();
}

void writeLab(JsonWriter& json, const Lab& lab) {
    json.beginArray();
    json.number(lab.L);
    json.number(lab.a);
    json.number(lab.b);
    json.endArray();
}

void writeDevice(JsonWriter& json, const double* device, std::size_t channels) {
    json.beginArray();
    for (std::size_t i = 0; i < channels; ++i) {
        json.number(device[i]);
    }
    json.endArray();
}

std::string_view labelOf(const std::vector<std::string>& labels, std::size_t row) {
    return labels.empty() ? std::string_view() : labels[row];
}

void writeIdAndName(JsonWriter& json, const DataSet& set, std::size_t row) {
    json.text(labelOf(set.ids, row));
    json.text(labelOf(set.names, row));
}

/// Rows of one file that nothing was compared with; of a target, which may be a chart larger than
/// the strip, none are listed.
void writeUnpaired(JsonWriter& json, const char* key, const Input& input, bool isListed) {
    json.key(key);
    json.beginArray();
    for (const std::uint32_t row : isListed ? input.unpaired : std::vector<std::uint32_t>()) {
        const DataSet& set = *input.file.set;
        const std::size_t channels = set.channels.size();
        json.beginCompactArray();
        writeIdAndName(json, set, row);
        writeDevice(json, channels ? &set.device[row * channels] : nullptr, channels);
        json.endArray();
    }
    json.endArray();
}

void writeColumns(JsonWriter& json, const Comparison& c, const PresetOptions& options) {
    json.key("patchColumns");
    json.beginCompactArray();
    for (const char* column : {"id", "name", "device", "target", "measured", "difference",
                               "measuredId", "measuredName"}) {
        json.text(column);
    }
    json.endArray();
    json.key("deviceChannels");
    json.beginCompactArray();
    for (const std::string& channel : channelNames(c, options.inks)) {
        json.text(channel);
    }
    json.endArray();
}

/// The labels of a patch on the sheet, unless its row already begins with them.
void writeMeasuredLabels(JsonWriter& json, const DataSet& selection, std::size_t selectedRow,
                         const DataSet& measurement, std::size_t measuredRow) {
    const std::string_view id = labelOf(measurement.ids, measuredRow);
    const std::string_view name = labelOf(measurement.names, measuredRow);
    if (id == labelOf(selection.ids, selectedRow) &&
        name == labelOf(selection.names, selectedRow)) {
        return;
    }
    json.text(id);
    json.text(name);
}

void writePatches(JsonWriter& json, const Comparison& c) {
    const DataSet& labels = *c.selection->file.set;
    const DataSet* const onSheet = c.measurement.file.set.get();
    const std::size_t channels = c.devices ? c.devices->file.set->channels.size() : 0;
    json.key("patches");
    json.beginArray();
    for (std::size_t patch = 0; patch < c.patchCount(); ++patch) {
        json.beginCompactArray();
        writeIdAndName(json, labels, c.selectedRow[patch]);
        writeDevice(json, c.devices ? c.deviceOf(patch) : nullptr, channels);
        writeLab(json, c.targetLab[patch]);
        writeLab(json, c.measuredLab[patch]);
        json.number(c.difference[patch]);
        if (onSheet && onSheet != &labels) {
            writeMeasuredLabels(json, labels, c.selectedRow[patch], *onSheet,
                                c.measurement.rows[patch]);
        }
        json.endArray();
    }
    json.endArray();
}

} // namespace

void writeFindings(JsonWriter& json, const Comparison& c, const Judgement& judgement,
                   const tolerancePresetParameterRecord& preset, const PresetOptions& options) {
    json.member("verdict", verdictName(judgement.verdict));
    json.member("passed", judgement.verdict == Verdict::Passed);
    json.key("formula");
    json.beginCompactObject();
    json.member("name", colour::formulaName(c.formula));
    json.member("number", static_cast<std::int64_t>(c.formula));
    json.endObject();
    writePreset(json, preset, options);
    json.key("inputs");
    json.beginObject();
    writeInput(json, "target", c.target);
    writeInput(json, "measurement", c.measurement);
    writeInput(json, "patchSet", c.patchSet);
    json.endObject();
    writePairing(json, c);
    writeStatistics(json, judgement.statistics);
    writeRepeats(json, c.spread, options.asks(Quantity::Spread));
    if (options.asksMeasures()) {
        writeMeasures(json, c, judgement.measures, options);
    }
    writeCriteria(json, judgement.findings);
    writeWarnings(json, c.warnings, judgement.warnings);
}

std::wstring resultJson(const Comparison& c, const Judgement& judgement,
                        const tolerancePresetParameterRecord& preset,
                        const PresetOptions& options) {
    constexpr std::size_t charactersOfHead = 8192;
    constexpr std::size_t charactersOfPatch = 96;
    JsonWriter json(charactersOfHead + c.patchCount() * charactersOfPatch);
    json.beginObject();
    json.member("format", "tintgate-result");
    json.member("formatVersion", std::int64_t{1});
    writeProgram(json, "tool", "Tintgate", toolVersion);
    writeProgram(json, "library", "libTintgate", libraryVersion);
    writeFindings(json, c, judgement, preset, options);
    json.key("unpaired");
    json.beginObject();
    writeUnpaired(json, "target", c.target, false);
    writeUnpaired(json, "measurement", c.measurement, true);
    writeUnpaired(json, "patchSet", c.patchSet, true);
    json.endObject();
    writeColumns(json, c, options);
    writePatches(json, c);
    json.endObject();
    json.endLine();
    return json.finish();
}

} // namespace analysis
