// SPDX-License-Identifier: Apache-2.0
// The program's only log writer: a plain text trace for support, without levels or rotation.
//
//     Mon, 24.11.2025 09:30:05:	argument 1: -version
//
// A line is a time stamp in local time, a colon and a tab, the message, and a line feed.
#pragma once

#include <fstream>
#include <string>

/// One process-wide log with at most one open file. For the main thread alone: nothing is locked.
/// It belongs to the program; a module that the program loads writes to the same log.
///
/// Nothing is flushed before DeleteLogger, so a crash can lose the tail of a trace.
class __attribute__((visibility("default"))) CLogger {
  public:
    /// Opens `fileName`, replacing its contents; if a log is open already, the name is ignored.
    ///
    /// Logs hold passwords: the file is for its owner alone (mode 0600), and it stays closed where
    /// the name is a symbolic link, belongs to somebody else or is no regular file. A file that
    /// can't be opened is not reported; lines then vanish (C10).
    static CLogger* InitLogger(std::string fileName);

    /// Null while no log is open.
    static CLogger* GetLogger() { return m_pThis; }

    /// Closes the log; harmless when there is none.
    static void DeleteLogger();

    // Both are static so that `GetLogger()->Log(...)` touches no object and a null pointer is
    // harmless: without a log, or with one that could not be opened, they do nothing.

    /// One line, printf-style; the message is cut at 1023 bytes. Texts from outside go through
    /// "%s", never as the format.
    static void Log(const char* format, ...) __attribute__((format(printf, 1, 2)));

    /// One line with the text as it stands.
    static void Log(char* text);

    /// An empty line, then one line with the text (C11). REQUIRES: a log is open.
    CLogger& operator<<(const std::string& text);

  private:
    CLogger() = default;

    static std::string CurrentDateTime();
    static void WriteLine(const char* text);

    static CLogger* m_pThis;
    static std::ofstream m_Logfile;
    static std::string m_sFileName; ///< Never read (C110): InitLogger gets the name.
};
