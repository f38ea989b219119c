// SPDX-License-Identifier: Apache-2.0
// The running applications of this user.
//
// An application is a live process of this user with an executable below the system root, or
// anywhere if there is no root. Zombies are not running.
#pragma once

#include <cstdint>

#include "platform/CoreFoundationStrings.h"

/// Identifies a process, or the position before the first one.
struct ProcessSerialNumber {
    std::uint32_t highLongOfPSN = 0;
    std::uint32_t lowLongOfPSN = 0; ///< The process id; 0 before the first.
};

using OSErr = std::int16_t;
using OSStatus = std::int32_t;
inline constexpr OSErr noErr = 0;
inline constexpr OSErr procNotFound = -600;

/// Moves the cursor to the next running application. Returns procNotFound after the last one. A
/// walk from zero sees those that run when it starts and have not ended when it reaches them.
OSErr GetNextProcess(ProcessSerialNumber* cursor);

/// The application's name, owned by the caller: that of the innermost bundle ("Name.app") that
/// contains the executable, or else the executable's file name. If the process has ended or the
/// name is not UTF-8, returns procNotFound and sets *name to null.
OSStatus CopyProcessName(const ProcessSerialNumber* process, CFStringRef* name);

/// Asks the application to terminate (SIGTERM). Returns procNotFound if it is not running, is this
/// process itself, or can't be signalled.
OSErr KillProcess(const ProcessSerialNumber* process);
