// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/ServerLookups.h"

#include <algorithm>
#include <cstdlib>
#include <sstream>

#include "analysis/Instruments.h"
#include "analysis/Presets.h"
#include "colour/CgatsText.h"
#include "companions/tintgate-report/CheckPreset.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/ServerPaths.h"
#include "jobkeys/Tickets.h"

namespace report {

using namespace jobkeys;

namespace {

std::string fileOf(store::StoreEngine& store, const std::string& path) {
    std::ostringstream bytes;
    try {
        store.getFile(path, bytes);
    } catch (const store::StoreFailure& failure) {
        if (failure.status != store::Fault::NoFile && failure.status != store::Fault::BadPath) {
            throw;
        }
        return {};
    }
    return std::move(bytes).str();
}

std::string nameOf(int device) {
    if (device <= 0) {
        return {};
    }
    return analysis::instrumentName(static_cast<unsigned>(device), installedPresets());
}

} // namespace

const Preset& ServerLookups::preset(int id, const std::string& installFolder) {
    const auto [at, fresh] = m_presets.try_emplace({id, installFolder});
    if (!fresh || id <= 0) {
        return at->second;
    }
    at->second.name = textOf(m_store.key(presetType, id, "Name"));
    const std::string bytes = fileOf(m_store, presetPath(installFolder, id));
    tolerancePresetParameterRecord values;
    if (!bytes.empty() && analysis::parsePreset(bytes, true, values) == 0) {
        at->second.values = values;
    } else {
        m_missing.insert(id);
    }
    return at->second;
}

std::string ServerLookups::instrument(const store::TicketContent& job, Strip strip) {
    if (isDynamic(strip, integerOf(job.find("Footer/Dynstrip/UseDynstrip")).value_or(0))) {
        return nameOf(integerOf(job.find("Footer/Dynstrip/DeviceID")).value_or(0));
    }
    const std::string name =
        fixedStripName(strip, [&](const std::string& key) { return textOf(job.find(key)); });
    if (name.empty()) {
        return {};
    }
    const std::string path = controlStripPath(textOf(job.find("System/InstallFolder")), name);
    const auto [at, fresh] = m_strips.try_emplace(path);
    if (fresh) {
        if (const auto device = colour::cgatsKeyword(fileOf(m_store, path), "DEVICE")) {
            at->second = nameOf(std::atoi(device->c_str()));
        }
    }
    return at->second;
}

} // namespace report
