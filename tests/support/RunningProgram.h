// SPDX-License-Identifier: Apache-2.0
// A program that runs beside the test.
#pragma once

#include <string>

#include <sys/types.h>

namespace support {

/// Started with the argument "60", which lets a copy of sleep(1) run as anything; killed with this
/// object. While it is not, an ended program stays as a process that nobody has waited for.
class RunningProgram {
  public:
    explicit RunningProgram(const std::string& path);
    ~RunningProgram();
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;

    pid_t number() const { return m_number; }

    /// The signal that has ended the program, or ends it within half a second; else 0.
    int endingSignal() const;

  private:
    pid_t m_number = -1;
};

} // namespace support
