// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Targets.h"

#include <algorithm>
#include <cmath>
#include <ctime>
#include <sstream>

#include "colour/ColourFile.h"
#include "colour/Difference.h"
#include "colour/Identity.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/PatchArrays.h"
#include "jobkeys/ServerPaths.h"

namespace report {

using namespace jobkeys;

namespace {

constexpr const char* storedReferences = "stored references";

std::string nameOf(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

/// Server path of a job's references; empty if the ticket names none.
std::string pathOf(const store::TicketContent& job, Strip strip, bool hasStored) {
    const auto text = [&](const std::string& key) { return textOf(job.find(key)); };
    const auto number = [&](const std::string& key) {
        return integerOf(job.find(key)).value_or(0);
    };
    const std::string install = text("System/InstallFolder");
    const bool dynamic = isDynamic(strip, number("Footer/Dynstrip/UseDynstrip"));
    switch (referenceWay(number("Job/FromEsko") == 1, number(stripKey(strip, workflowKey)), dynamic,
                         hasStored)) {
    case ReferenceWay::Packaging:
        return job.find(characterisationKey) ? text(characterisationKey)
                                             : controlStripPath(install, text(stripFileKey));
    case ReferenceWay::Profile:
        return referenceProfile(strip, text);
    case ReferenceWay::DynamicStrip:
        return text(dynamicStripKey);
    case ReferenceWay::Characterisation: {
        const std::string value = text(stripKey(strip, characterisationKey));
        return value.empty() ? "" : characterisationPath(install, value);
    }
    case ReferenceWay::Stored:
    case ReferenceWay::None:
        break;
    }
    return "";
}

report::InkColours aimsOf(const colour::DataSet& set) {
    report::InkMeans means;
    for (std::size_t i = 0; set.hasCmyk() && i < set.patchCount; ++i) {
        const std::size_t channels = set.channels.size();
        if (const auto ink = report::inkOf(&set.device[i * channels], channels)) {
            means.add(*ink, set.lab[i]);
        }
    }
    return means.means();
}

report::InkColours aimsOf(const colour::Profile& profile) {
    constexpr double patches[report::inkCount][4] = {
        {0, 0, 0, 0}, {100, 0, 0, 0}, {0, 100, 0, 0}, {0, 0, 100, 0}, {0, 0, 0, 100}};
    colour::Lab lab[report::inkCount];
    report::InkColours aims;
    if (profile.evaluate(&patches[0][0], report::inkCount, 4, lab) == colour::Failure::None) {
        std::copy(std::begin(lab), std::end(lab), aims.begin());
    }
    return aims;
}

std::vector<double> percents(const store::TicketContent& job, const std::string& key) {
    std::vector<double> values;
    for (const int value : integersOf(job.find(key))) {
        values.push_back(std::floor(value / 2.55 + 0.5)); // The ticket's values are 0 to 255.
    }
    return values;
}

/// References stored in the ticket.
Target targetInTicket(const store::TicketContent& job, Strip strip, int patches) {
    const auto count = static_cast<std::size_t>(patches);
    const auto columns = [&](const char* const(&names)[3]) {
        std::vector<std::vector<double>> read;
        for (const char* name : names) {
            read.push_back(doublesOf(job.find(referenceKey(strip, name))));
            read.back().resize(count);
        }
        return read;
    };
    const bool hasLab = job.find(referenceKey(strip, labArrays[0])) != nullptr;
    const auto colours = hasLab ? columns(labArrays) : columns(xyzArrays);
    colour::DataSet set;
    set.patchCount = count;
    set.deviceSpace = colour::DeviceSpace::Cmyk;
    set.channels = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    set.device.resize(count * set.channels.size());
    for (std::size_t ink = 0; ink < set.channels.size(); ++ink) {
        const auto column = percents(job, referenceKey(strip, cmykArrays[ink]));
        for (std::size_t i = 0; i < std::min(column.size(), count); ++i) {
            set.device[i * set.channels.size() + ink] = column[i];
        }
    }
    for (std::size_t i = 0; i < count; ++i) {
        const double values[] = {colours[0][i], colours[1][i], colours[2][i]};
        set.lab.push_back(hasLab ? colour::Lab{values[0], values[1], values[2]}
                                 : colour::labFromXyz({values[0], values[1], values[2]}));
    }
    return {storedReferences, colour::identityOf(set), aimsOf(set)};
}

/// Converts the room's local time to seconds since 1970 in UTC.
std::int64_t utcOf(std::int64_t roomTime) {
    const std::time_t seconds = roomTime;
    std::tm parts{};
    gmtime_r(&seconds, &parts);
    parts.tm_isdst = -1;
    return std::mktime(&parts);
}

} // namespace

std::vector<std::string> Targets::keys(Strip strip) {
    std::vector<std::string> names = {"Job/FromEsko",
                                      "System/InstallFolder",
                                      stripFileKey,
                                      "Footer/Dynstrip/UseDynstrip",
                                      dynamicStripKey,
                                      usedProfileKey,
                                      characterisationKey,
                                      stripKey(strip, workflowKey),
                                      stripKey(strip, characterisationKey),
                                      stripKey(strip, stripProfileKey),
                                      measurementKey(strip, "Status"),
                                      referenceKey(strip, "Numpatches")};
    for (const auto* group : {labArrays, xyzArrays}) {
        for (int i = 0; i < 3; ++i) {
            names.push_back(referenceKey(strip, group[i]));
        }
    }
    for (const char* name : cmykArrays) {
        names.push_back(referenceKey(strip, name));
    }
    return names;
}

Target Targets::of(const store::TicketContent& job, Strip strip, std::int64_t time) {
    const auto number = [&](const std::string& key) {
        return integerOf(job.find(key)).value_or(0);
    };
    const int patches = number(referenceKey(strip, "Numpatches"));
    const bool hasStored = mayUseStored(number(stripKey(strip, workflowKey)),
                                        number(measurementKey(strip, "Status"))) &&
                           patches > 0 && patches <= mostPatches;
    const std::string path = pathOf(job, strip, hasStored);
    if (!path.empty()) {
        return ofFile(path, time);
    }
    return hasStored ? targetInTicket(job, strip, patches) : Target{};
}

Target Targets::ofFile(const std::string& path, std::int64_t time) {
    std::vector<Content>& contents = contentsOf(path);
    if (contents.empty()) {
        return {nameOf(path), path, {}};
    }
    const std::int64_t utc = utcOf(time);
    auto at =
        std::upper_bound(contents.begin(), contents.end(), utc,
                         [](std::int64_t wanted, const Content& c) { return wanted < c.time; });
    Content& content = at == contents.begin() ? *at : *(at - 1);
    if (!content.target) {
        content.target = read(path, content.version);
    }
    return *content.target;
}

std::vector<Targets::Content>& Targets::contentsOf(const std::string& path) {
    const auto [at, fresh] = m_contents.try_emplace(path);
    std::vector<Content>& contents = at->second;
    if (!fresh) {
        return contents;
    }
    if (!m_times) {
        m_times.emplace();
        for (const store::FileEntry& entry : m_store.files()) {
            m_times->emplace(entry.path, entry.time);
        }
    }
    try {
        for (const store::FileVersion& version : m_store.versions(path)) {
            contents.push_back({version.time, version.number, std::nullopt});
        }
    } catch (const store::StoreFailure& failure) {
        if (failure.status != store::Fault::NoFile && failure.status != store::Fault::BadPath) {
            throw;
        }
    }
    const std::string inStore = path.substr(std::min(path.find_first_not_of('/'), path.size()));
    if (const auto current = m_times->find(inStore); current != m_times->end()) {
        contents.push_back({current->second, 0, std::nullopt});
    }
    std::stable_sort(contents.begin(), contents.end(),
                     [](const Content& a, const Content& b) { return a.time < b.time; });
    return contents;
}

Target Targets::read(const std::string& path, int version) {
    // An unreadable target keeps its identity: its path and version represent it.
    Target target{nameOf(path), path + (version != 0 ? " " + std::to_string(version) : ""), {}};
    std::ostringstream bytes;
    try {
        if (version != 0) {
            m_store.getVersion(path, version, bytes);
        } else {
            m_store.getFile(path, bytes);
        }
    } catch (const store::StoreFailure& failure) {
        if (failure.status != store::Fault::NoFile) {
            throw;
        }
        return target;
    }
    colour::ColourFile file;
    if (colour::readColourFile(std::move(bytes).str(), {}, file) != colour::Failure::None) {
        return target;
    }
    if (std::string identity = colour::identityOf(file); !identity.empty()) {
        target.key = std::move(identity);
    }
    target.aims = file.profile ? aimsOf(*file.profile) : aimsOf(*file.set);
    return target;
}

} // namespace report
