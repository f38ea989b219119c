// SPDX-License-Identifier: Apache-2.0
#include "RunningProgram.h"

#include <stdexcept>

#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include "RunProgram.h"

namespace support {

RunningProgram::RunningProgram(const std::string& path) {
    std::string program = path;
    char seconds[] = "60";
    char* arguments[] = {program.data(), seconds, nullptr};
    // Returns after the child has executed the program.
    if (posix_spawn(&m_number, path.c_str(), nullptr, nullptr, arguments, environ) != 0) {
        throw std::runtime_error("can't start " + path);
    }
}

RunningProgram::~RunningProgram() {
    kill(m_number, SIGKILL);
    waitpid(m_number, nullptr, 0);
}

int RunningProgram::endingSignal() const {
    awaitEnd(m_number, std::chrono::milliseconds(500));
    siginfo_t info = {};
    waitid(P_PID, static_cast<id_t>(m_number), &info, WEXITED | WNOHANG | WNOWAIT);
    return info.si_pid == m_number && info.si_code != CLD_EXITED ? info.si_status : 0;
}

} // namespace support
