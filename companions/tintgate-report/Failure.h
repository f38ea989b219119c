// How this program ends.
#pragma once

#include <stdexcept>
#include <string>

namespace reporting {

/// Exit statuses. The help, the manual page and docs/report.md list them, too.
enum class Status {
    Done = 0,         ///< With --verdict: passed.
    Failed = 1,       ///< --verdict alone.
    Incomplete = 2,   ///< --verdict alone: incomplete or unreadable.
    Unreadable = 3,   ///< A result or meta file is missing or can't be read.
    Broken = 4,       ///< A result or meta file makes no sense.
    NotWritten = 5,   ///< The output could not be written.
    SomeLeftOut = 6,  ///< The output is there, without results that could not be read.
    NothingFound = 7, ///< No result fits what was asked for; nothing was written.
    Store = 8,        ///< The store can't be opened or read.
    UnknownCode = 9,  ///< There is no such exit code.
    NotTidied = 10,   ///< A job's folder could not be looked at or removed.
    BadCommand = 64,
    Internal = 70, ///< Out of memory, or a fault of the program.
};

/// Ends the program. The text is a sentence for people, without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

} // namespace reporting
