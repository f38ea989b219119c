// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/MoveJobs.h"

#include <algorithm>
#include <map>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Removal.h"
#include "companions/tintgate-store/Spool.h"
#include "companions/tintgate-store/TicketName.h"
#include "store/KeyBytes.h"

namespace admin {

using store::FileVersion;
using store::StoreEngine;

namespace {

/// Keeps a family where it is.
struct InTheWay {
    std::string why;
};

void fetch(StoreEngine& store, const std::string& path, int number, Spool& spool) {
    if (number == 0) {
        store.getFile(path, spool.toWrite());
    } else {
        store.getVersion(path, number, spool.toWrite());
    }
}

bool haveSameContent(StoreEngine& one, int oneNumber, StoreEngine& other, int otherNumber,
                     const std::string& path) {
    Spool first;
    Spool second;
    fetch(one, path, oneNumber, first);
    fetch(other, path, otherNumber, second);
    return areEqual(first, second);
}

/// The file itself, as number 0, and its versions.
std::vector<FileVersion> contentsOf(StoreEngine& store, const std::string& path) {
    std::vector<FileVersion> contents;
    if (const auto file = store.fileAt(path)) {
        contents.push_back({0, file->size, file->time});
    }
    const auto versions = store.versions(path);
    contents.insert(contents.end(), versions.begin(), versions.end());
    return contents;
}

const FileVersion* find(const std::vector<FileVersion>& contents, int number) {
    const auto found = std::find_if(contents.begin(), contents.end(),
                                    [&](const auto& each) { return each.number == number; });
    return found == contents.end() ? nullptr : &*found;
}

void putTicket(StoreEngine& to, int type, int id, const store::TicketContent& content) {
    store::Scope scope;
    scope.everything = true;
    scope.make = true;
    to.change(type, id, scope,
              [&](store::TicketContent& stored) { stored.transfer(content, true); });
}

} // namespace

MoveJobs::MoveJobs(StoreEngine& from, StoreEngine& to, bool dryRun)
    : m_from(from), m_to(to), m_dryRun(dryRun), m_files(from) {
    if (from.place() == to.place()) {
        throw Failure(Status::BadInput, "both are the same store");
    }
}

/// Whether the other store has each content of a file here.
bool MoveJobs::isSameFile(const std::string& path) {
    const auto there = contentsOf(m_to, path);
    for (const auto& content : contentsOf(m_from, path)) {
        const FileVersion* const same = find(there, content.number);
        if (same == nullptr || same->size != content.size ||
            !haveSameContent(m_from, content.number, m_to, content.number, path)) {
            return false;
        }
    }
    return true;
}

void MoveJobs::finishEarlierRun() {
    if (m_dryRun) {
        return;
    }
    // Few requests, however large the archive has become.
    std::set<std::string> unnamed;
    for (auto& file : m_from.files()) {
        if (!m_files.isNamedOutside(file.path, {})) {
            unnamed.insert(std::move(file.path));
        }
    }
    const JobFiles archived(m_to);
    for (const int job : m_to.ids(jobType)) {
        for (const auto& path : archived.own(job)) {
            if (unnamed.erase(path) != 0) {
                const int highest = m_from.highestVersion(path);
                if (isSameFile(path)) {
                    m_from.removeFile(path, highest);
                }
            }
        }
    }
}

/// Throws InTheWay if the other store has a file of this name that is not an earlier state of the
/// one here.
void MoveJobs::copyWithVersions(const std::string& path) {
    const auto here = contentsOf(m_from, path);
    const auto there = contentsOf(m_to, path);
    const auto knows = [&](int number) {
        return std::any_of(here.begin(), here.end(), [&](const auto& content) {
            return haveSameContent(m_from, content.number, m_to, number, path);
        });
    };
    for (const auto& content : there) {
        const FileVersion* const same = find(here, content.number);
        const bool isKnown = content.number == 0
                                 ? knows(0)
                                 : same != nullptr && haveSameContent(m_from, content.number, m_to,
                                                                      content.number, path);
        if (!isKnown) {
            throw InTheWay{"the other store has another file " + printable(shownPath(path))};
        }
    }
    if (m_dryRun) {
        return;
    }
    for (const auto& content : here) {
        const FileVersion* const same = find(there, content.number);
        if (same != nullptr && same->size == content.size && same->time == content.time &&
            haveSameContent(m_from, content.number, m_to, content.number, path)) {
            continue; // An earlier run brought it.
        }
        Spool spool;
        fetch(m_from, path, content.number, spool);
        m_to.placeVersion(path, content, spool.toRead());
    }
    const int highest = m_from.highestVersion(path);
    if (highest > (here.empty() ? 0 : here.back().number)) {
        m_to.raiseHighestVersion(path, highest);
    }
}

void MoveJobs::moveFiles(const std::set<int>& jobs, std::vector<OwnFile>& files) {
    std::set<std::string> known;
    for (const int job : jobs) {
        for (const auto& path : m_files.own(job)) {
            if (known.insert(path).second && m_from.fileAt(path)) {
                files.push_back({path, m_from.highestVersion(path)});
                copyWithVersions(path);
            }
        }
    }
}

void MoveJobs::copyPreset(int id) {
    if (m_to.exists(presetType, id)) {
        return;
    }
    if (const auto content = m_from.content(presetType, id, store::KeyFilter())) {
        putTicket(m_to, presetType, id, *content);
    }
}

void MoveJobs::copyShared(const std::set<int>& jobs) {
    for (const int job : jobs) {
        for (const auto& path : m_files.shared(job)) {
            // What is no file there is nothing that could be read of it either.
            try {
                const auto file = m_from.fileAt(path);
                if (!file || m_to.fileAt(path)) {
                    continue;
                }
                Spool spool;
                m_from.getFile(path, spool.toWrite());
                m_to.placeVersion(path, {0, file->size, file->time}, spool.toRead());
            } catch (const store::StoreFailure& failure) {
                if (failure.status != store::Fault::BadPath &&
                    failure.status != store::Fault::NoFile) {
                    throw;
                }
            }
        }
        for (const int preset : m_files.presets(job)) {
            copyPreset(preset);
        }
    }
}

void MoveJobs::move(const std::set<int>& jobs) {
    std::map<int, std::shared_ptr<const store::TicketContent>> tickets;
    std::vector<OwnFile> files;
    try {
        for (const int job : jobs) {
            const auto content = m_from.content(jobType, job, store::KeyFilter());
            const auto there = m_to.content(jobType, job, store::KeyFilter());
            if (content && there && !store::haveSameKeys(*content, *there)) {
                throw InTheWay{"the other store has another job " + std::to_string(job)};
            }
            if (content) {
                tickets.emplace(job, content);
            }
        }
        moveFiles(jobs, files);
    } catch (const InTheWay& obstacle) {
        for (const int job : jobs) {
            m_moved.stayed.push_back({job, obstacle.why});
        }
        return;
    }
    std::set<int> gone;
    if (!m_dryRun) {
        copyShared(jobs);
        for (const auto& [job, content] : tickets) {
            putTicket(m_to, jobType, job, *content);
        }
    }
    for (const auto& [job, content] : tickets) {
        if (m_dryRun || m_from.removeUnchanged(jobType, job, *content)) {
            gone.insert(job);
            m_moved.jobs.push_back(job);
        } else if (m_from.exists(jobType, job)) {
            m_to.removeUnchanged(jobType, job, *content);
            m_moved.stayed.push_back({job, "somebody changed it meanwhile: run it again"});
        }
    }
    for (const auto& [path, highest] : files) {
        if (m_files.isNamedOutside(path, gone)) {
            continue;
        }
        const auto contents = contentsOf(m_from, path);
        if (!m_dryRun && !m_from.removeFile(path, highest)) {
            continue;
        }
        ++m_moved.files;
        m_moved.versions += std::ssize(contents) - 1;
        for (const auto& content : contents) {
            m_moved.bytes += content.size;
        }
    }
}

} // namespace admin
