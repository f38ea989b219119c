// SPDX-License-Identifier: Apache-2.0
#include "analysis/PaperAims.h"

#include <algorithm>
#include <array>

#include "ExitCodes.h"
#include "analysis/PatchKinds.h"
#include "analysis/Status.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;
using colour::Xyz;

constexpr double black[] = {100, 100, 100, 100};

std::vector<std::size_t> paperPatches(const Comparison& c) {
    std::vector<std::size_t> patches;
    if (!c.devices || !c.devices->file.set->hasCmyk()) {
        return patches;
    }
    const std::size_t channels = c.devices->file.set->channels.size();
    for (std::size_t patch = 0; patch < c.patchCount(); ++patch) {
        if (isPaper(c.deviceOf(patch), channels)) {
            patches.push_back(patch);
        }
    }
    return patches;
}

Lab meanOf(const std::vector<Lab>& lab, const std::vector<std::size_t>& patches) {
    Xyz sum;
    for (const std::size_t patch : patches) {
        const Xyz xyz = colour::xyzFromLab(lab[patch]);
        sum = {sum.X + xyz.X, sum.Y + xyz.Y, sum.Z + xyz.Z};
    }
    const auto count = static_cast<double>(patches.size());
    return patches.size() == 1 ? lab[patches.front()]
                               : colour::labFromXyz({sum.X / count, sum.Y / count, sum.Z / count});
}

bool isBlack(const DataSet& set, std::size_t row) {
    const double* const device = &set.device[row * set.channels.size()];
    return isProcessOnly(set, row) && std::all_of(device, device + 4, [](double value) {
               return value >= 100 - deviceTolerance;
           });
}

/// What a correction leaves in place: see the header.
int darkestOf(const Comparison& c, Xyz& darkest) {
    if (c.target.file.profile) {
        Lab lab;
        const int status = statusOf(c.target.file.profile->evaluate(black, 1, 4, &lab));
        darkest = colour::xyzFromLab(lab);
        return status;
    }
    const DataSet& set = *c.target.file.set;
    darkest = {1e9, 1e9, 1e9};
    for (std::size_t row = 0; row < set.patchCount; ++row) {
        const Xyz xyz = colour::xyzFromLab(set.lab[row]);
        if (set.hasCmyk() && isBlack(set, row)) {
            darkest = xyz;
            return exitDone;
        }
        darkest = {std::min(darkest.X, xyz.X), std::min(darkest.Y, xyz.Y),
                   std::min(darkest.Z, xyz.Z)};
    }
    return exitDone;
}

/// A paper as dark as the darkest colour leaves nothing to correct between.
double corrected(double value, double paper, double newPaper, double darkest) {
    constexpr double smallestRange = 1e-6;
    return paper - darkest < smallestRange
               ? value
               : value + (newPaper - paper) * (value - darkest) / (paper - darkest);
}

int correct(Comparison& c) {
    Xyz darkest;
    if (const int status = darkestOf(c, darkest)) {
        return status;
    }
    c.papers.darkest = colour::labFromXyz(darkest);
    const Xyz paper = colour::xyzFromLab(*c.papers.target);
    const Xyz newPaper = colour::xyzFromLab(*c.papers.measured);
    for (Lab& lab : c.targetLab) {
        const Xyz xyz = colour::xyzFromLab(lab);
        lab = colour::labFromXyz({corrected(xyz.X, paper.X, newPaper.X, darkest.X),
                                  corrected(xyz.Y, paper.Y, newPaper.Y, darkest.Y),
                                  corrected(xyz.Z, paper.Z, newPaper.Z, darkest.Z)});
    }
    return exitDone;
}

void makeRelative(std::vector<Lab>& labs, const Lab& paperLab) {
    const Xyz paper = colour::xyzFromLab(paperLab);
    const Xyz white = colour::xyzFromLab({100, 0, 0});
    if (!(paper.X > 0 && paper.Y > 0 && paper.Z > 0)) {
        return;
    }
    for (Lab& lab : labs) {
        const Xyz xyz = colour::xyzFromLab(lab);
        lab = colour::labFromXyz(
            {xyz.X * white.X / paper.X, xyz.Y * white.Y / paper.Y, xyz.Z * white.Z / paper.Z});
    }
}

} // namespace

const char* paperAimsName(PaperAims aims) {
    switch (aims) {
    case PaperAims::Corrected:
        return "corrected";
    case PaperAims::Relative:
        return "relative";
    case PaperAims::Absolute:
        break;
    }
    return "absolute";
}

int adjustAims(PaperAims aims, Comparison& c) {
    c.papers.aims = aims;
    const std::vector<std::size_t> patches = paperPatches(c);
    if (patches.empty()) {
        return exitDone;
    }
    c.papers.target = meanOf(c.targetLab, patches);
    c.papers.measured = meanOf(c.measuredLab, patches);
    if (aims == PaperAims::Absolute) {
        return exitDone;
    }
    for (const std::size_t patch : patches) {
        c.papers.differences.emplace_back(
            patch, colour::difference(c.formula, c.targetLab[patch], c.measuredLab[patch]));
    }
    c.papers.adjusted = true;
    if (aims == PaperAims::Corrected) {
        return correct(c);
    }
    c.papers.measuredBefore = c.measuredLab;
    makeRelative(c.targetLab, *c.papers.target);
    makeRelative(c.measuredLab, *c.papers.measured);
    return exitDone;
}

} // namespace analysis
