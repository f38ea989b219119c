// How a job's language reaches the measuring tool.
#pragma once

struct KZJobDataStruct;

/// The measuring tool's number of the job's language, such as "de_DE"; that of any other one is 57.
int GetLanguageID(KZJobDataStruct* job);
