// SPDX-License-Identifier: Apache-2.0
#include "store/LineFile.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <fstream>
#include <utility>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"

namespace store {

namespace {

constexpr off_t largestFile = 1 << 20;
constexpr const char* timeForm = "%Y-%m-%dT%H:%M:%SZ";
constexpr const char* former = ".old";

void append(std::string& line, std::string_view part) {
    for (const char byte : part) {
        if (byte >= ' ' && byte <= '~' && byte != '\\') {
            line += byte;
            continue;
        }
        char escaped[8];
        std::snprintf(escaped, sizeof escaped, "\\x%02X", static_cast<unsigned char>(byte));
        line += escaped;
    }
}

std::string timeText(std::int64_t seconds) {
    const std::time_t time = seconds;
    std::tm parts = {};
    gmtime_r(&time, &parts);
    char text[40];
    return {text, std::strftime(text, sizeof text, timeForm, &parts)};
}

bool readLine(const std::string& text, std::size_t parts, Line& line) {
    for (std::size_t start = 0; start <= text.size();) {
        const std::size_t end = std::min(text.find('\t', start), text.size());
        line.parts.push_back(text.substr(start, end - start));
        start = end + 1;
    }
    if (line.parts.size() != parts + 1) {
        return false;
    }
    std::tm moment = {};
    const char* const rest = strptime(line.parts[0].c_str(), timeForm, &moment);
    line.time = timegm(&moment);
    line.parts.erase(line.parts.begin());
    return rest != nullptr && *rest == '\0';
}

std::vector<Line> linesOf(const std::string& path, std::size_t parts, std::size_t longest) {
    std::vector<Line> lines;
    std::ifstream file(path);
    if (longest != 0 && file.seekg(0, std::ios::end) &&
        file.tellg() > static_cast<std::streamoff>(longest)) {
        file.seekg(-static_cast<std::streamoff>(longest), std::ios::end);
    } else {
        file.clear();
        file.seekg(0);
    }
    for (std::string text; std::getline(file, text);) {
        Line line;
        if (readLine(text, parts, line)) {
            lines.push_back(std::move(line));
        }
    }
    return lines;
}

/// Of two processes that find the file large, one puts it aside.
void putAside(const base::Descriptor& file, const std::string& path) {
    struct stat opened;
    struct stat named;
    if (flock(file.get(), LOCK_EX | LOCK_NB) == 0 && fstat(file.get(), &opened) == 0 &&
        lstat(path.c_str(), &named) == 0 && opened.st_ino == named.st_ino) {
        std::rename(path.c_str(), (path + former).c_str());
    }
}

} // namespace

std::string lineText(std::int64_t time, const std::vector<std::string_view>& parts) {
    std::string line = timeText(time);
    for (const std::string_view part : parts) {
        line += '\t';
        append(line, part);
    }
    return line + '\n';
}

LineFile::LineFile(std::string path, bool shared) : m_path(std::move(path)), m_shared(shared) {}

void LineFile::append(const std::string& line, const std::function<void(int file)>& made) const {
    if (m_path.empty()) {
        return;
    }
    constexpr int flags = O_WRONLY | O_APPEND | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
    for (const bool again : {false, true}) {
        base::Descriptor file(open(m_path.c_str(), flags));
        if (!file.isOpen()) {
            file = base::Descriptor(open(m_path.c_str(), flags | O_CREAT | O_EXCL, 0600));
            if (file.isOpen() && made) {
                made(file.get());
            }
        }
        struct stat status;
        if (!file.isOpen() || fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode) ||
            !(m_shared || status.st_uid == geteuid())) {
            return;
        }
        if (status.st_size >= largestFile && !again) {
            putAside(file, m_path);
            continue;
        }
        base::writeAll(file, line);
        return;
    }
}

std::vector<Line> LineFile::lines(std::size_t parts, std::size_t longest) const {
    return linesOf(m_path, parts, longest);
}

std::vector<Line> LineFile::formerLines(std::size_t parts) const {
    return linesOf(m_path + former, parts, 0);
}

} // namespace store
