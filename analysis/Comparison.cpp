// SPDX-License-Identifier: Apache-2.0
#include "analysis/Comparison.h"

#include <algorithm>
#include <map>
#include <numeric>
#include <utility>

#include "ExitCodes.h"
#include "analysis/PaperAims.h"
#include "analysis/PatchKinds.h"
#include "analysis/Repeats.h"
#include "analysis/Status.h"
#include "base/WideBytes.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;

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
        if (!set.hasDevice() || varies(set)) {
            return false;
        }
        for (const Input* other : {&c.target, &c.measurement, &c.patchSet}) {
            if (other->file.set && other->file.set->deviceSpace == set.deviceSpace &&
                other->file.set->patchCount == set.patchCount && varies(*other->file.set)) {
                return true;
            }
        }
        return false;
    };
    for (Input* input : {&c.target, &c.measurement}) {
        if (!input->file.set || !isPlaceholder(*input->file.set)) {
            continue;
        }
        auto without = std::make_shared<DataSet>(*input->file.set); // Others may share the file.
        without->deviceSpace = colour::DeviceSpace::None;
        without->channels.clear();
        without->device.clear();
        input->file = {std::move(without), nullptr, {}};
        c.warnings.push_back(
            {"deviceValuesIgnored", std::string("The device values of the ") + roleOf(c, *input) +
                                        " are the same in every row and were not used."});
    }
}

Input* selectionOf(Comparison& c) {
    for (Input* input : {&c.patchSet, &c.target, &c.measurement}) {
        if (input->file.set) {
            return input;
        }
    }
    return nullptr;
}

const Input* devicesOf(const Comparison& c) {
    const Input* const inputs[] = {c.selection, &c.target, &c.measurement};
    for (const Input* input : inputs) {
        if (input->file.set && input->file.set->hasCmyk()) {
            return input;
        }
    }
    for (const Input* input : inputs) {
        if (input->file.set && input->file.set->hasDevice()) {
            return input;
        }
    }
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

bool has(const Comparison& c, const Input& input, std::uint32_t selectedRow) {
    if (input.file.profile) {
        return isProcessOnly(*c.selection->file.set, selectedRow);
    }
    return input.pairing.partner[selectedRow] != noRow;
}

/// The k-th of the rows that a file has for a row of the selection: its partner, then the repeats,
/// then from the first on again.
std::uint32_t rowInTurn(const Input& input, std::uint32_t selectedRow,
                        const std::vector<std::uint32_t>& again, std::size_t k) {
    if (!input.file.set) {
        return noRow;
    }
    k %= again.size() + 1;
    return k == 0 ? input.pairing.partner[selectedRow] : again[k - 1];
}

void addPatch(Comparison& c, std::uint32_t selectedRow, std::uint32_t targetRow,
              std::uint32_t measuredRow) {
    c.selectedRow.push_back(selectedRow);
    if (c.target.file.set) {
        c.target.rows.push_back(targetRow);
    }
    if (c.measurement.file.set) {
        c.measurement.rows.push_back(measuredRow);
    }
}

/// Repeats make further patches: each row that pairs again adds one.
void addRepeatedRows(Comparison& c) {
    struct Again {
        std::vector<std::uint32_t> target, measurement;
    };
    std::map<std::uint32_t, Again> repeats;
    for (const RowPair& pair : c.target.pairing.again) {
        repeats[pair.left].target.push_back(pair.right);
    }
    for (const RowPair& pair : c.measurement.pairing.again) {
        repeats[pair.left].measurement.push_back(pair.right);
    }
    for (const auto& [row, again] : repeats) {
        if (!has(c, c.target, row) || !has(c, c.measurement, row)) {
            continue;
        }
        const std::size_t count = std::max(again.target.size(), again.measurement.size());
        for (std::size_t k = 1; k <= count; ++k) {
            addPatch(c, row, rowInTurn(c.target, row, again.target, k),
                     rowInTurn(c.measurement, row, again.measurement, k));
        }
    }
}

/// The patches are those of the selection that both sides have.
int selectPatches(Comparison& c) {
    c.selection = selectionOf(c);
    if (!c.selection) {
        return exitNoDeviceValues; // two profiles, and nothing that says where to evaluate them
    }
    c.devices = devicesOf(c);
    for (Input* input : {&c.target, &c.measurement, &c.patchSet}) {
        if (input->file.isGiven()) {
            if (const int status = pair(c, *input)) {
                return status;
            }
        }
    }

    const auto rows = static_cast<std::uint32_t>(c.selection->file.set->patchCount);
    c.selectedRow.reserve(rows);
    for (Input* side : {&c.target, &c.measurement}) {
        if (side->file.set) {
            side->rows.reserve(rows);
        }
    }
    for (std::uint32_t row = 0; row < rows; ++row) {
        if (has(c, c.target, row) && has(c, c.measurement, row)) {
            addPatch(c, row, rowInTurn(c.target, row, {}, 0), rowInTurn(c.measurement, row, {}, 0));
        } else {
            c.selection->unpaired.push_back(row);
        }
    }
    addRepeatedRows(c);
    c.patchSet.rows = c.patchSet.file.set ? c.selectedRow : std::vector<std::uint32_t>();
    // A patch set picks from the files, so what it leaves there is not missed.
    if (c.selection == &c.target && c.measurement.file.set) {
        c.measurement.unpaired =
            rowsLeft(c.measurement.pairing, c.measurement.file.set->patchCount);
    }
    return c.selectedRow.empty() ? exitNothingToPair : exitDone;
}

/// Lab values of one side for the selected patches.
int labOf(const Comparison& c, const Input& side, std::vector<Lab>& lab) {
    const std::size_t count = c.selectedRow.size();
    lab.resize(count);
    if (side.file.set) {
        for (std::size_t i = 0; i < count; ++i) {
            lab[i] = side.file.set->lab[side.rows[i]];
        }
        return exitDone;
    }
    const DataSet& selection = *c.selection->file.set;
    const std::size_t channels = selection.channels.size();
    std::vector<double> cmyk(count * 4);
    for (std::size_t i = 0; i < count; ++i) {
        for (std::size_t ink = 0; ink < 4; ++ink) {
            cmyk[i * 4 + ink] = selection.device[c.selectedRow[i] * channels + ink];
        }
    }
    return statusOf(side.file.profile->evaluate(cmyk.data(), count, 4, lab.data()));
}

/// REQUIRES: groupOf is filled, and nothing is averaged yet.
Readings readingsOf(const Comparison& c, RepeatMode mode) {
    Readings readings;
    readings.targetRow = c.target.rows;
    readings.measuredRow = c.measurement.rows;
    readings.deviceRow = c.devices ? c.devices->rows : std::vector<std::uint32_t>();
    readings.target = c.targetLab;
    readings.measured = c.measuredLab;
    readings.patch = c.groupOf; // what averaging numbers its patches by
    if (mode == RepeatMode::Each) {
        std::iota(readings.patch.begin(), readings.patch.end(), 0U);
    }
    return readings;
}

std::string patches(std::size_t count) {
    return std::to_string(count) + (count == 1 ? " patch" : " patches");
}

/// Warns of ways of finding the patches of one side that leave a doubt.
void warnOfPairing(Comparison& c, const Input& side) {
    const std::string role = roleOf(c, side);
    const Pairing& pairing = side.pairing;
    if (pairing.spacesDiffer) {
        c.warnings.push_back({"deviceSpacesDiffer",
                              "The device values of the " + role + " and of the " +
                                  roleOf(c, *c.selection) +
                                  " are of different kinds, so nothing proves that equal labels "
                                  "or places mean equal patches.",
                              true});
    }
    if (pairing.by == PairedBy::Order) {
        c.warnings.push_back({"pairedByOrder",
                              "The patches of the " + role +
                                  " were taken in their order: neither device values nor ids "
                                  "could tell them apart.",
                              true});
    }
    if (pairing.by == PairedBy::Labels && (pairing.spacesDiffer || pairing.contradicted > 0)) {
        c.warnings.push_back(
            {"pairedByLabels",
             "The patches of the " + role + " were found by their labels alone" +
                 (pairing.contradicted > 0 ? ", and ids and names contradict each other for " +
                                                 patches(pairing.contradicted) + "."
                                           : ", although both files have device values.")});
    }
    if (pairing.rounded > 0) {
        c.warnings.push_back(
            {"pairedByRoundedValues", patches(pairing.rounded) + " of the " + role +
                                          " matched in whole percents of the device values only."});
    }
}

/// Of a target, which may be a chart larger than the strip, rows without counterpart are no news.
void warnOfUnpaired(Comparison& c, const Input& input) {
    if (!input.unpaired.empty() && &input != &c.target) {
        c.warnings.push_back({"patchesUnpaired", patches(input.unpaired.size()) + " of the " +
                                                     roleOf(c, input) + " had no counterpart."});
    }
}

void passOnNotes(Comparison& c) {
    for (const Input* input : {&c.target, &c.measurement, &c.patchSet}) {
        if (input->file.set) {
            for (const std::string& note : input->file.set->notes) {
                c.warnings.push_back(
                    {"readerNote", std::string("In the ") + roleOf(c, *input) + ": " + note});
            }
        }
    }
}

} // namespace

const char* repeatModeName(RepeatMode mode) {
    return mode == RepeatMode::Mean ? "mean" : "each";
}

colour::CgatsWants targetWants(const ComparisonWants& wants, const std::string& condition) {
    return {.spectra = wants.targetSpectra, .singleInks = wants.singleInks, .condition = condition};
}

colour::CgatsWants measurementWants(const ComparisonWants& wants, const std::string& condition) {
    return {.spectra = wants.spectra, .singleInks = wants.singleInks, .condition = condition};
}

int compare(const ComparisonPaths& paths, const ComparisonWants& wants, Comparison& c) {
    // A fault of the measurement precedes one of the patch set.
    References references;
    if (const int status =
            loadReferences(paths.target, {}, targetWants(wants, paths.condition), references)) {
        return status;
    }
    SharedFile measurement;
    if (const int status =
            loadSide(paths.measurement, measurementWants(wants, paths.condition), measurement)) {
        return status;
    }
    references.patchSetPath = paths.patchSet;
    if (!paths.patchSet.empty()) {
        if (const int status = loadPatchSet(paths.patchSet, references.patchSet)) {
            return status;
        }
    }
    return compare(references, paths.measurement, std::move(measurement), wants, c);
}

int compare(const References& references, const std::wstring& path, SharedFile measurement,
            const ComparisonWants& wants, Comparison& c) {
    c.formula = wants.formula;
    c.repeatMode = wants.repeats;
    c.target.path = references.targetPath;
    c.target.file = references.target;
    c.measurement.path = path;
    c.measurement.file = std::move(measurement);
    c.patchSet.path = references.patchSetPath;
    c.patchSet.file = references.patchSet;
    dropPlaceholders(c);
    if (const int status = selectPatches(c)) {
        return status;
    }
    if (const int status = labOf(c, c.target, c.targetLab)) {
        return status;
    }
    if (const int status = labOf(c, c.measurement, c.measuredLab)) {
        return status;
    }
    findRepeats(c);
    if (wants.readings) {
        c.readings = readingsOf(c, wants.repeats);
    }
    if (wants.repeats == RepeatMode::Mean) {
        averageRepeats(c);
    }
    if (wants.readings || wants.paperAims != PaperAims::Absolute) {
        if (const int status = adjustAims(wants.paperAims, c)) {
            return status;
        }
    }

    c.difference.resize(c.selectedRow.size());
    for (std::size_t i = 0; i < c.difference.size(); ++i) {
        c.difference[i] = colour::difference(wants.formula, c.targetLab[i], c.measuredLab[i]);
    }

    for (const Input* side : {&c.target, &c.measurement}) {
        warnOfPairing(c, *side);
    }
    for (const Input* input : {&c.target, &c.measurement, &c.patchSet}) {
        warnOfUnpaired(c, *input);
    }
    passOnNotes(c);
    return exitDone;
}

void warnOfSameFile(Comparison& c) {
    c.warnings.push_back({"sameFile", "Target and measurement are the same file."});
}

} // namespace analysis
