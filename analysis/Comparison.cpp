#include "analysis/Comparison.h"

#include <algorithm>

#include "ExitCodes.h"
#include "analysis/Status.h"
#include "analysis/Text.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;

int load(const std::wstring& path, const colour::CgatsWants& wants, Input& input) {
    input.path = path;
    return statusOf(colour::loadColourFile(narrowed(path), wants, input.file));
}

int loadSide(const std::wstring& path, const colour::CgatsWants& wants, Input& input) {
    if (const int status = load(path, wants, input))
        return status;
    return input.file.set && !input.file.set->hasColour() ? exitNoColourValues : exitDone;
}

/// A patch set selects by process colours, so it must be a text that has them.
int loadPatchSet(const std::wstring& path, Input& input) {
    if (const int status = load(path, {.spectra = false}, input))
        return status;
    if (input.file.profile)
        return exitPatchSetNotText;
    return input.file.set->hasCmyk() ? exitDone : exitNoDeviceValues;
}

int loadAll(const ComparisonPaths& paths, bool keepSpectra, Comparison& c) {
    const std::string& condition = paths.condition;
    if (const int status = loadSide(paths.target, {false, condition}, c.target))
        return status;
    if (const int status = loadSide(paths.measurement, {keepSpectra, condition}, c.measurement))
        return status;
    return paths.patchSet.empty() ? exitDone : loadPatchSet(paths.patchSet, c.patchSet);
}

const char* roleOf(const Comparison& c, const Input& input) {
    return &input == &c.target ? "target" : &input == &c.measurement ? "measurement" : "patch set";
}

/// Whether device values tell any patches apart.
bool varies(const DataSet& set) {
    const auto channels = static_cast<std::ptrdiff_t>(set.channels.size());
    return !std::equal(set.device.begin() + channels, set.device.end(), set.device.begin());
}

/// Tickets without device values come as texts of zeros. Against a file of as many patches whose
/// values vary, such columns were never filled in, and would make every patch paper.
void dropPlaceholders(Comparison& c) {
    const auto isPlaceholder = [&](const DataSet& set) {
        if (!set.hasDevice() || varies(set))
            return false;
        for (const Input* other : {&c.target, &c.measurement, &c.patchSet})
            if (other->file.set && other->file.set->deviceSpace == set.deviceSpace &&
                other->file.set->patchCount == set.patchCount && varies(*other->file.set))
                return true;
        return false;
    };
    for (Input* input : {&c.target, &c.measurement}) {
        if (!input->file.set || !isPlaceholder(*input->file.set))
            continue;
        input->file.set->deviceSpace = colour::DeviceSpace::None;
        input->file.set->channels.clear();
        input->file.set->device.clear();
        c.warnings.push_back(
            {"deviceValuesIgnored", std::string("The device values of the ") + roleOf(c, *input) +
                                        " are the same in every row and were not used."});
    }
}

Input* selectionOf(Comparison& c) {
    for (Input* input : {&c.patchSet, &c.target, &c.measurement})
        if (input->file.set)
            return input;
    return nullptr;
}

const Input* devicesOf(const Comparison& c) {
    const Input* const inputs[] = {c.selection, &c.target, &c.measurement};
    for (const Input* input : inputs)
        if (input->file.set && input->file.set->hasCmyk())
            return input;
    for (const Input* input : inputs)
        if (input->file.set && input->file.set->hasDevice())
            return input;
    return nullptr;
}

/// Finds the selection's patches in one of the files.
int pair(const Comparison& c, Input& input) {
    const DataSet& selection = *c.selection->file.set;
    if (&input == c.selection) {
        input.pairing = pairWithItself(selection.patchCount);
        return exitDone;
    }
    if (input.file.profile) {
        input.pairing.by = PairedBy::Profile;
        return selection.hasCmyk() ? exitDone : exitNoDeviceValues;
    }
    input.pairing = pairSets(selection, *input.file.set);
    return input.pairing.paired > 0 ? exitDone : exitNothingToPair;
}

bool has(const Input& input, std::uint32_t selectedRow) {
    return input.file.profile || input.pairing.partner[selectedRow] != noRow;
}

/// The patches are those of the selection that both sides have.
int selectPatches(Comparison& c) {
    c.selection = selectionOf(c);
    if (!c.selection)
        return exitNoDeviceValues; // two profiles, and nothing that says where to evaluate them
    c.devices = devicesOf(c);
    for (Input* input : {&c.target, &c.measurement, &c.patchSet})
        if (input->file.set || input->file.profile)
            if (const int status = pair(c, *input))
                return status;

    const auto rows = static_cast<std::uint32_t>(c.selection->file.set->patchCount);
    c.selectedRow.reserve(rows);
    for (std::uint32_t row = 0; row < rows; ++row) {
        if (has(c.target, row) && has(c.measurement, row))
            c.selectedRow.push_back(row);
        else
            c.selection->unpaired.push_back(row);
    }
    // A patch set picks from the files, so what it leaves there is not missed.
    if (c.selection == &c.target && c.measurement.file.set)
        c.measurement.unpaired =
            rowsLeft(c.measurement.pairing, c.measurement.file.set->patchCount);
    return c.selectedRow.empty() ? exitNothingToPair : exitDone;
}

/// Lab values of one side for the selected patches.
int labOf(const Comparison& c, const Input& side, std::vector<Lab>& lab) {
    const std::size_t count = c.selectedRow.size();
    lab.resize(count);
    if (side.file.set) {
        for (std::size_t i = 0; i < count; ++i)
            lab[i] = side.file.set->lab[c.rowOf(side, i)];
        return exitDone;
    }
    const DataSet& selection = *c.selection->file.set;
    const std::size_t channels = selection.channels.size();
    std::vector<double> cmyk(count * 4);
    for (std::size_t i = 0; i < count; ++i)
        for (std::size_t ink = 0; ink < 4; ++ink)
            cmyk[i * 4 + ink] = selection.device[c.selectedRow[i] * channels + ink];
    return statusOf(side.file.profile->evaluate(cmyk.data(), count, 4, lab.data()));
}

std::string patches(std::size_t count) {
    return std::to_string(count) + (count == 1 ? " patch" : " patches");
}

void warnOfPairing(Comparison& c) {
    for (const Input* input : {&c.target, &c.measurement}) {
        const std::string role = roleOf(c, *input);
        if (input->pairing.by == PairedBy::Order)
            c.warnings.push_back(
                {"pairedByOrder", "The patches of the " + role +
                                      " were taken in their order: neither device values nor ids "
                                      "could tell them apart."});
        if (input->pairing.rounded > 0)
            c.warnings.push_back({"pairedByRoundedValues",
                                  patches(input->pairing.rounded) + " of the " + role +
                                      " matched in whole percents of the device values only."});
    }
    for (const Input* input : {&c.target, &c.measurement, &c.patchSet})
        if (!input->unpaired.empty())
            c.warnings.push_back({"patchesUnpaired", patches(input->unpaired.size()) + " of the " +
                                                         roleOf(c, *input) +
                                                         " had no counterpart."});
}

colour::Conditions conditionsOf(const Input& input) {
    if (input.file.set)
        return input.file.set->conditions;
    return {.illuminant = "D50", .observer = "2", .measurement = {}}; // as profiles are evaluated
}

/// Differences between sets under different conditions are no differences of print.
void warnOfConditions(Comparison& c) {
    const colour::Conditions target = conditionsOf(c.target);
    const colour::Conditions measured = conditionsOf(c.measurement);
    const auto warn = [&](const char* code, const char* what, const std::string& a,
                          const std::string& b) {
        if (!a.empty() && !b.empty() && a != b)
            c.warnings.push_back({code, std::string("Target and measurement state different ") +
                                            what + ": " + a + " and " + b + "."});
    };
    warn("illuminantsDiffer", "illuminants", target.illuminant, measured.illuminant);
    warn("observersDiffer", "observers", target.observer, measured.observer);
    warn("measurementConditionsDiffer", "measurement conditions", target.measurement,
         measured.measurement);
}

void passOnNotes(Comparison& c) {
    for (const Input* input : {&c.target, &c.measurement, &c.patchSet})
        if (input->file.set)
            for (const std::string& note : input->file.set->notes)
                c.warnings.push_back(
                    {"readerNote", std::string("In the ") + roleOf(c, *input) + ": " + note});
}

} // namespace

int compare(const ComparisonPaths& paths, colour::Formula formula, bool keepSpectra,
            Comparison& c) {
    c.formula = formula;
    if (const int status = loadAll(paths, keepSpectra, c))
        return status;
    dropPlaceholders(c);
    if (const int status = selectPatches(c))
        return status;
    if (const int status = labOf(c, c.target, c.targetLab))
        return status;
    if (const int status = labOf(c, c.measurement, c.measuredLab))
        return status;

    c.difference.resize(c.selectedRow.size());
    for (std::size_t i = 0; i < c.difference.size(); ++i)
        c.difference[i] = colour::difference(formula, c.targetLab[i], c.measuredLab[i]);

    warnOfConditions(c);
    warnOfPairing(c);
    passOnNotes(c);
    return exitDone;
}

} // namespace analysis
