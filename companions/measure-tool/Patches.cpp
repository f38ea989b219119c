#include "companions/measure-tool/Patches.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <map>
#include <numeric>
#include <string>
#include <utility>

#include "companions/measure-tool/Failure.h"

namespace measuring {
namespace {

using colour::DataSet;
using Rows = std::vector<std::size_t>;

/// Other software exports whole percents, or what 0 to 255 makes of them.
constexpr double rounding = 0.51; ///< In percent.

/// Channels that a set lacks are 0: a process chart goes with one that has unused spot channels.
double deviceValue(const DataSet& set, std::size_t patch, std::size_t channel) {
    const std::size_t channels = set.channels.size();
    return channel < channels ? set.device[patch * channels + channel] : 0;
}

/// Row by row in the order at hand. False, with the first row that differs, if they are not.
bool sameInOrder(const DataSet& chart, const DataSet& measured, std::size_t& differing) {
    const std::size_t channels = std::max(chart.channels.size(), measured.channels.size());
    for (std::size_t patch = 0; patch < chart.patchCount; ++patch)
        for (std::size_t channel = 0; channel < channels; ++channel)
            if (std::abs(deviceValue(chart, patch, channel) -
                         deviceValue(measured, patch, channel)) > rounding) {
                differing = patch;
                return false;
            }
    return true;
}

/// Pairs equal keys, the first of the chart with the first of the measurement. Gives rows up to the
/// first patch that has no counterpart.
template<class Key>
Rows pairByKeys(const std::vector<Key>& chart, const std::vector<Key>& measured) {
    std::map<Key, Rows> rowsOf;
    for (std::size_t row = measured.size(); row-- > 0;)
        rowsOf[measured[row]].push_back(row); // the first is at the back
    Rows rows;
    for (const Key& key : chart) {
        const auto found = rowsOf.find(key);
        if (found == rowsOf.end() || found->second.empty())
            break;
        rows.push_back(found->second.back());
        found->second.pop_back();
    }
    return rows;
}

/// Device values in hundredths of a percent, as sets of the same origin state them.
std::vector<std::vector<long>> deviceKeys(const DataSet& set, std::size_t channels) {
    std::vector<std::vector<long>> keys(set.patchCount, std::vector<long>(channels));
    for (std::size_t patch = 0; patch < set.patchCount; ++patch)
        for (std::size_t channel = 0; channel < channels; ++channel)
            keys[patch][channel] = std::lround(100 * deviceValue(set, patch, channel));
    return keys;
}

bool comparableDevices(const DataSet& chart, const DataSet& measured) {
    if (!chart.hasDevice() || chart.deviceSpace != measured.deviceSpace)
        return false;
    return chart.deviceSpace != colour::DeviceSpace::Other || chart.channels == measured.channels;
}

std::string nameOf(const DataSet& set, std::size_t patch) {
    return set.ids.empty() ? std::to_string(patch + 1) : set.ids[patch];
}

[[noreturn]] void refuse(const std::string& text) {
    throw Failure(Status::OtherPatches, text);
}

Rows matchDevices(const DataSet& chart, const DataSet& measured) {
    std::size_t differing = 0;
    if (sameInOrder(chart, measured, differing)) {
        Rows rows(chart.patchCount);
        std::iota(rows.begin(), rows.end(), std::size_t{0});
        return rows;
    }
    const std::size_t channels = std::max(chart.channels.size(), measured.channels.size());
    Rows rows = pairByKeys(deviceKeys(chart, channels), deviceKeys(measured, channels));
    if (rows.size() < chart.patchCount) {
        const std::size_t patch = std::max(rows.size(), differing);
        refuse("patch " + nameOf(chart, patch) + " should be " + deviceText(chart, patch) +
               ", and row " + std::to_string(patch + 1) + " is " + deviceText(measured, patch));
    }
    return rows;
}

Rows matchLabels(const DataSet& chart, const DataSet& measured) {
    // An export may call a name what the strip calls an id.
    const std::pair<const std::vector<std::string>*, const std::vector<std::string>*> ways[] = {
        {&chart.ids, &measured.ids},
        {&chart.names, &measured.names},
        {&chart.ids, &measured.names},
        {&chart.names, &measured.ids}};
    Rows best;
    bool labelled = false;
    for (const auto& [wanted, present] : ways) {
        if (wanted->empty() || present->empty())
            continue;
        labelled = true;
        Rows rows = pairByKeys(*wanted, *present);
        if (rows.size() == chart.patchCount)
            return rows;
        if (rows.size() > best.size())
            best = std::move(rows);
    }
    if (!labelled)
        refuse("neither device values nor ids tell which patches were measured");
    refuse("there is no patch " + nameOf(chart, best.size()));
}

} // namespace

std::vector<std::size_t> matchPatches(const DataSet& chart, const DataSet& measured) {
    if (chart.patchCount != measured.patchCount)
        refuse("there are " + std::to_string(measured.patchCount) + " patches where " +
               std::to_string(chart.patchCount) + " were asked for");
    if (chart.hasDevice() && measured.hasDevice() && !comparableDevices(chart, measured))
        refuse("the device values are of other colorants");
    return chart.hasDevice() && measured.hasDevice() ? matchDevices(chart, measured)
                                                     : matchLabels(chart, measured);
}

std::string deviceText(const DataSet& set, std::size_t patch) {
    std::string text;
    for (std::size_t channel = 0; channel < set.channels.size(); ++channel) {
        char number[32];
        std::snprintf(number, sizeof number, "%s%.4g", channel == 0 ? "" : " ",
                      deviceValue(set, patch, channel));
        text += number;
    }
    return text;
}

} // namespace measuring
