// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Tidy.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <map>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Processes.h"
#include "jobkeys/Tickets.h"
#include "report/Model.h"

namespace report {
namespace {

namespace fs = std::filesystem;

constexpr const char* hidden = ".tidy-";

bool isOurs(const struct stat& status) {
    return geteuid() == 0 || status.st_uid == geteuid();
}

/// "JobID_7" for "JobID_7" and ".tidy-JobID_7". Empty for any other name.
std::string jobName(std::string name) {
    constexpr std::string_view prefix = jobkeys::jobFolderPrefix;
    if (name.starts_with(hidden)) {
        name.erase(0, std::strlen(hidden));
    }
    const bool job = name.starts_with(prefix) && name.size() > prefix.size() &&
                     name.find_first_not_of("0123456789", prefix.size()) == name.npos;
    return job ? name : "";
}

void fail(JobFolder& folder, const std::string& reason) {
    folder.fate = Fate::Failed;
    folder.reason = reason;
}

/// Adds one entry's data. False if it is on another file system.
bool addEntry(JobFolder& folder, const fs::path& path, dev_t device) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) {
        if (errno != ENOENT) { // If it was deleted, its folder has changed.
            fail(folder, std::strerror(errno));
        }
        return true;
    }
    constexpr std::uint64_t blockSize = 512;
    folder.changed = std::max(folder.changed, std::int64_t{status.st_mtime});
    folder.bytes += static_cast<std::uint64_t>(status.st_blocks) * blockSize;
    folder.files += !S_ISDIR(status.st_mode);
    return status.st_dev == device;
}

/// Examines a folder without following links, and decides whether to remove it.
JobFolder survey(const fs::path& path, const std::string& name, std::int64_t before) {
    JobFolder folder;
    folder.name = name;
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0 || !S_ISDIR(status.st_mode)) {
        fail(folder, "is not a folder");
        return folder;
    }
    folder.fate = Fate::Removed;
    bool oneDevice = addEntry(folder, path, status.st_dev);
    std::error_code failure;
    for (fs::recursive_directory_iterator at(path, failure), end; !failure && at != end;
         at.increment(failure)) {
        oneDevice = addEntry(folder, at->path(), status.st_dev) && oneDevice;
    }
    if (failure) {
        fail(folder, failure.message());
    } else if (folder.fate == Fate::Removed && folder.changed >= before) {
        folder.fate = Fate::Recent;
    }
    if (!isOurs(status) || !oneDevice) {
        folder.fate = Fate::NotOurs;
        folder.reason =
            oneDevice ? "belongs to another user" : "another file system is mounted in it";
    }
    return folder;
}

/// The working folder with links resolved. Throws unless it is a folder of this user.
fs::path checkedFolder(const std::string& path) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) {
        if (errno == ENOENT) {
            return {};
        }
        throw Failure(Status::NotTidied, path + " can't be looked at: " + std::strerror(errno));
    }
    if (!S_ISDIR(status.st_mode)) {
        throw Failure(Status::NotTidied, path + " is not a folder, or is a link");
    }
    if (!isOurs(status)) {
        throw Failure(Status::NotTidied, path + " belongs to another user");
    }
    return fs::canonical(path);
}

/// Job folders that nobody uses, by their current names.
class Candidates {
  public:
    Candidates(fs::path folder, std::int64_t before)
        : m_folder(std::move(folder)), m_before(before) {}

    void find() {
        std::error_code failure;
        for (fs::directory_iterator at(m_folder, failure), end; !failure && at != end;
             at.increment(failure)) {
            const std::string name = at->path().filename();
            std::error_code ignored;
            if (!jobName(name).empty() &&
                at->symlink_status(ignored).type() == fs::file_type::directory) {
                m_folders.emplace(name, survey(at->path(), jobName(name), m_before));
            }
        }
        if (failure) {
            throw Failure(Status::NotTidied,
                          m_folder.string() + " can't be read: " + failure.message());
        }
        keepUsed();
    }

    /// Renames the folders. Whatever starts to work on a job after this creates a new folder.
    void hide() {
        std::map<std::string, JobFolder> now;
        for (auto& [name, folder] : m_folders) {
            const std::string other = hidden + folder.name;
            const bool hide = folder.fate == Fate::Removed && name != other;
            if (hide && !rename(name, other)) {
                fail(folder, std::strerror(errno));
            }
            now.emplace(hide && folder.fate == Fate::Removed ? other : name, std::move(folder));
        }
        m_folders = std::move(now);
    }

    /// Restores folders that came into use between the first check and the renaming.
    void giveBack() {
        const auto used = usedFolders(m_folder);
        for (auto& [name, folder] : m_folders) {
            const auto user = used.find(folder.name);
            if (folder.fate != Fate::Removed || user == used.end()) {
                continue;
            }
            // If the name is in use again, it is a newer folder, and this one is not needed.
            if (rename(name, folder.name) || errno != EEXIST) {
                folder.fate = Fate::InUse;
                folder.reason = user->second;
            }
        }
    }

    void remove() {
        for (auto& [name, folder] : m_folders) {
            if (folder.fate != Fate::Removed) {
                continue;
            }
            std::error_code failure;
            fs::remove_all(m_folder / name, failure);
            if (failure) {
                fail(folder, failure.message());
            }
        }
    }

    std::vector<JobFolder> folders() const {
        std::vector<JobFolder> all;
        for (const auto& [name, folder] : m_folders) {
            all.push_back(folder);
        }
        std::sort(all.begin(), all.end(), [](const auto& a, const auto& b) {
            return a.name.size() != b.name.size() ? a.name.size() < b.name.size()
                                                  : a.name < b.name; // By number.
        });
        return all;
    }

  private:
    void keepUsed() {
        const auto used = usedFolders(m_folder);
        for (auto& [name, folder] : m_folders) {
            if (const auto user = used.find(folder.name); user != used.end()) {
                folder.fate = Fate::InUse;
                folder.reason = user->second;
            }
        }
    }

    /// False with errno set; EEXIST if the new name is in use.
    bool rename(const std::string& from, const std::string& to) const {
        return renameat2(AT_FDCWD, (m_folder / from).c_str(), AT_FDCWD, (m_folder / to).c_str(),
                         RENAME_NOREPLACE) == 0;
    }

    const fs::path m_folder;
    const std::int64_t m_before;
    std::map<std::string, JobFolder> m_folders; ///< By current name.
};

std::string sizeText(std::uint64_t bytes) {
    constexpr double kilo = 1000;
    const auto size = static_cast<double>(bytes);
    return size < kilo * kilo ? report::fixedText(size / kilo, 0) + " kB"
                              : report::fixedText(size / kilo / kilo, 1) + " MB";
}

std::string dateText(std::int64_t time) {
    const std::time_t seconds = time;
    std::tm parts{};
    char text[16] = "";
    localtime_r(&seconds, &parts);
    std::strftime(text, sizeof text, "%Y-%m-%d", &parts);
    return text;
}

std::string lineOf(const JobFolder& folder, bool dryRun) {
    const std::string contents = std::to_string(folder.files) +
                                 (folder.files == 1 ? " file, " : " files, ") +
                                 sizeText(folder.bytes);
    switch (folder.fate) {
    case Fate::Removed:
        return (dryRun ? "would remove " : "removed ") + folder.name + ": " + contents +
               ", last changed " + dateText(folder.changed) + '\n';
    case Fate::InUse:
        return "kept " + folder.name + ": in use by " + folder.reason + '\n';
    case Fate::NotOurs:
        return "kept " + folder.name + ": " + folder.reason + '\n';
    case Fate::Failed:
        return "failed " + folder.name + ": " + folder.reason + '\n';
    case Fate::Recent:
        break;
    }
    return {};
}

} // namespace

std::vector<JobFolder> tidy(const std::string& workingFolder, std::int64_t seconds, bool dryRun) {
    const fs::path folder = checkedFolder(workingFolder);
    if (folder.empty()) {
        return {};
    }
    Candidates candidates(folder, std::time(nullptr) - seconds);
    candidates.find();
    if (!dryRun) {
        candidates.hide();
        candidates.giveBack();
        candidates.remove();
    }
    return candidates.folders();
}

std::string tidiedText(const std::vector<JobFolder>& folders, bool dryRun) {
    std::string text;
    std::size_t removed = 0;
    std::uint64_t bytes = 0;
    for (const JobFolder& folder : folders) {
        text += lineOf(folder, dryRun);
        if (folder.fate == Fate::Removed) {
            ++removed;
            bytes += folder.bytes;
        }
    }
    return text + std::to_string(removed) + " of " + std::to_string(folders.size()) +
           (folders.size() == 1 ? " folder" : " folders") +
           (dryRun ? " would be removed, " : " removed, ") + sizeText(bytes) + '\n';
}

} // namespace report
