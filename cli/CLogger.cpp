// SPDX-License-Identifier: Apache-2.0
#include "cli/CLogger.h"

#include <cstdarg>
#include <cstdio>
#include <ctime>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

CLogger* CLogger::m_pThis = nullptr;
std::ofstream CLogger::m_Logfile;
std::string CLogger::m_sFileName = "Log.txt";

namespace {

// Opens `path` for writing and truncates it, if the file is safe for passwords; otherwise the
// stream stays closed. The stream is opened through the descriptor, so that the file written is the
// file checked. O_NONBLOCK prevents a pipe without a reader from blocking the run.
void openPrivately(std::ofstream& stream, const std::string& path) {
    const int descriptor =
        open(path.c_str(), O_WRONLY | O_CREAT | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0600);
    if (descriptor < 0) {
        return;
    }
    struct stat status;
    if (fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode) && status.st_uid == geteuid() &&
        fchmod(descriptor, 0600) == 0) {
        stream.open("/proc/self/fd/" + std::to_string(descriptor), std::ios::out);
    }
    close(descriptor);
}

} // namespace

CLogger* CLogger::InitLogger(std::string fileName) {
    if (m_pThis == nullptr) {
        m_pThis = new CLogger;
        openPrivately(m_Logfile, fileName);
    }
    return m_pThis;
}

void CLogger::DeleteLogger() {
    if (m_pThis == nullptr) {
        return;
    }
    if (m_Logfile.is_open()) {
        m_Logfile.close();
    }
    delete m_pThis;
    m_pThis = nullptr;
}

void CLogger::Log(const char* format, ...) {
    if (m_pThis == nullptr || !m_Logfile.is_open()) {
        return;
    }
    char text[1024] = "";
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    WriteLine(text);
}

void CLogger::Log(char* text) {
    if (m_pThis == nullptr || !m_Logfile.is_open()) {
        return;
    }
    WriteLine(text);
}

CLogger& CLogger::operator<<(const std::string& text) {
    m_Logfile << "\n" << CurrentDateTime() << ":\t" << text << "\n";
    return *this;
}

std::string CLogger::CurrentDateTime() {
    const std::time_t now = std::time(nullptr);
    std::tm local = {};
    localtime_r(&now, &local);
    char text[32] = "";
    if (std::strftime(text, sizeof text, "%a, %d.%m.%Y %H:%M:%S", &local) == 0) {
        return {}; // The day name does not fit; the contents are undefined.
    }
    return text;
}

void CLogger::WriteLine(const char* text) {
    m_Logfile << CurrentDateTime() << ":\t" << text << "\n";
}
