// SPDX-License-Identifier: Apache-2.0
// The person who is to measure and export.
#pragma once

#include <string>

#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Notification.h"
#include "companions/measure-tool/Progress.h"
#include "companions/measure-tool/RunLog.h"

namespace measuretool {

/// Tells the operator what to do, on the terminal and the desktop, and keeps it in the log.
class Operator {
  public:
    /// `strip` is what people call the strip; may be empty. The others outlive this object.
    Operator(const std::string& strip, Progress& progress, const RunLog& log);

    /// It is the operator's turn: the export must be at `path` before `end`. The notification goes
    /// with this object.
    void askForExport(const std::string& path, Clock::time_point end);

    /// Shows the time that is left.
    void showTime();

    /// An export was refused, and another one is waited for.
    void refuse(const std::string& problem);

    /// Something worth knowing about an export that was accepted.
    void remark(const std::string& sentence);

  private:
    std::string timeLeft() const;

    const std::string m_strip;
    Progress& m_progress;
    const RunLog& m_log;
    Notification m_notification;
    std::string m_path;
    std::string m_shown; ///< The time on the terminal.
    Clock::time_point m_end;
    std::string m_until; ///< The same on the operator's clock.
};

} // namespace measuretool
