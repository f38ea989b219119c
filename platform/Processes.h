// SPDX-License-Identifier: Apache-2.0
// The running applications of this user.
//
// An application is a live process of this user whose executable lies below the system root, or
// anywhere where there is no root. A process that has ended and was not waited for is not running.
#pragma once

#include <cstdint>

#include "platform/CoreFoundationStrings.h"

/// Names a process, or the place before the first one.
struct ProcessSerialNumber {
    std::uint32_t highLongOfPSN = 0;
    std::uint32_t lowLongOfPSN = 0; ///< The process's number; 0 before the first.
};

using OSErr = std::int16_t;
using OSStatus = std::int32_t;
inline constexpr OSErr noErr = 0;
inline constexpr OSErr procNotFound = -600;

/// Moves the cursor to the next running application; procNotFound behind the last one. A walk that
/// starts at zero sees those that run at its start and have not ended when it comes to them.
OSErr GetNextProcess(ProcessSerialNumber* cursor);

/// The application's name, owned by the caller: that of the innermost bundle ("Name.app") that its
/// executable lies in, else the executable's file name. procNotFound, with *name null, if it has
/// ended or the name is not UTF-8.
OSStatus CopyProcessName(const ProcessSerialNumber* process, CFStringRef* name);

/// Asks the application to end (SIGTERM). procNotFound if it is not running, is this process
/// itself, or can't be told.
OSErr KillProcess(const ProcessSerialNumber* process);
