// SPDX-License-Identifier: Apache-2.0
// The measuring tool: what it is told, and its run.
#pragma once

struct KZJobDataStruct;

/// The measuring tool's number of the job's language, such as "de_DE"; any other is 57 (C59).
int GetLanguageID(KZJobDataStruct* job);

namespace measure {

/// Has the measuring tool measure the job's control strip, and waits for it. 0, or -1 if it was
/// running already, -2 if it could not be started, -3 without a control strip, -4 or -5
/// (C65) if there is no definition.
int measureStrip(KZJobDataStruct& job);

} // namespace measure
