// SPDX-License-Identifier: Apache-2.0
// The part of a load that finds a job's control strip and references and downloads them to the
// job's folder.
#pragma once

#include <wx/string.h>

#include "job/JobRecords.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/StripKeys.h"

/// A load in progress: the record that it fills and its other intermediate results. Owns nothing.
struct JobLoad {
    KZVerifyJobProcessor* processor;
    KZJobDataStruct* job;
    JobTicket ticket; ///< The job's ticket.
    jobkeys::Strip strip;
    wxString installFolder = {};      ///< The server's.
    int fromEsko = 0;                 ///< 1: the job is from a packaging workflow.
    int subType = 0;                  ///< The server's classification of the job.
    bool hasStoredReferences = false; ///< The ticket has reference values to use.
};

/// Results of a failed lookup. They never leave a load, because the JDF step replaces both.
enum LookupFailure : int {
    NoReference = 104,
    ReferencesNotLoaded = 110, ///< The ticket's references.
};

/// Downloads a file to the job's folder, under the last part of its server path. If it arrives
/// within the limit in milliseconds, *localFile becomes its path; otherwise *localFile is
/// unchanged. A missing file is not a failure (C30): the step that needs it reports it.
bool fetchFile(const JobLoad& load, const wxString& serverPath, int limit, wxString* localFile);

/// Sets controlStripFile and deviceID, and for a dynamic strip dynstripFile. Returns the code of
/// the last ticket read.
int lookUpControlStrip(const JobLoad& load);

/// Downloads the strip of this name or path from the server's folder of control strips.
bool fetchControlStrip(const JobLoad& load, const wxString& name, wxString* localFile);

/// Sets referenceFile, and jobType if the references determine it. Some sources replace
/// controlStripFile. Returns 0 or a LookupFailure.
int lookUpReferences(const JobLoad& load);
