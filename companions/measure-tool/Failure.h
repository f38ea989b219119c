// How a run of the measuring tool ends.
#pragma once

#include <stdexcept>
#include <string>

#include "colour/Failure.h"

namespace measuring {

/// The exit status of the program. The numbers are in its help and in docs/measuring.md.
enum class Status : int {
    Done = 0,
    BadOptions = 2,        ///< The options file can't be read, or asks for what can't be done.
    BadSettings = 3,       ///< No settings, or settings that make no sense.
    BadDefinition = 4,     ///< The definition can't be read.
    NotMeasurable = 5,     ///< The virtual instrument can't print or measure such patches.
    BadProfile = 6,        ///< The profile can't be used.
    BadExport = 7,         ///< The exported measurement is not there or can't be used.
    OtherPatches = 8,      ///< The exported measurement is not of the patches asked for.
    NotWritten = 9,        ///< The result can't be written.
    InstrumentFailed = 10, ///< As the settings wanted it.
    Cancelled = 11,        ///< By a signal, or as the settings wanted it.
    BadCommand = 64,       ///< The command line is not understood.
    OutOfMemory = 70,
};

/// Ends the run. The text is a sentence for people, without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

/// What is wrong with a file, as the end of a sentence that begins with its path.
const char* wordsFor(colour::Failure failure);

/// Throws Failure (`status`, or OutOfMemory) unless the file at `path` could be used.
void expectUsable(colour::Failure failure, Status status, const std::string& path);

} // namespace measuring
