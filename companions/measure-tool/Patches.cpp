// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Patches.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <map>
#include <numeric>
#include <string>
#include <utility>

#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

using colour::DataSet;
using Labels = std::vector<std::string>;
using Rows = std::vector<std::size_t>;

constexpr std::size_t none = ~std::size_t{0};

/// Other software exports integer percents, or percents converted from 0 to 255.
constexpr double rounding = 0.51; ///< In percent.

/// With more unpaired patches than this, nearly all are wrong, and a message can name any of them.
constexpr std::size_t mostCompared = 2000;

[[noreturn]] void refuse(const std::string& text) {
    throw Failure(Status::OtherPatches, text);
}

/// Pairs equal keys: the first of the chart with the first of the measurement, and so on. A patch
/// without a counterpart gets no row.
template<class Key>
Rows pairByKeys(const std::vector<Key>& chart, const std::vector<Key>& measured) {
    std::map<Key, Rows> rowsOf;
    for (std::size_t row = measured.size(); row-- > 0;) {
        rowsOf[measured[row]].push_back(row); // the first row is at the back
    }
    Rows rows;
    for (const Key& key : chart) {
        const auto found = rowsOf.find(key);
        const bool missing = found == rowsOf.end() || found->second.empty();
        rows.push_back(missing ? none : found->second.back());
        if (!missing) {
            found->second.pop_back();
        }
    }
    return rows;
}

std::size_t firstWithout(const Rows& rows) {
    return static_cast<std::size_t>(std::find(rows.begin(), rows.end(), none) - rows.begin());
}

std::size_t countOfPairs(const Rows& rows) {
    return rows.size() - static_cast<std::size_t>(std::count(rows.begin(), rows.end(), none));
}

/// Rows from 0 to `count` that belong to no patch.
Rows unpaired(const Rows& rows, std::size_t count) {
    std::vector<bool> paired(count);
    for (const std::size_t row : rows) {
        if (row != none) {
            paired[row] = true;
        }
    }
    Rows left;
    for (std::size_t row = 0; row < count; ++row) {
        if (!paired[row]) {
            left.push_back(row);
        }
    }
    return left;
}

std::string nameOf(const DataSet& set, std::size_t patch) {
    return set.ids.empty() ? std::to_string(patch + 1) : set.ids[patch];
}

// Device values ------------------------------------------------------------------------------

/// Missing channels count as 0, so a process chart matches one with unused spot channels.
double deviceValue(const DataSet& set, std::size_t patch, std::size_t channel) {
    const std::size_t channels = set.channels.size();
    return channel < channels ? set.device[patch * channels + channel] : 0;
}

std::size_t channelsOf(const DataSet& chart, const DataSet& measured) {
    return std::max(chart.channels.size(), measured.channels.size());
}

bool alike(const DataSet& chart, std::size_t patch, const DataSet& measured, std::size_t row) {
    for (std::size_t channel = 0; channel < channelsOf(chart, measured); ++channel) {
        if (std::abs(deviceValue(chart, patch, channel) - deviceValue(measured, row, channel)) >
            rounding) {
            return false;
        }
    }
    return true;
}

/// Device values in hundredths of a percent, the precision of sets with the same origin.
std::vector<std::vector<long>> deviceKeys(const DataSet& set, std::size_t channels) {
    std::vector<std::vector<long>> keys(set.patchCount, std::vector<long>(channels));
    for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
        for (std::size_t channel = 0; channel < channels; ++channel) {
            keys[patch][channel] = std::lround(100 * deviceValue(set, patch, channel));
        }
    }
    return keys;
}

bool comparableDevices(const DataSet& chart, const DataSet& measured) {
    if (!chart.hasDevice() || chart.deviceSpace != measured.deviceSpace) {
        return false;
    }
    return chart.deviceSpace != colour::DeviceSpace::Other || chart.channels == measured.channels;
}

/// Assigns similar rows to patches without a row.
void pairAlike(const DataSet& chart, const DataSet& measured, Rows& rows) {
    Rows left = unpaired(rows, measured.patchCount);
    if (left.size() > mostCompared) {
        return;
    }
    for (std::size_t patch = 0; patch < rows.size(); ++patch) {
        if (rows[patch] != none) {
            continue;
        }
        const auto row = std::find_if(left.begin(), left.end(), [&](std::size_t candidate) {
            return alike(chart, patch, measured, candidate);
        });
        if (row != left.end()) {
            rows[patch] = *row;
            left.erase(row);
        }
    }
}

/// Reports the problem: for the strip's order if that fits better, otherwise for any order.
[[noreturn]] void refuseDevices(const DataSet& chart, const DataSet& measured, Rows rows) {
    std::size_t inOrder = 0;
    std::size_t differing = none;
    for (std::size_t patch = chart.patchCount; patch-- > 0;) {
        const bool fits = alike(chart, patch, measured, patch);
        inOrder += fits ? 1 : 0;
        differing = fits ? differing : patch;
    }
    pairAlike(chart, measured, rows);
    const std::size_t pairs = countOfPairs(rows);
    if (pairs == rows.size()) {
        refuse("the patches are in another order and their device values are rounded: they must "
               "be in the strip's order, or not rounded");
    }
    if (inOrder > 0 && inOrder >= pairs) {
        refuse("patch " + nameOf(chart, differing) + " should be " + deviceText(chart, differing) +
               ", and row " + std::to_string(differing + 1) + " is " +
               deviceText(measured, differing));
    }
    const std::size_t missing = firstWithout(rows);
    const std::size_t surplus = unpaired(rows, measured.patchCount).front();
    refuse("there is no patch " + nameOf(chart, missing) + ", which is " +
           deviceText(chart, missing) + ", and row " + std::to_string(surplus + 1) + ", which is " +
           deviceText(measured, surplus) + ", was not requested");
}

Rows matchDevices(const DataSet& chart, const DataSet& measured) {
    Rows rows(chart.patchCount);
    std::iota(rows.begin(), rows.end(), std::size_t{0});
    if (std::all_of(rows.begin(), rows.end(),
                    [&](std::size_t patch) { return alike(chart, patch, measured, patch); })) {
        return rows;
    }
    const std::size_t channels = channelsOf(chart, measured);
    rows = pairByKeys(deviceKeys(chart, channels), deviceKeys(measured, channels));
    if (firstWithout(rows) < rows.size()) {
        refuseDevices(chart, measured, std::move(rows));
    }
    return rows;
}

// Labels -------------------------------------------------------------------------------------

/// "0012" becomes "12"; other labels are unchanged.
Labels withoutZeros(Labels labels) {
    for (std::string& label : labels) {
        if (label.find_first_not_of("0123456789") == label.npos) {
            label.erase(0, std::min(label.find_first_not_of('0'), label.size() - 1));
        }
    }
    return labels;
}

/// True if the labels are the numbers 1 to N, in any order.
bool areCounted(const Labels& labels) {
    Labels present = withoutZeros(labels);
    Labels counted;
    for (std::size_t number = 1; number <= labels.size(); ++number) {
        counted.push_back(std::to_string(number));
    }
    std::sort(present.begin(), present.end());
    std::sort(counted.begin(), counted.end());
    return present == counted;
}

Rows pairLabels(const Labels& wanted, const Labels& present) {
    Rows rows = pairByKeys(wanted, present);
    if (firstWithout(rows) < rows.size()) {
        rows = pairByKeys(withoutZeros(wanted), withoutZeros(present));
    }
    return rows;
}

Rows matchLabels(const DataSet& chart, const DataSet& measured, bool bareIds) {
    // An export may use the strip's ids as names.
    const std::pair<const Labels*, const Labels*> ways[] = {{&chart.ids, &measured.ids},
                                                            {&chart.names, &measured.names},
                                                            {&chart.ids, &measured.names},
                                                            {&chart.names, &measured.ids}};
    Rows best;
    const Labels* bestLabels = nullptr;
    bool onlyCounted = false;
    for (const auto& [wanted, present] : ways) {
        if (wanted->empty() || present->empty()) {
            continue;
        }
        Rows rows = pairLabels(*wanted, *present);
        if (firstWithout(rows) == rows.size()) {
            if (bareIds || !areCounted(*wanted)) {
                return rows;
            }
            onlyCounted = true;
        } else if (bestLabels == nullptr || countOfPairs(rows) > countOfPairs(best)) {
            best = std::move(rows);
            bestLabels = wanted;
        }
    }
    if (onlyCounted) {
        refuse("only the ids 1 to " + std::to_string(chart.patchCount) +
               " identify the patches, and every strip of this size has these; the setting "
               "match = ids accepts them");
    }
    if (bestLabels == nullptr) {
        refuse("neither device values nor ids identify the measured patches");
    }
    refuse("there is no patch " + (*bestLabels)[firstWithout(best)]);
}

} // namespace

std::vector<std::size_t> matchPatches(const DataSet& chart, const DataSet& measured, bool bareIds) {
    if (chart.patchCount != measured.patchCount) {
        refuse("there are " + std::to_string(measured.patchCount) + " patches, but " +
               std::to_string(chart.patchCount) + " were requested");
    }
    if (chart.hasDevice() && measured.hasDevice() && !comparableDevices(chart, measured)) {
        refuse("the device values are of other colorants");
    }
    return chart.hasDevice() && measured.hasDevice() ? matchDevices(chart, measured)
                                                     : matchLabels(chart, measured, bareIds);
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

} // namespace measuretool
