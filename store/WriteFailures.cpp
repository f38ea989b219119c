// SPDX-License-Identifier: Apache-2.0
#include "store/WriteFailures.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <fstream>
#include <string_view>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "jobkeys/Tickets.h"

namespace store {

namespace {

constexpr off_t largestFile = 1 << 20;
constexpr const char* timeForm = "%Y-%m-%dT%H:%M:%SZ";

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

std::string lineOf(const WriteFailure& failure) {
    std::string line = timeText(failure.time);
    for (const auto* part : {&failure.server, &failure.target, &failure.key, &failure.reason}) {
        line += '\t';
        append(line, *part);
    }
    return line + '\n';
}

bool readLine(const std::string& line, WriteFailure& failure) {
    std::string time;
    std::string* const parts[] = {&time, &failure.server, &failure.target, &failure.key,
                                  &failure.reason};
    std::size_t start = 0;
    for (std::string* const part : parts) {
        if (start > line.size()) {
            return false;
        }
        const std::size_t end = std::min(line.find('\t', start), line.size());
        *part = line.substr(start, end - start);
        start = end + 1;
    }
    std::tm moment = {};
    const char* const rest = strptime(time.c_str(), timeForm, &moment);
    failure.time = timegm(&moment);
    return rest != nullptr && *rest == '\0' && start > line.size();
}

} // namespace

std::string ticketNameOf(int type, int id) {
    return (type == jobkeys::jobType ? "job" : std::to_string(type)) + "/" + std::to_string(id);
}

WriteFailures::WriteFailures(const std::string& folder)
    : m_path(folder.empty()
                 ? ""
                 : folder + "/tintgate-failed-writes-" + std::to_string(geteuid()) + ".txt") {}

void WriteFailures::add(const WriteFailure& failure) const {
    if (m_path.empty()) {
        return;
    }
    struct stat status;
    if (lstat(m_path.c_str(), &status) == 0 && status.st_uid == geteuid() &&
        status.st_size >= largestFile) {
        std::rename(m_path.c_str(), (m_path + ".old").c_str());
    }
    const base::Descriptor file(open(
        m_path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0600));
    if (file.isOpen() && fstat(file.get(), &status) == 0 && S_ISREG(status.st_mode) &&
        status.st_uid == geteuid()) {
        base::writeAll(file, lineOf(failure));
    }
}

std::vector<WriteFailure> WriteFailures::all() const {
    std::vector<WriteFailure> failures;
    std::ifstream file(m_path);
    for (std::string line; std::getline(file, line);) {
        WriteFailure failure;
        if (readLine(line, failure)) {
            failures.push_back(std::move(failure));
        }
    }
    return failures;
}

} // namespace store
