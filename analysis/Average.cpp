// SPDX-License-Identifier: Apache-2.0
#include "analysis/Average.h"

#include <algorithm>
#include <cstdint>
#include <functional>
#include <utility>

#include "analysis/Pairing.h"
#include "colour/Difference.h"

namespace analysis {
namespace {

using colour::DataSet;
using colour::Lab;
using colour::Xyz;

/// For each set the rows that go with those of the first.
using Rows = std::vector<std::vector<std::uint32_t>>;

std::string number(std::size_t set) {
    return "measurement " + std::to_string(set + 1);
}

bool sameAxis(const colour::SpectralAxis& a, const colour::SpectralAxis& b) {
    return a.base == b.base && a.step == b.step && a.length == b.length;
}

std::string pairAll(const std::vector<DataSet>& sets, Rows& rows) {
    rows.push_back(pairWithItself(sets[0].patchCount).partner);
    for (std::size_t i = 1; i < sets.size(); ++i) {
        if (sets[i].patchCount != sets[0].patchCount) {
            return number(i) + " has " + std::to_string(sets[i].patchCount) +
                   " patches, and the first has " + std::to_string(sets[0].patchCount);
        }
        if (sets[i].conditions != sets[0].conditions) {
            return number(i) + " states another measurement condition, illuminant or observer "
                               "than the first";
        }
        Pairing pairing = pairSets(sets[0], sets[i]);
        if (pairing.by == PairedBy::Order || pairing.spacesDiffer) {
            return "nothing tells which patches of " + number(i) + " are which of the first";
        }
        if (pairing.paired != sets[0].patchCount || !pairing.again.empty()) {
            return std::to_string(sets[0].patchCount - pairing.paired) +
                   " patches of the first "
                   "have no counterpart in " +
                   number(i);
        }
        rows.push_back(std::move(pairing.partner));
    }
    return {};
}

Xyz& operator+=(Xyz& sum, const Xyz& xyz) {
    sum = {sum.X + xyz.X, sum.Y + xyz.Y, sum.Z + xyz.Z};
    return sum;
}

Xyz operator/(const Xyz& xyz, double count) {
    return {xyz.X / count, xyz.Y / count, xyz.Z / count};
}

void averageSpectra(const std::vector<DataSet>& sets, const Rows& rows, DataSet& mean) {
    const auto length = static_cast<std::size_t>(mean.axis.length);
    for (std::size_t row = 0; row < mean.patchCount; ++row) {
        double* const to = &mean.spectra[row * length];
        for (std::size_t i = 1; i < sets.size(); ++i) {
            const double* const from = sets[i].spectrumOf(rows[i][row]);
            std::transform(from, from + length, to, to, std::plus<>());
        }
        std::for_each(to, to + length,
                      [&](double& value) { value /= static_cast<double>(sets.size()); });
    }
}

PatchSpread spreadOf(const std::vector<Lab>& readings, const Lab& mean) {
    PatchSpread spread;
    for (std::size_t i = 0; i < readings.size(); ++i) {
        const double distance = colour::deltaE2000(mean, readings[i]);
        spread.mean += distance / static_cast<double>(readings.size());
        if (distance > spread.largest) {
            spread.largest = distance;
            spread.furthest = i;
        }
    }
    return spread;
}

} // namespace

std::string average(const std::vector<DataSet>& sets, Average& result) {
    Rows rows;
    if (std::string problem = pairAll(sets, rows); !problem.empty()) {
        return problem;
    }
    Average made;
    made.mean = sets[0];
    DataSet& mean = made.mean;
    mean.descriptor = "Mean of " + std::to_string(sets.size()) + " measurements";
    made.hasSpectra = std::all_of(sets.begin(), sets.end(), [&](const DataSet& set) {
        return set.axis.length > 0 && sameAxis(set.axis, sets[0].axis);
    });
    if (made.hasSpectra) {
        averageSpectra(sets, rows, mean);
    } else {
        mean.spectra.clear();
        mean.axis = {};
    }
    const auto count = static_cast<double>(sets.size());
    std::vector<Lab> readings(sets.size());
    for (std::size_t row = 0; row < mean.patchCount; ++row) {
        Xyz stated;
        Xyz ofLab;
        for (std::size_t i = 0; i < sets.size(); ++i) {
            readings[i] = sets[i].lab[rows[i][row]];
            ofLab += colour::xyzFromLab(readings[i]);
            stated += sets[i].xyz[rows[i][row]];
        }
        mean.xyz[row] = stated / count;
        mean.lab[row] = colour::labFromXyz(ofLab / count);
        made.spread.push_back(spreadOf(readings, mean.lab[row]));
    }
    result = std::move(made);
    return {};
}

} // namespace analysis
