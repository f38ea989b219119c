// SPDX-License-Identifier: Apache-2.0
// What a run reports, kept in a file: the standard error of a program that another one starts is
// often lost.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace measuretool {

class RunLog {
  public:
    static constexpr const char* name = "NerovaMeasure.log";

    /// From now on the log is the file of this name in the folder of the output, which is the
    /// job's folder. Removes that of an earlier run. Keeps no log if the file is the output itself
    /// or one of `inputs`, or is anything else than an earlier log: files of the job are there too.
    void start(const std::string& output, const std::vector<std::string>& inputs);

    /// Adds a line with the time. Does nothing before start(). A log that can't be written is not
    /// a failure of the run.
    void add(std::string_view sentence) const;

  private:
    std::string m_path;
};

} // namespace measuretool
