// SPDX-License-Identifier: Apache-2.0
// What commands take out of a store, and what that frees.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "companions/tintgate-store/JobFiles.h"
#include "companions/tintgate-store/TicketName.h"
#include "store/StoreEngine.h"

namespace admin {

/// Server paths are shown as they are told to the store: from its root.
std::string shownPath(const std::string& path);

/// Removes one thing after the other and adds up what that frees. In a dry run nothing is removed,
/// and the sums are those of a removal at this moment.
class Removal {
  public:
    Removal(store::StoreEngine& store, bool dryRun) : m_store(store), m_dryRun(dryRun) {}

    void prune(const std::string& path, const store::Pruning& which);
    /// A file that is not there frees nothing.
    void removeFile(const std::string& path);
    /// A job's ticket and its own files, but for those that a job outside the group names. The
    /// ticket goes last, so that a removal that was cut off can be run again.
    void removeJob(int job, const JobFiles& files, const std::set<int>& group);

    /// Prints the sums, and what was kept.
    void show(bool asJson) const;

  private:
    struct File {
        std::string path;
        bool whole = false; ///< Not only versions of it.
        std::int64_t versions = 0;
        std::uint64_t bytes = 0;
    };

    store::StoreEngine& m_store;
    const bool m_dryRun;
    std::vector<int> m_jobs;
    std::vector<File> m_files;
    std::vector<std::string> m_kept;
};

} // namespace admin
