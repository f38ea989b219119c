// SPDX-License-Identifier: Apache-2.0
// Loads a job: its ticket, and the files that the ticket names.
//
// The order of the steps and the handling of their codes are required (C29): most reads replace the
// previous code, and the last step, the JDF, replaces all of them. Data that a failed step leaves
// out is noticed later, by the step that needs it.
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <system_error>

#include <wx/filename.h>

#include "ExitCodes.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "base/Malloc.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "job/StripSources.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/StripKeys.h"
#include "jobkeys/Tickets.h"
#include "measure/Paths.h"
#include "ticket/ParameterTables.h"

using namespace jobkeys;

namespace {

constexpr int presetIncomplete = 102; ///< Not returned by a load (C29).
constexpr int fileWait = 1000;        ///< Time limit for a preset or a JDF, in ms.

template<class Values>
bool isOneOf(const Values& values, int number) {
    return std::find(std::begin(values), std::end(values), number) != std::end(values);
}

void makeJobFolder(JobLoad& load, const wxString& workingDir) {
    KZJobDataStruct& job = *load.job;
    job.tempDir = workingDir + "/" + jobFolderName(job.jobID);
    load.ticket.read("Job/FromEsko", 0, &load.fromEsko);
    std::error_code ignored;
    std::filesystem::create_directories(measure::pathBytes(job.tempDir), ignored);
    job.sampleFile = job.tempDir + "/Measured sample.txt";
}

/// Looks up the control strip even if earlier reads failed. The install folder is one of the job's
/// own keys (C32).
int loadControlStrip(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    int code = load.ticket.read("System/InstallFolder", &load.installFolder);
    job.deviceID = 0;
    load.ticket.read("Input/Title", &job.title);
    if (code == 0) {
        load.ticket.read("Footer/Dynstrip/UseDynstrip", 0, &job.useDynstrip);
    }
    code = lookUpControlStrip(load);
    job.instrumentName = GetInstrumentNameFromID(static_cast<unsigned>(job.deviceID));
    return code;
}

/// Only the workflow depends on an earlier step: without a control strip it is not read (C31).
/// Failures of these reads are ignored (C37).
void readMeasurementKeys(JobLoad& load, int code) {
    constexpr int devicesOfModeZero[] = {5, 11, 13, 15, 25};
    KZJobDataStruct& job = *load.job;
    if (code == 0) {
        load.ticket.read(stripKey(load.strip, workflowKey), 0, &job.measurementWorkflow);
    }
    load.ticket.read(measurementKey(load.strip, "Illumination/Mode"), 1, &job.illuminationMode);
    if (isOneOf(devicesOfModeZero, job.deviceID)) {
        job.illuminationMode = 0;
    }
    load.ticket.read("CMM/PaperName", &job.paperName);
    load.ticket.read("Workflow/Name", &job.workflowName);
    load.ticket.read(measurementKey(load.strip, "Status"), 0, &job.measurementStatus);
    load.ticket.read(subTypeKey, 0, &load.subType);
    if (mayUseStored(job.measurementWorkflow, job.measurementStatus)) {
        int patches = 0;
        load.ticket.read(referenceKey(load.strip, "Numpatches"), 0, &patches);
        load.hasStoredReferences = patches >= 1;
    }
}

/// Reads how colours are compared, and the preset's id.
int readComparison(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    const int code = load.ticket.read(stripKey(load.strip, "Workflow/Verify/DeltaEMode"), 0,
                                      &job.tolerance.deltaEMode);
    return code != 0 ? code
                     : load.ticket.read(stripKey(load.strip, "Workflow/Verify/ComparisonMethod"), 0,
                                        &job.presetID);
}

/// Reads values of the preset's ticket. Stops at the first missing one; the required behaviour
/// ignores this failure (C39).
void readPresetKeys(const JobTicket& ticket, tolerancePresetParameterRecord& tolerance) {
    const struct {
        const char* key;
        int fallback;
        int* value;
    } keys[] = {
        {"Editable", 0, &tolerance.editable},
        {"ShowInClient", 0, &tolerance.showInClient},
        {"UsedForDynamicWedge", 0, &tolerance.usedForDynamicWedge},
        {"IlluminationCondition", -1, &tolerance.illuminationCondition},
    };
    for (const auto& [key, fallback, value] : keys) {
        if (ticket.read(key, fallback, value) != 0) {
            break;
        }
    }
}

/// Downloads the preset's file and reads its ticket. Returns 0, or presetIncomplete for a preset
/// without a name.
int loadTolerance(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    tolerancePresetParameterRecord& tolerance = job.tolerance;
    const JobTicket ticket(load.processor->m_connector, job.presetID, presetType);
    tolerance.presetID = job.presetID;
    ticket.read("Name", &tolerance.name);
    if (tolerance.name.empty()) {
        return presetIncomplete;
    }
    job.presetFile = presetFileName(job.presetID);
    job.presetLocalFile = job.tempDir + "/" + job.presetFile;
    fetchFile(load, wxString::FromUTF8(presetPath(load.installFolder.utf8_string(), job.presetID)),
              fileWait, &tolerance.filePath);
    readPresetKeys(ticket, tolerance);
    // The ticket's "FograPSDPreset" is ignored, and the arrays of the plain kind are always read
    // (C38): only the preset's file can turn the preset into one of the PSD kind.
    tolerance.fograPSDPreset = 0;
    ticket.readArray("Values/UsedForResult", presetValueCount, tolerance.usedForResult);
    ticket.readArray("Values/Preset", presetValueCount, tolerance.presetValues);
    ticket.readArray("Values/DecimalPlaces", presetValueCount, tolerance.decimalPlaces);
    return 0;
}

/// Replaces the job's own strip by the strip that all jobs of its parent share.
void loadNesting(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    load.ticket.read("General/ParentID", 0, &job.parentID);
    job.nestedStrip = 0;
    if (job.parentID <= 0) {
        return;
    }
    int mode = 0;
    load.ticket.read("Footer/Nesting/ControlstripMode", 0, &mode);
    // Without this text, a job keeps its own strip (C40).
    int code = load.ticket.read("Footer/Nesting/PSDAssessment", &job.psdAssessment);
    if (mode == 1 && code == 0) {
        wxString name;
        code = load.ticket.read(stripKey(load.strip, nestedStripFileKey), &name);
        job.nestedStrip = code == 0 && fetchControlStrip(load, name, &job.controlStripFile) ? 1 : 0;
    }
    if (job.nestedStrip == 1) {
        load.processor->GetChildJobIDsFromParent(&job);
    }
}

void readInlineValues(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    job.inlineVerifyJob = 1;
    if (load.ticket.read("Output/Prn/Specific/Measurement/VerifyMode", 0, &job.illuminationMode) !=
        0) {
        job.illuminationMode = -1;
    }
    // Missing values stay 0 (C42): -1 means a refused read, and this read is never refused.
    load.ticket.readArray(measurementKey(load.strip, "Values/Measured"), presetValueCount,
                          job.measuredValues);
}

/// The job type for a number of measurements.
int typeFor(int measurements) {
    constexpr int types[] = {0, 2, 3};
    return types[std::clamp(measurements, 0, 2)];
}

void decideJobType(JobLoad& load) {
    constexpr int outputType = 96;
    KZJobDataStruct& job = *load.job;
    const bool isInline = job.deviceID == 0 || (job.deviceID >= 40 && job.deviceID <= 47);

    job.inlineVerifyJob = 0;
    if (isVerification(load.subType) && job.jobType != 3) {
        job.jobType = 1;
    } else if (load.subType != outputType) {
        job.jobType = typeFor(job.measurementStatus);
    } else if (isInline) {
        readInlineValues(load);
        job.jobType = typeFor(std::max(job.measurementStatus, 1)); // Never a job to be measured.
    } else if (job.measurementStatus >=
               0) { // Otherwise keep the type set with the references (C43).
        job.jobType = typeFor(job.measurementStatus);
    }
}

int fetchJdf(JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    const int code = load.processor->GetJobJDFFileName(&job);
    if (code != 0 || load.fromEsko != 0) {
        return code;
    }
    const wxString path = wxFileName(job.jdfServerFile).GetFullPath();
    if (!path.empty() && fetchFile(load, path, fileWait, &job.jdfLocalFile)) {
        return 0;
    }
    job.jdfServerFile.clear();
    job.jdfLocalFile.clear();
    return exitJdfMissing;
}

} // namespace

int KZVerifyJobProcessor::LoadKZJobData(int jobID, KZJobDataStruct* job) {
    job->childJobIDs = nullptr;
    job->jobID = jobID;
    job->jobType = 0;
    JobLoad load{.processor = this,
                 .job = job,
                 .ticket = JobTicket(m_connector, jobID),
                 .strip = stripOf(job->secondStrip)};
    makeJobFolder(load, m_workingDir);
    readMeasurementKeys(load, loadControlStrip(load));
    int code = lookUpReferences(load);
    if (code == 0) {
        code = readComparison(load);
    }
    if (code == 0) {
        code = loadTolerance(load);
    }
    if (code == 0) {
        loadNesting(load);
        decideJobType(load);
    }
    return fetchJdf(load);
}

void KZVerifyJobProcessor::GetChildJobIDsFromParent(KZJobDataStruct* job) {
    job->childJobCount = 0;
    int* listed = nullptr;
    int count = 0;
    const int code = m_connector->GetVerifierJobTicketIDs(&listed, &count, false);
    const base::Malloced<int[]> ids(listed);
    if (code != 0 || ids == nullptr || count < 1) {
        return;
    }
    job->childJobIDs =
        static_cast<int*>(std::malloc(static_cast<std::size_t>(count) * sizeof(int)));
    if (job->childJobIDs == nullptr) {
        return;
    }
    for (int i = 0; i < count; ++i) {
        int parent = 0;
        if (JobTicket(m_connector, ids[i]).read("General/ParentID", 0, &parent) == 0 &&
            parent == job->parentID) {
            job->childJobIDs[job->childJobCount++] = ids[i];
        }
    }
}

// Only a verification (type 1) names the whole path.
int KZVerifyJobProcessor::GetJobJDFFileName(KZJobDataStruct* job) {
    const JobTicket ticket(m_connector, job->jobID);
    wxString name;
    job->jdfServerFile.clear();
    int code = ticket.read(jdfNameKey, &name);
    if (code != 0) {
        return code;
    }
    if (job->jobType == 0 || job->jobType == 2 || job->jobType == 3) {
        // Compared as bytes: a folder that is not valid UTF-8 still counts as present.
        const std::string folder = jdfFolder(ticket.texts(&code));
        if (!folder.empty()) {
            job->jdfServerFile = wxString::FromUTF8(folder) + "/" + name;
        }
        return code;
    }
    return ticket.read(remoteJdfKey, &job->jdfServerFile);
}
