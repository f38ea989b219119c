// The person's way to end a measurement: Ctrl-C, a closed terminal, or an application that asks for
// it (SIGINT, SIGHUP, SIGTERM).
#pragma once

#include <chrono>

namespace measuring {

/// From here on these signals no longer end the process; they are seen by the other functions.
void listenForCancel();

/// Throws Failure (Cancelled) if the run was cancelled.
void checkCancelled();

/// Waits, and throws Failure (Cancelled) as soon as the run is cancelled.
void pauseFor(std::chrono::milliseconds time);

} // namespace measuring
