// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Averaging.h"

#include <algorithm>
#include <numeric>

#include "analysis/Average.h"
#include "colour/CgatsText.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Files.h"
#include "companions/tintgate-report/PatchesCsv.h"
#include "companions/tintgate-store/Bytes.h"
#include "report/Model.h"

namespace report {
namespace {

using colour::DataSet;

constexpr std::size_t mostListed = 10;

DataSet load(const std::string& path) {
    colour::ColourFile file;
    switch (colour::loadColourFile(path, {}, file)) {
    case colour::Failure::None:
        break;
    case colour::Failure::Missing:
    case colour::Failure::Unreadable:
        throw Failure(Status::Unreadable, "can't read " + path);
    default:
        throw Failure(Status::Broken, path + " is no measurement that can be used");
    }
    if (!file.set || !file.set->hasColour()) {
        throw Failure(Status::Broken, path + " holds no measured colours");
    }
    return std::move(*file.set);
}

std::string labelOf(const DataSet& set, std::size_t row) {
    const std::string id = set.ids.empty() ? "" : set.ids[row];
    const std::string name = set.names.empty() || set.names[row] == id ? "" : set.names[row];
    std::string label = id + (id.empty() || name.empty() ? "" : " ") + name;
    if (label.empty()) {
        label = "row " + std::to_string(row + 1);
    }
    const std::size_t channels = set.channels.size();
    for (std::size_t i = 0; i < channels; ++i) {
        const double value = set.device[row * channels + i];
        label += (i == 0 ? " (" : " ") + fixedText(value, value == static_cast<int>(value) ? 0 : 2);
    }
    return label + (channels > 0 ? ")" : "");
}

std::string spreadCsv(const analysis::Average& average) {
    const DataSet& set = average.mean;
    std::string csv = "id,name";
    for (const std::string& channel : set.channels) {
        csv += ',';
        appendCsvText(csv, channel);
    }
    csv += ",mean_distance,largest_distance,furthest_measurement\n";
    for (std::size_t row = 0; row < set.patchCount; ++row) {
        appendCsvText(csv, set.ids.empty() ? "" : set.ids[row]);
        csv += ',';
        appendCsvText(csv, set.names.empty() ? "" : set.names[row]);
        for (std::size_t i = 0; i < set.channels.size(); ++i) {
            csv += ',';
            appendCsvNumber(csv, set.device[row * set.channels.size() + i]);
        }
        const analysis::PatchSpread& spread = average.spread[row];
        for (const double value : {spread.mean, spread.largest}) {
            csv += ',';
            appendCsvNumber(csv, value);
        }
        csv += ',' + std::to_string(spread.furthest + 1) + '\n';
    }
    return csv;
}

std::string summaryOf(const analysis::Average& average, const AverageOptions& options) {
    const auto& spread = average.spread;
    std::vector<std::size_t> order(spread.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::stable_sort(order.begin(), order.end(), [&](std::size_t a, std::size_t b) {
        return spread[a].largest > spread[b].largest;
    });
    double sum = 0;
    for (const analysis::PatchSpread& one : spread) {
        sum += one.mean;
    }
    std::string text = std::to_string(options.measurements.size()) + " measurements of " +
                       std::to_string(spread.size()) + " patches, averaged in " +
                       (average.hasSpectra ? "reflectance" : "XYZ") + ".\n" +
                       "Distance of a reading from the mean of its patch (CIEDE2000): average " +
                       fixedText(sum / static_cast<double>(spread.size()), 2) + ", largest " +
                       fixedText(spread[order[0]].largest, 2) + ".\n";
    for (std::size_t i = 0; i < std::min(mostListed, order.size()); ++i) {
        const analysis::PatchSpread& one = spread[order[i]];
        text += "  " + fixedText(one.largest, 2) + "  " +
                admin::printable(labelOf(average.mean, order[i])) +
                (one.largest > 0 ? ", in " + admin::printable(options.measurements[one.furthest])
                                 : "") +
                '\n';
    }
    return text;
}

} // namespace

std::string averageFiles(const AverageOptions& options) {
    std::vector<DataSet> sets;
    for (const std::string& path : options.measurements) {
        sets.push_back(load(path));
    }
    analysis::Average average;
    if (const std::string problem = analysis::average(sets, average); !problem.empty()) {
        throw Failure(Status::NotOneChart, "the measurements can't be averaged: " + problem);
    }
    writeOutput(options.output, colour::writeCgats(average.mean));
    if (!options.spread.empty()) {
        writeOutput(options.spread, spreadCsv(average));
    }
    return summaryOf(average, options);
}

} // namespace report
