// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Processes.h"

#include <algorithm>
#include <filesystem>
#include <limits>
#include <string_view>

#include "base/WholeFile.h"
#include "jobkeys/Tickets.h"

namespace report {

using jobkeys::jobFolderPrefix;

namespace {

namespace fs = std::filesystem;

constexpr std::string_view hidden = ".tidy-";

bool isNumber(std::string_view text) {
    return !text.empty() && text.find_first_not_of("0123456789") == text.npos;
}

std::string contentsOf(const std::string& path) {
    std::string bytes;
    base::readWholeFile(path, std::numeric_limits<std::size_t>::max(), bytes);
    return bytes;
}

/// Empty if the link can't be read: another user's process, or one that has just ended.
std::string linkOf(const fs::path& path) {
    std::error_code failure;
    return fs::read_symlink(path, failure).string();
}

class Search {
  public:
    explicit Search(const std::string& folder) : m_start(folder + "/") {}

    void look(const std::string& process) {
        const std::string folder = "/proc/" + process;
        const std::string arguments = contentsOf(folder + "/cmdline");
        m_user = nameOf(folder, arguments) + " (process " + process + ")";
        for (const char* link : {"/cwd", "/root", "/exe"}) {
            takePaths(linkOf(folder + link));
        }
        std::error_code failure;
        for (fs::directory_iterator at(folder + "/fd", failure), end; !failure && at != end;
             at.increment(failure)) {
            takePaths(linkOf(at->path()));
        }
        takePaths(contentsOf(folder + "/maps"));
        takePaths(arguments);
        if (nameOf(folder, arguments) == "Tintgate" &&
            mayWorkHere(contentsOf(folder + "/environ"))) {
            takeJob(arguments);
        }
    }

    std::map<std::string, std::string> used;

  private:
    static std::string nameOf(const std::string& folder, const std::string& arguments) {
        std::string path = linkOf(folder + "/exe");
        path.resize(std::min(path.find(" (deleted)"), path.size())); // After an upgrade.
        if (path.empty()) {
            path = arguments.substr(0, arguments.find('\0'));
        }
        return path.substr(path.rfind('/') + 1);
    }

    /// Takes every job's folder in the text.
    void takePaths(const std::string& text) {
        for (std::size_t at = 0; (at = text.find(m_start, at)) != text.npos;) {
            at += m_start.size();
            std::string_view rest = std::string_view(text).substr(at);
            if (rest.starts_with(hidden)) {
                rest.remove_prefix(hidden.size());
            }
            if (!rest.starts_with(jobFolderPrefix)) {
                continue;
            }
            const std::size_t end = rest.find_first_not_of("0123456789", jobFolderPrefix.size());
            used.emplace(rest.substr(0, end), m_user);
        }
    }

    /// The tool's third argument is the job's number, after the last colon.
    void takeJob(const std::string& arguments) {
        std::istringstream words(arguments);
        std::string word;
        for (int i = 0; i <= 3; ++i) {
            if (!std::getline(words, word, '\0')) {
                return;
            }
        }
        word.erase(0, word.rfind(':') + 1);
        if (isNumber(word)) {
            used.emplace(std::string(jobFolderPrefix) + word, m_user);
        }
    }

    /// False only if the tool's environment names another temporary folder.
    bool mayWorkHere(const std::string& environment) const {
        for (const std::string name : {"TMPDIR=", "TMP=", "TEMP="}) {
            const std::size_t at = ('\0' + environment).find('\0' + name);
            if (at == environment.npos) {
                continue;
            }
            const std::string value = environment.substr(at + name.size()).c_str();
            std::error_code failure;
            const fs::path folder = fs::canonical(value, failure);
            if (!failure && fs::is_directory(folder, failure)) {
                return (folder / "Tintgate").string() + "/" == m_start;
            }
        }
        return true;
    }

    const std::string m_start;
    std::string m_user;
};

} // namespace

std::map<std::string, std::string> usedFolders(const std::string& folder) {
    Search search(folder);
    std::error_code failure;
    for (fs::directory_iterator at("/proc", failure), end; !failure && at != end;
         at.increment(failure)) {
        if (const std::string name = at->path().filename(); isNumber(name)) {
            search.look(name);
        }
    }
    return std::move(search.used);
}

} // namespace report
