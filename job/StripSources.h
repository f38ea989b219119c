// SPDX-License-Identifier: Apache-2.0
// Where the control strip and the references of a job come from: the part of a load that finds them
// and fetches them into the job's folder.
#pragma once

#include <wx/string.h>

#include "job/JobRecords.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/StripKeys.h"

/// A load under way: the record that it fills, and what it has found out beside it. It owns
/// nothing.
struct JobLoad {
    KZVerifyJobProcessor* processor;
    KZJobDataStruct* job;
    JobTicket ticket; ///< Of the job.
    jobkeys::Strip strip;
    wxString installFolder = {};      ///< Of the server.
    int fromEsko = 0;                 ///< 1: of a packaging workflow.
    int subType = 0;                  ///< What the server calls the job.
    bool hasStoredReferences = false; ///< The ticket holds reference values, and they count.
};

/// What a lookup gives where it finds nothing. The step that fetches the JDF replaces both, so that
/// they never leave a load.
enum LookupFailure : int {
    NoReference = 104,
    ReferencesNotLoaded = 110, ///< Those that the ticket should hold.
};

/// Fetches a file into the job's folder, under the last part of its server path. Where it comes
/// within the limit in milliseconds, *localFile becomes its path; else *localFile stays. A file
/// that does not come is no failure (C30): what needs it finds the gap.
bool fetchFile(const JobLoad& load, const wxString& serverPath, int limit, wxString* localFile);

/// Sets controlStripFile and deviceID, for a dynamic strip dynstripFile too. Returns the code of
/// the ticket read that ended it.
int lookUpControlStrip(const JobLoad& load);

/// Fetches the strip of this name, or path, from the server's folder of control strips.
bool fetchControlStrip(const JobLoad& load, const wxString& name, wxString* localFile);

/// Sets referenceFile, and jobType where it is the references that decide it. Some ways replace
/// controlStripFile. Returns 0 or a LookupFailure.
int lookUpReferences(const JobLoad& load);
