// SPDX-License-Identifier: Apache-2.0
// Runs the measuring tool.
#pragma once

struct KZJobDataStruct;

/// The measuring tool's number of the job's language, such as "de_DE". 57 for any other (C59).
int GetLanguageID(KZJobDataStruct* job);

namespace measure {

/// Runs the measuring tool on the job's control strip and waits for it. Returns 0, or -1 if the
/// tool was already running, -2 if it could not be started, -3 if there is no control strip, -4 or
/// -5 (C65) if there is no definition.
int measureStrip(KZJobDataStruct& job);

} // namespace measure
