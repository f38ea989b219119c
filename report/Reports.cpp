// SPDX-License-Identifier: Apache-2.0
#include "report/Reports.h"

#include <algorithm>
#include <filesystem>
#include <fstream>

#include "jobkeys/Tickets.h"

namespace report {
namespace {

namespace fs = std::filesystem;

std::string startOf(const fs::path& path) {
    std::string bytes(summaryWithin, '\0');
    std::ifstream file(path, std::ios::binary);
    file.read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    bytes.resize(static_cast<std::size_t>(file.gcount()));
    return bytes;
}

bool isReport(const fs::directory_entry& entry) {
    std::error_code ignored;
    const std::string name = entry.path().filename();
    return entry.symlink_status(ignored).type() == fs::file_type::regular &&
           name.starts_with("report-") && name.ends_with(".html");
}

bool isJobFolder(const fs::directory_entry& entry) {
    std::error_code ignored;
    return entry.symlink_status(ignored).type() == fs::file_type::directory &&
           entry.path().filename().string().starts_with(jobkeys::jobFolderPrefix);
}

/// Entries of a folder that `wanted` accepts. Empty if the folder can't be read.
template<class Wanted>
std::vector<fs::path> entriesOf(const fs::path& folder, Wanted wanted) {
    std::vector<fs::path> paths;
    std::error_code failure;
    for (fs::directory_iterator at(folder, failure), end; !failure && at != end;
         at.increment(failure)) {
        if (wanted(*at)) {
            paths.push_back(at->path());
        }
    }
    return paths;
}

} // namespace

std::vector<Listed> reportsBelow(const std::string& folder) {
    std::vector<Listed> reports;
    for (const fs::path& job : entriesOf(folder, isJobFolder)) {
        for (const fs::path& page : entriesOf(job, isReport)) {
            if (auto summary = summaryIn(startOf(page))) {
                reports.push_back(
                    {job.filename().string() + "/" + page.filename().string(), *summary});
            }
        }
    }
    // Stamps include the offset from UTC. Within one room they sort as text.
    std::sort(reports.begin(), reports.end(), [](const auto& a, const auto& b) {
        return a.summary.created != b.summary.created ? a.summary.created > b.summary.created
                                                      : a.path < b.path;
    });
    return reports;
}

} // namespace report
