// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/JobFiles.h"

#include <algorithm>
#include <functional>
#include <limits>
#include <utility>

#include "companions/tintgate-store/KeyValue.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/ServerPaths.h"
#include "jobkeys/StripKeys.h"
#include "jobkeys/Tickets.h"
#include "store/ServerPath.h"

namespace admin {

using namespace jobkeys;

namespace {

constexpr const char* installFolderKey = "System/InstallFolder";
constexpr const char* presetKey = "Workflow/Verify/ComparisonMethod";
constexpr const char* packagingStripKey = "Footer/ControlstripIT8";
/// Each a server path as it is.
constexpr const char* pathKeys[] = {dynamicStripKey, "Footer/Dynstrip/File", usedProfileKey,
                                    packagingStripKey};

std::vector<std::string> keyNames() {
    std::vector<std::string> names = {installFolderKey, jdfNameKey, temporaryFolderKey,
                                      outFolderKey, remoteJdfKey};
    names.insert(names.end(), std::begin(pathKeys), std::end(pathKeys));
    for (const Strip strip : strips) {
        for (const char* key :
             {presetKey, stripFileKey, nestedStripFileKey, stripProfileKey, characterisationKey}) {
            names.push_back(stripKey(strip, key));
        }
    }
    return names;
}

using Texts = std::map<std::string, std::string>;

void addPath(std::vector<std::string>& paths, const std::string& path) {
    try {
        const auto parts = store::partsOfServerPath(path);
        const std::string joined = store::joinedParts(parts, parts.size());
        if (std::find(paths.begin(), paths.end(), joined) == paths.end()) {
            paths.push_back(joined);
        }
    } catch (const store::StoreFailure&) { // No file of the store, so nothing to look after.
    }
}

std::vector<std::string> ownPaths(const std::function<std::string(const std::string&)>& text) {
    std::vector<std::string> paths;
    const std::string folder = jdfFolder(text);
    const std::string jdf = text(jdfNameKey);
    if (!folder.empty() && !jdf.empty()) {
        addPath(paths, folder + "/" + jdf);
    }
    // Whether the key counts depends on the job's type: a file that it names is the job's anyway.
    addPath(paths, text(remoteJdfKey));
    return paths;
}

std::vector<std::string> sharedPaths(const std::function<std::string(const std::string&)>& text,
                                     const std::set<int>& presets) {
    std::vector<std::string> paths;
    const std::string install = text(installFolderKey);
    for (const char* const key : pathKeys) {
        addPath(paths, text(key));
    }
    for (const Strip strip : strips) {
        for (const char* const key : {stripFileKey, nestedStripFileKey}) {
            if (const std::string name = text(stripKey(strip, key)); !name.empty()) {
                addPath(paths, controlStripPath(install, name));
            }
        }
        addPath(paths, text(stripKey(strip, stripProfileKey)));
        if (const std::string data = text(stripKey(strip, characterisationKey)); !data.empty()) {
            addPath(paths, data); // With a packaging workflow it is a path.
            addPath(paths, characterisationPath(install, data));
        }
    }
    for (const int preset : presets) {
        addPath(paths, presetPath(install, preset));
    }
    return paths;
}

} // namespace

JobFiles::JobFiles(store::StoreEngine& store) {
    const auto names = keyNames();
    constexpr std::size_t anySize = std::numeric_limits<int>::max();
    int current = -1;
    Texts texts;
    Names job;
    const auto finishJob = [&] {
        const auto text = [&](const std::string& key) {
            const auto found = texts.find(key);
            return found == texts.end() ? std::string() : found->second;
        };
        job.own = ownPaths(text);
        job.shared = sharedPaths(text, job.presets);
        for (const auto* paths : {&job.own, &job.shared}) {
            for (const auto& path : *paths) {
                m_namedBy[path].push_back(current);
            }
        }
        m_jobs.emplace(current, std::exchange(job, {}));
        texts.clear();
    };
    store.keysOfAll(jobType, names, anySize, [&](int id, std::size_t name, const auto& elements) {
        if (id != current) {
            if (current >= 0) {
                finishJob();
            }
            current = id;
        }
        if (const auto text = textOf(elements)) {
            texts[names[name]] = *text;
        } else if (const auto number = integerOf(elements); number.value_or(0) > 0) {
            job.presets.insert(*number); // Of these keys only those of presets hold numbers.
        }
    });
    if (current >= 0) {
        finishJob();
    }
}

std::vector<std::string> JobFiles::own(int job) const {
    const auto found = m_jobs.find(job);
    return found == m_jobs.end() ? std::vector<std::string>() : found->second.own;
}

std::vector<std::string> JobFiles::shared(int job) const {
    const auto found = m_jobs.find(job);
    return found == m_jobs.end() ? std::vector<std::string>() : found->second.shared;
}

const std::set<int>& JobFiles::presets(int job) const {
    static const std::set<int> none;
    const auto found = m_jobs.find(job);
    return found == m_jobs.end() ? none : found->second.presets;
}

bool JobFiles::isNamedOutside(const std::string& path, const std::set<int>& group) const {
    const auto found = m_namedBy.find(path);
    return found != m_namedBy.end() && std::any_of(found->second.begin(), found->second.end(),
                                                   [&](int job) { return !group.contains(job); });
}

} // namespace admin
