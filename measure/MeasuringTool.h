// SPDX-License-Identifier: Apache-2.0
// How a job's language reaches the measuring tool.
#pragma once

struct KZJobDataStruct;

/// The measuring tool's number of the job's language, such as "de_DE"; any other is 57 (C59).
int GetLanguageID(KZJobDataStruct* job);
