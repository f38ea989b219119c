// SPDX-License-Identifier: Apache-2.0
// A program that runs during a test.
#pragma once

#include <string>

#include <sys/types.h>

namespace support {

/// Started with the argument "60", so that a copy of sleep(1) can pose as any program. Killed with
/// this object. Until then, a program that has ended stays as a zombie.
class RunningProgram {
  public:
    explicit RunningProgram(const std::string& path);
    ~RunningProgram();
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;

    pid_t number() const { return m_number; }

    /// The signal that has ended the program or ends it within half a second; otherwise 0.
    int endingSignal() const;

  private:
    pid_t m_number = -1;
};

} // namespace support
