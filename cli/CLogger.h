// SPDX-License-Identifier: Apache-2.0
// The program's only log writer: a plain text trace for support, without levels or rotation.
//
//     Mon, 24.11.2025 09:30:05:	argument 1: -version
//
// A line is a time stamp in local time, a colon and a tab, the message, and a line feed.
#pragma once

#include <fstream>
#include <string>

/// One process-wide log with at most one open file. Use it from the main thread only: nothing is
/// locked. It belongs to the program, and a module that the program loads writes to the same log.
///
/// Nothing is flushed before DeleteLogger, so a crash can lose the end of a trace.
class __attribute__((visibility("default"))) CLogger {
  public:
    /// Opens `fileName` and replaces its contents. If a log is already open, the name is ignored.
    ///
    /// Logs contain passwords, so only the owner can read the file (mode 0600). It is not opened if
    /// the name is a symbolic link, belongs to another user or is not a regular file. If the file
    /// can't be opened, nothing is reported and lines are lost (C10).
    static CLogger* InitLogger(std::string fileName);

    /// Null if no log is open.
    static CLogger* GetLogger() { return m_pThis; }

    /// Closes the log. Does nothing if none is open.
    static void DeleteLogger();

    // Static, so that `GetLogger()->Log(...)` uses no object and a null pointer is harmless.
    // Without a log, or if it could not be opened, they do nothing.

    /// Writes one line, printf-style. The message is cut at 1023 bytes. Pass external text as an
    /// argument of "%s", never as the format.
    static void Log(const char* format, ...) __attribute__((format(printf, 1, 2)));

    /// Writes one line with the text unchanged.
    static void Log(char* text);

    /// Writes an empty line, then a line with the text (C11). REQUIRES: a log is open.
    CLogger& operator<<(const std::string& text);

  private:
    CLogger() = default;

    static std::string CurrentDateTime();
    static void WriteLine(const char* text);

    static CLogger* m_pThis;
    static std::ofstream m_Logfile;
    static std::string m_sFileName; ///< Never used (C110): InitLogger gets the name.
};
