// SPDX-License-Identifier: Apache-2.0
// Jobs that go from one store to another.
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "companions/tintgate-store/JobFiles.h"
#include "store/StoreEngine.h"

namespace admin {

struct Stayed {
    int job = 0;
    std::string why;
};

struct Moved {
    std::vector<int> jobs;
    std::int64_t files = 0;    ///< That belong to these jobs.
    std::int64_t versions = 0; ///< Of these files.
    std::uint64_t bytes = 0;   ///< Of both.
    std::vector<Stayed> stayed;
};

/// Moves jobs. Whenever it is cut off, each job is whole in at least one of the two stores:
///
///  1. Files go to the other store, each with its versions, then the tickets.
///  2. All of it is on the other store's disk. Tickets are removed here, each only if it is still
///     as it was copied.
///  3. The jobs' own files are removed here, but for those that other jobs name, and those that
///     somebody has written since.
///
/// After a cut before 2, the same jobs are moved again, and what is there already is compared, not
/// written. After a cut before 3, finishEarlierRun removes the files: the other store has the jobs
/// and the same contents, and no job here names them.
class MoveJobs {
  public:
    /// In a dry run nothing is written. Throws Failure (BadInput) if both are the same store.
    MoveJobs(store::StoreEngine& from, store::StoreEngine& to, bool dryRun);

    void finishEarlierRun();
    /// Jobs that move together or stay together.
    void move(const std::set<int>& jobs);

    const Moved& moved() const { return m_moved; }

  private:
    struct OwnFile {
        std::string path;
        int highestVersion = 0; ///< When it was copied.
    };

    void moveFiles(const std::set<int>& jobs, std::vector<OwnFile>& files);
    void copyWithVersions(const std::string& path);
    bool copyContent(const std::string& path, const store::FileVersion& version);
    void copyShared(const std::set<int>& jobs);
    void copyPreset(int id);
    bool isSameFile(const std::string& path);

    store::StoreEngine& m_from;
    store::StoreEngine& m_to;
    const bool m_dryRun;
    const JobFiles m_files; ///< Of all jobs in the store that gives.
    Moved m_moved;
};

} // namespace admin
