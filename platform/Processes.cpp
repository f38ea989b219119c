// SPDX-License-Identifier: Apache-2.0
#include "platform/Processes.h"

#include <algorithm>
#include <charconv>
#include <climits>
#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <dirent.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/SystemRoot.h"

namespace {

constexpr std::string_view bundleSuffix = ".app";

bool startsWith(std::string_view text, std::string_view start) {
    return text.substr(0, start.size()) == start;
}

bool endsWith(std::string_view text, std::string_view end) {
    return text.size() >= end.size() && text.substr(text.size() - end.size()) == end;
}

// The ids of all processes, ascending.
std::vector<std::uint32_t> allProcesses() {
    std::vector<std::uint32_t> numbers;
    DIR* const folder = opendir("/proc");
    while (const dirent* entry = folder == nullptr ? nullptr : readdir(folder)) {
        const std::string_view name = entry->d_name;
        std::uint32_t number = 0;
        const auto [end, failure] = std::from_chars(name.begin(), name.end(), number);
        if (failure == std::errc() && end == name.end()) {
            numbers.push_back(number);
        }
    }
    if (folder != nullptr) {
        closedir(folder);
    }
    std::sort(numbers.begin(), numbers.end());
    return numbers;
}

std::string processFile(std::uint32_t number, const char* name) {
    return "/proc/" + std::to_string(number) + name;
}

bool isOfThisUser(std::uint32_t number) {
    struct stat status;
    return stat(processFile(number, "").c_str(), &status) == 0 && status.st_uid == geteuid();
}

// Nothing for a process that has ended, for kernel processes and for other users' processes.
std::optional<std::string> executable(std::uint32_t number) {
    char path[PATH_MAX];
    const ssize_t length = readlink(processFile(number, "/exe").c_str(), path, sizeof path);
    if (length <= 0 || static_cast<std::size_t>(length) == sizeof path) {
        return std::nullopt;
    }
    std::string result(path, static_cast<std::size_t>(length));
    // The system marks an executable that was replaced while running.
    constexpr std::string_view deleted = " (deleted)";
    if (endsWith(result, deleted) && access(result.c_str(), F_OK) != 0) {
        result.resize(result.size() - deleted.size());
    }
    return result;
}

// The path prefix of all applications. Empty without a system root. No value if the root is not a
// folder: then there are no applications.
std::optional<std::string> folderOfApplications() {
    const std::string root = platform::systemRoot();
    if (root.empty()) {
        return root;
    }
    // Paths of executables contain no links, so the root must not either.
    std::error_code failure;
    const std::string folder = std::filesystem::canonical(root, failure).string() + "/";
    return failure ? std::nullopt : std::optional(folder);
}

// The executable's path below that folder, or nothing if this is not a running application. The
// owner is checked last, because nearly all processes are outside the folder.
std::optional<std::string> pathOfApplication(std::uint32_t number,
                                             const std::optional<std::string>& folder) {
    if (number == 0 || number > INT_MAX || !folder) {
        return std::nullopt;
    }
    const std::optional<std::string> path = executable(number);
    if (!path || !startsWith(*path, *folder) || !isOfThisUser(number)) {
        return std::nullopt;
    }
    return path->substr(folder->size());
}

std::string nameOfApplication(std::string_view path) {
    const std::size_t lastSlash = path.rfind('/');
    for (std::size_t end = lastSlash; end != std::string_view::npos;) {
        const std::size_t slash = end == 0 ? std::string_view::npos : path.rfind('/', end - 1);
        const std::size_t begin = slash == std::string_view::npos ? 0 : slash + 1;
        const std::string_view folder = path.substr(begin, end - begin);
        if (folder.size() > bundleSuffix.size() && endsWith(folder, bundleSuffix)) {
            return std::string(folder.substr(0, folder.size() - bundleSuffix.size()));
        }
        end = slash;
    }
    return std::string(path.substr(lastSlash == std::string_view::npos ? 0 : lastSlash + 1));
}

} // namespace

OSErr GetNextProcess(ProcessSerialNumber* cursor) {
    // The process list and the root are read once per walk.
    thread_local std::vector<std::uint32_t> numbers;
    thread_local std::optional<std::string> folder;
    if (cursor->lowLongOfPSN == 0) {
        numbers = allProcesses();
        folder = folderOfApplications();
    }
    auto next = std::upper_bound(numbers.begin(), numbers.end(), cursor->lowLongOfPSN);
    while (next != numbers.end() && !pathOfApplication(*next, folder)) {
        ++next;
    }
    if (next == numbers.end()) {
        return procNotFound;
    }
    cursor->lowLongOfPSN = *next;
    return noErr;
}

OSStatus CopyProcessName(const ProcessSerialNumber* process, CFStringRef* name) {
    const std::optional<std::string> path =
        pathOfApplication(process->lowLongOfPSN, folderOfApplications());
    *name = path ? CFStringCreateWithCString(kCFAllocatorDefault, nameOfApplication(*path).c_str(),
                                             kCFStringEncodingUTF8)
                 : nullptr;
    return *name == nullptr ? procNotFound : noErr;
}

OSErr KillProcess(const ProcessSerialNumber* process) {
    const pid_t number = static_cast<pid_t>(process->lowLongOfPSN);
    const bool ended = pathOfApplication(process->lowLongOfPSN, folderOfApplications()) &&
                       number != getpid() && kill(number, SIGTERM) == 0;
    return ended ? noErr : procNotFound;
}
