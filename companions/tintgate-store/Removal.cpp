// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Removal.h"

#include <algorithm>
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Rows.h"

namespace admin {

namespace {

std::uint64_t sizeOf(const std::vector<store::FileVersion>& versions, std::size_t count) {
    std::uint64_t bytes = 0;
    for (std::size_t i = 0; i < count; ++i) {
        bytes += versions[i].size;
    }
    return bytes;
}

} // namespace

std::string shownPath(const std::string& path) {
    return "/" + path.substr(std::min(path.size(), path.find_first_not_of('/')));
}

void Removal::prune(const std::string& path, const store::Pruning& which) {
    const auto versions = m_store.versions(path);
    const std::size_t count = store::countPruned(versions, which);
    if (count == 0) {
        return;
    }
    if (!m_dryRun) {
        m_store.pruneVersions(path, which);
    }
    m_files.push_back({path, false, static_cast<std::int64_t>(count), sizeOf(versions, count)});
}

void Removal::removeFile(const std::string& path) {
    const auto file = m_store.fileAt(path);
    const auto versions = m_store.versions(path);
    if ((!file && versions.empty()) || (!m_dryRun && !m_store.removeFile(path))) {
        return;
    }
    m_files.push_back({path, file.has_value(), std::ssize(versions),
                       sizeOf(versions, versions.size()) + (file ? file->size : 0)});
}

void Removal::removeJob(int job, const JobFiles& files, const std::set<int>& group) {
    for (const auto& path : files.own(job)) {
        if (files.isNamedOutside(path, group)) {
            m_kept.push_back(path);
        } else {
            removeFile(path);
        }
    }
    if (m_dryRun ? m_store.exists(jobType, job) : m_store.remove(jobType, job)) {
        m_jobs.push_back(job);
    }
}

void Removal::show(bool asJson) const {
    std::int64_t whole = 0;
    std::int64_t versions = 0;
    std::uint64_t bytes = 0;
    std::vector<Row> files;
    for (const auto& file : m_files) {
        whole += file.whole ? 1 : 0;
        versions += file.versions;
        bytes += file.bytes;
        files.push_back({{"path", textOrBytes(shownPath(file.path))},
                         {"whole", file.whole},
                         {"versions", file.versions},
                         {"bytes", file.bytes}});
    }
    std::vector<Json> kept;
    for (const auto& path : m_kept) {
        kept.push_back(textOrBytes(shownPath(path)));
    }
    if (asJson) {
        showObject({{"dryRun", m_dryRun},
                    {"jobs", m_jobs},
                    {"files", files},
                    {"kept", kept},
                    {"versions", versions},
                    {"bytes", bytes}},
                   true);
        return;
    }
    for (const auto& path : m_kept) {
        std::cout << "Another job names " << printable(shownPath(path)) << ": it stays\n";
    }
    std::string told = m_jobs.empty() ? "" : counted(std::ssize(m_jobs), "job") + ", ";
    if (whole != 0 || !m_jobs.empty()) {
        told += counted(whole, "file") + ", ";
    }
    std::cout << (m_dryRun ? "Would remove " : "Removed ") << told << counted(versions, "version")
              << ": " << counted(static_cast<std::int64_t>(bytes), "byte") << '\n';
}

} // namespace admin
