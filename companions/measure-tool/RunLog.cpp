// SPDX-License-Identifier: Apache-2.0
// 2024-05-01T12:34:56Z Waiting for /srv/exports/measurement.txt, until 2024-05-01T12:49:56Z
// 2024-05-01T12:40:02Z Not accepted: there are 40 patches, but 48 were requested
#include "companions/measure-tool/RunLog.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "companions/measure-tool/Text.h"

namespace measuretool {
namespace {

/// True if a file is empty or starts like a line of a log.
bool holdsLog(const std::string& path) {
    constexpr std::string_view form = "0000-00-00T00:00:00Z ";
    char head[form.size()];
    const base::Descriptor file(open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    const ssize_t size = file.isOpen() ? read(file.get(), head, sizeof head) : -1;
    const auto fits = [](char c, char expected) {
        return expected == '0' ? c >= '0' && c <= '9' : c == expected;
    };
    return size == 0 || (size == static_cast<ssize_t>(form.size()) &&
                         std::equal(form.begin(), form.end(), head,
                                    [&](char expected, char c) { return fits(c, expected); }));
}

} // namespace

void RunLog::start(const std::string& output, const std::vector<std::string>& inputs) {
    namespace fs = std::filesystem;
    const std::string path = (fs::path(output).parent_path() / name).string();
    const auto isLog = [&](const std::string& file) {
        std::error_code ignored;
        return fs::path(file).lexically_normal() == fs::path(path).lexically_normal() ||
               fs::equivalent(file, path, ignored);
    };
    if (isLog(output) || std::any_of(inputs.begin(), inputs.end(), isLog)) {
        return;
    }
    struct stat status {};
    const bool isThere = lstat(path.c_str(), &status) == 0;
    if (isThere && (!S_ISREG(status.st_mode) || !holdsLog(path) || unlink(path.c_str()) != 0)) {
        return;
    }
    m_path = path;
}

void RunLog::add(std::string_view sentence) const {
    if (m_path.empty()) {
        return;
    }
    const base::Descriptor file(open(
        m_path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0666));
    if (file.isOpen()) {
        base::writeAll(file, timeText(std::chrono::system_clock::now()) + " " +
                                 printable(sentence) + "\n");
    }
}

} // namespace measuretool
