// SPDX-License-Identifier: Apache-2.0
// Keeps a run's reports in a file, because the standard error of a started program is often lost.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace measuretool {

class RunLog {
  public:
    static constexpr const char* name = "NerovaMeasure.log";

    /// Logs to a file of fixed name in the folder of the output, which is the job's folder. Removes
    /// the log of an earlier run. Does not log if the file is the output or one of `inputs`, or is
    /// not an earlier log: the folder contains files of the job too.
    void start(const std::string& output, const std::vector<std::string>& inputs);

    /// Adds a line with the time. Does nothing before start(). A failure to write the log does not
    /// fail the run.
    void add(std::string_view sentence) const;

  private:
    std::string m_path;
};

} // namespace measuretool
