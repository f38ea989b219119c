// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/ListText.h"

#include <vector>

#include "analysis/Presets.h"
#include "base/WideBytes.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-check/Shelves.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

using report::Cell;
using report::Painter;
using report::Tone;

using Lines = std::vector<std::vector<Cell>>;

std::string section(const std::string& title, const Lines& lines, const Painter& paint) {
    return paint(Tone::Bold, title) + '\n' + report::tableText(lines, paint) + '\n';
}

std::string conditionsText(const Conditions& conditions, const Painter& paint) {
    if (conditions.all.empty()) {
        return paint(Tone::Bold,
                     say(Say::ListNoConditions, {userFolder() + "/conditions.toml",
                                                 systemFolder() + "/conditions.toml"})) +
               "\n\n";
    }
    Lines lines;
    for (const Condition& condition : conditions.all) {
        const bool isDefault = condition.name == conditions.defaultName;
        lines.push_back({{condition.name, Tone::Bold},
                         {condition.target},
                         {condition.preset},
                         {isDefault ? say(Say::ListDefault) : "", Tone::Soft}});
    }
    return section(say(Say::ListConditions, {conditions.file}), lines, paint);
}

std::string presetsText(const Conditions& conditions, const Painter& paint) {
    std::string text;
    for (const std::string& folder : presetFolders(conditions)) {
        Lines lines;
        for (const PresetEntry& entry : presetsIn(folder)) {
            tolerancePresetParameterRecord preset;
            analysis::PresetFault fault;
            const bool isSound = analysis::readPreset(entry.path, false, preset, &fault) == 0;
            lines.push_back(
                {{entry.shortName, Tone::Bold},
                 {isSound ? std::to_string(preset.presetID) : "", Tone::Plain, true},
                 {isSound ? base::utf8FromWide(preset.name.ToStdWstring()) : fault.description,
                  isSound ? Tone::Plain : Tone::Failed}});
        }
        text += section(say(Say::ListPresets, {folder}), lines, paint);
    }
    return text.empty() ? paint(Tone::Bold, say(Say::ListNoPresets)) + "\n\n" : text;
}

std::string dataSetsText(const Conditions& conditions, const Painter& paint) {
    std::string text;
    for (const std::string& folder : dataSetFolders(conditions)) {
        Lines lines;
        for (const DataSetEntry& entry : dataSetsIn(folder)) {
            colour::ColourFile file;
            if (colour::loadColourFile(entry.path, {.spectra = false}, file) !=
                    colour::Failure::None ||
                (file.set && !file.set->hasColour())) {
                continue;
            }
            lines.push_back(
                {{entry.name, Tone::Bold},
                 {file.set ? say(Say::ListPatches, {std::to_string(file.set->patchCount)})
                           : say(Say::ListProfile),
                  Tone::Plain, true},
                 {file.set ? file.set->descriptor : file.profile->description(), Tone::Soft}});
        }
        text += section(say(Say::ListDataSets, {folder}), lines, paint);
    }
    return text.empty() ? paint(Tone::Bold, say(Say::ListNoDataSets)) + '\n' : text;
}

} // namespace

std::string listText(const Conditions& conditions, const Painter& paint) {
    std::string text = conditionsText(conditions, paint) + presetsText(conditions, paint) +
                       dataSetsText(conditions, paint);
    while (text.ends_with("\n\n")) {
        text.pop_back();
    }
    return text;
}

} // namespace check
