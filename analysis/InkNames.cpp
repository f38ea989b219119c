// SPDX-License-Identifier: Apache-2.0
#include "analysis/InkNames.h"

#include "colour/CgatsColumns.h"

namespace analysis {
namespace {

constexpr std::size_t processInks = 4;

bool isNamed(const std::string& channel) {
    return !colour::cgats::isNumberedInk(channel);
}

/// The name of a channel in one of the files. Null if none names it.
const std::string* nameInFiles(const Comparison& c, std::size_t channel, std::size_t count) {
    for (const Input* input : {c.devices, &c.target, &c.measurement, &c.patchSet}) {
        const auto& set = input->file.set;
        if (set && set->hasCmyk() && set->channels.size() == count &&
            isNamed(set->channels[channel])) {
            return &set->channels[channel];
        }
    }
    return nullptr;
}

} // namespace

std::vector<std::string> channelNames(const Comparison& c, const std::vector<std::string>& inks) {
    if (!c.devices) {
        return {};
    }
    const colour::DataSet& set = *c.devices->file.set;
    std::vector<std::string> names = set.channels;
    if (!set.hasCmyk()) {
        return names;
    }
    for (std::size_t i = processInks; i < names.size(); ++i) {
        if (const std::string* const name = nameInFiles(c, i, names.size())) {
            names[i] = *name;
        } else if (i - processInks < inks.size()) {
            names[i] = "SPOT_" + inks[i - processInks];
        } else {
            names[i] = "Channel " + std::to_string(i + 1);
        }
    }
    return names;
}

} // namespace analysis
