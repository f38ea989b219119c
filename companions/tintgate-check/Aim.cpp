// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Aim.h"

#include <filesystem>
#include <vector>

#include "ExitCodes.h"
#include "base/WideBytes.h"
#include "colour/Identity.h"
#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Shelves.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;

constexpr const char* usualPreset = "contract-proof";

bool isThere(const std::string& path) {
    std::error_code ignored;
    return fs::exists(fs::status(path, ignored));
}

[[noreturn]] void failName(std::string what, std::string remedy) {
    throw Failure(Status::BadCommand, {0, std::move(what), {}, std::move(remedy)});
}

/// "Did you mean ...?" if one of the names is similar, and where all can be seen.
std::string hint(std::string_view name, const std::vector<std::string>& names) {
    const std::string similar = similarName(name, names);
    return (similar.empty() ? "" : say(Say::DidYouMean, {similar}) + " ") + say(Say::SeeList);
}

std::vector<std::string> conditionNames(const Conditions& conditions) {
    std::vector<std::string> names;
    for (const Condition& condition : conditions.all) {
        names.push_back(condition.name);
    }
    return names;
}

const Condition* conditionOf(const Conditions& conditions, const AimWanted& wanted) {
    const std::string& name = wanted.condition.empty() ? conditions.defaultName : wanted.condition;
    if (name.empty() || (wanted.condition.empty() && !wanted.target.empty())) {
        return nullptr; // a target of the command line has nothing to do with the default condition
    }
    if (const Condition* const found = conditions.find(name)) {
        return found;
    }
    const std::string what = say(Say::NoSuchCondition, {name});
    if (!findPreset(conditions, name).empty()) {
        failName(what, say(Say::ConditionIsPreset, {name}));
    }
    if (isThere(name) || !findDataSet(conditions, name).empty()) {
        failName(what, say(Say::ConditionIsDataSet, {name}));
    }
    failName(what, hint(name, conditionNames(conditions)));
}

std::vector<std::string> dataSetNames(const Conditions& conditions, bool withEndings) {
    std::vector<std::string> names;
    for (const std::string& folder : dataSetFolders(conditions)) {
        for (const DataSetEntry& entry : dataSetsIn(folder)) {
            const std::string file = entry.name.substr(entry.name.rfind('/') + 1);
            names.push_back(withEndings ? file : file.substr(0, file.rfind('.')));
        }
    }
    return names;
}

/// The file that a name means. A bare name of the command line may also be that of a file here.
std::string fileOf(const Conditions& conditions, const std::string& name, bool ofCommandLine) {
    const std::string path = ofCommandLine ? name : pathFrom(conditions, name);
    const bool isBare = path.find('/') == path.npos;
    if ((!isBare || ofCommandLine) && isThere(path)) {
        return path;
    }
    if (const std::string found = findDataSet(conditions, name); !found.empty()) {
        return found;
    }
    if (!isBare) {
        return path; // which is reported as missing
    }
    if (conditions.find(name) != nullptr) {
        failName(say(Say::NoSuchDataSet, {name}), say(Say::PresetIsCondition, {name}));
    }
    std::string folders;
    for (const std::string& folder : dataSetFolders(conditions)) {
        folders += (folders.empty() ? "" : ", ") + folder;
    }
    const std::string similar =
        similarName(name, dataSetNames(conditions, name.find('.') != name.npos));
    const std::string remedy = (similar.empty() ? "" : say(Say::DidYouMean, {similar}) + " ") +
                               say(Say::NoSuchDataSetRemedy, {folders});
    throw Failure(Status::NotDone, {exitInputMissing, say(Say::NoSuchDataSet, {name}), {}, remedy});
}

std::string presetPathOf(const Conditions& conditions, const std::string& name,
                         bool ofCommandLine) {
    if (const std::string found = findPreset(conditions, name); !found.empty()) {
        return found;
    }
    const std::string path = ofCommandLine ? name : pathFrom(conditions, name);
    if (path.find('/') != path.npos || path.ends_with(".xml") || isThere(path)) {
        return path;
    }
    std::vector<std::string> names;
    for (const std::string& folder : presetFolders(conditions)) {
        for (const PresetEntry& entry : presetsIn(folder)) {
            names.push_back(entry.shortName);
        }
    }
    const bool isCondition = conditions.find(name) != nullptr;
    failName(say(Say::NoSuchPreset, {name}),
             isCondition ? say(Say::PresetIsCondition, {name}) : hint(name, names));
}

void loadPreset(Aim& aim) {
    analysis::PresetFault fault;
    if (const int code = analysis::readPreset(aim.presetPath, false, aim.preset, &fault)) {
        Problem problem = problemOf(code);
        problem.what = say(Say::PresetTrouble, {problem.what}) + " (" + aim.presetPath + ")";
        if (fault.line != 0) {
            problem.cause = say(Say::PresetFault, {std::to_string(fault.line), fault.description});
            problem.remedy = say(Say::PresetFaultRemedy);
        }
        throw Failure(Status::NotDone, std::move(problem));
    }
    if (const int code = analysis::readPresetOptions(aim.preset, aim.options)) {
        throw Failure(Status::NotDone, problemOf(code));
    }
    aim.wants = analysis::wantsOf(aim.preset, aim.options);
    aim.measurementCondition = analysis::conditionOf(aim.preset);
}

[[noreturn]] void failFile(Say trouble, int code, const std::string& path) {
    Problem problem = problemOfFile(code, path);
    problem.what = say(trouble, {problem.what}) + " (" + path + ")";
    throw Failure(Status::NotDone, std::move(problem));
}

void loadReferences(Aim& aim) {
    const std::wstring target = base::wideFromBytes(aim.targetPath);
    const auto wants = analysis::targetWants(aim.wants, aim.measurementCondition);
    if (const int code = analysis::loadReferences(target, {}, wants, aim.references)) {
        failFile(Say::TargetTrouble, code, aim.targetPath);
    }
    // Each result states it.
    analysis::SharedFile& loaded = aim.references.target;
    loaded.identity =
        loaded.set ? colour::identityOf(*loaded.set) : colour::identityOf(*loaded.profile);
    if (aim.patchSetPath.empty()) {
        return;
    }
    aim.references.patchSetPath = base::wideFromBytes(aim.patchSetPath);
    if (const int code =
            analysis::loadPatchSet(aim.references.patchSetPath, aim.references.patchSet)) {
        failFile(Say::PatchSetTrouble, code, aim.patchSetPath);
    }
}

} // namespace

Aim loadAim(const Conditions& conditions, const AimWanted& wanted) {
    const Condition none;
    const Condition* const found = conditionOf(conditions, wanted);
    const Condition& condition = found != nullptr ? *found : none;
    if (wanted.target.empty() && condition.target.empty()) {
        failName(say(Say::NothingToHoldAgainst), say(Say::NothingToHoldAgainstRemedy));
    }

    Aim aim;
    aim.condition = condition.name;
    aim.paper = condition.paper;
    aim.printer = condition.printer;
    const auto chosen = [](const std::string& ofCommandLine, const std::string& ofCondition) {
        return ofCommandLine.empty() ? ofCondition : ofCommandLine;
    };
    aim.targetPath =
        fileOf(conditions, chosen(wanted.target, condition.target), !wanted.target.empty());
    const std::string preset = chosen(wanted.preset, condition.preset);
    aim.presetPath =
        presetPathOf(conditions, preset.empty() ? usualPreset : preset, !wanted.preset.empty());
    const std::string patchSet = chosen(wanted.patchSet, condition.patchSet);
    if (!patchSet.empty()) {
        aim.patchSetPath = fileOf(conditions, patchSet, !wanted.patchSet.empty());
    }
    loadPreset(aim);
    loadReferences(aim);
    return aim;
}

} // namespace check
