// SPDX-License-Identifier: Apache-2.0
// The person who measures and exports.
#pragma once

#include <string>

#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Notification.h"
#include "companions/measure-tool/Progress.h"
#include "companions/measure-tool/RunLog.h"

namespace measuretool {

/// Gives the operator instructions on the terminal and the desktop, and logs them.
class Operator {
  public:
    /// `strip` is its name for people, or empty. The others must outlive this object.
    Operator(const std::string& strip, Progress& progress, const RunLog& log);

    /// Asks for an export, which must be at `path` before `end`. The notification disappears with
    /// this object.
    void askForExport(const std::string& path, Clock::time_point end);

    /// Shows the remaining time.
    void showTime();

    /// Reports that an export was refused and asks for another one.
    void refuse(const std::string& problem);

    /// Reports a remark on an accepted export.
    void remark(const std::string& sentence);

  private:
    std::string timeLeft() const;

    const std::string m_strip;
    Progress& m_progress;
    const RunLog& m_log;
    Notification m_notification;
    std::string m_path;
    std::string m_shown; ///< The time shown on the terminal.
    Clock::time_point m_end;
    std::string m_until; ///< The end of the wait as clock time.
};

} // namespace measuretool
