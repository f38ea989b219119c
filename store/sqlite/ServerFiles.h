// SPDX-License-Identifier: Apache-2.0
// The files of a store on a local disk.
//
//   files/
//     ControlCharts/chart.it8
//     jobs/7/.tintgate-new-812-0             a delivery under way
//     jobs/7/job.jdf
//     .tintgate-versions/
//       jobs/7/job.jdf/.tintgate-1           what job.jdf was before
//       jobs/7/job.jdf/.tintgate-2
//       jobs/7/chart.it8/.tintgate-used-3    versions 1 to 3 were pruned, and nothing came since
//
// Server paths have no part that starts with ".tintgate-", so that none of these names can be
// reached or be in the way.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

#include "base/Descriptor.h"
#include "store/StoreEngine.h"

namespace store {

/// What files a folder had at one moment, those of its own names with them.
struct FileSnapshot {
    struct Entry {
        std::string path; ///< Below the files folder, as it is on the disk.
        ino_t inode = 0;
        timespec written = {};
        std::uint64_t size = 0;
    };
    std::vector<Entry> entries;
};

/// See StoreEngine for each of these. The folder is held open, so that files stay where they were
/// when the store was opened, whatever becomes of the names above it. Everything below it is
/// reached one part at a time without following a symbolic link, so that there is no moment in
/// which a name could be exchanged for one that leads out.
class ServerFiles {
  public:
    /// The store's "files" folder, made with create.
    ServerFiles(const std::string& storeFolder, bool create);

    void put(std::string_view path, std::istream& from);
    void get(std::string_view path, std::ostream& to);
    std::vector<FileEntry> list();
    std::optional<FileEntry> at(std::string_view path);
    std::vector<FileVersion> versions(std::string_view path);
    void getVersion(std::string_view path, int number, std::ostream& to);
    void restoreVersion(std::string_view path, int number);
    int pruneVersions(std::string_view path, const Pruning& which);
    bool remove(std::string_view path, std::optional<int> highestVersion);
    int removeLeftovers();
    void verify(Verified& found, const StoreEngine::ShowFault& show);
    /// Calls `within` and lists the files while nobody can exchange one.
    FileSnapshot snapshot(const std::function<void()>& within);
    /// Copies the contents of that moment to the files folder of another store's folder, which is
    /// made and must not be there. Throws StoreFailure (Busy) if one was removed since.
    void copySnapshot(const FileSnapshot& snapshot, const std::string& storeFolder,
                      const StoreEngine::ShowProgress& progress);
    /// From now on nothing that placeVersion places has to be on the disk before finishCopy, and
    /// nobody else is at work.
    void writeLater() { m_later = true; }
    void placeVersion(std::string_view path, const FileVersion& version, std::istream& from);
    int highestVersion(std::string_view path);
    void raiseHighestVersion(std::string_view path, int number);
    /// Brings all to the disk, and removes what copies left that were killed. Nobody else may be
    /// at work.
    void finishCopy();

  private:
    void verifyVersions(const std::string& path, const base::Descriptor& folder, Verified& found,
                        const StoreEngine::ShowFault& show);

    base::Descriptor m_files;
    bool m_later = false;
};

} // namespace store
