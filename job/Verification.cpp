// SPDX-License-Identifier: Apache-2.0
// The steps of a job from its arguments to its result code. The job's folder is kept (C26).
#include <algorithm>
#include <chrono>
#include <iterator>
#include <optional>
#include <string>
#include <thread>

#include "ExitCodes.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "base/Malloc.h"
#include "base/TextFile.h"
#include "cli/CLogger.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/StripKeys.h"
#include "jobkeys/Tickets.h"
#include "measure/Helper.h"
#include "measure/Paths.h"
#include "ticket/ParameterTables.h"

namespace {

using std::chrono::steady_clock;

/// Restores text from bytes that were widened one by one.
wxString textOf(const std::wstring& text) {
    return stringToWstring(wstringToString(text));
}

/// Maps the connector's code to the exit code of a failed login (C16).
int loginFailure(int code) {
    switch (code) {
    case -2005:
        return exitLoginNoServer;
    case -2030:
        return exitLoginDisabled;
    case -2031:
        return exitLoginServerNewer;
    case -2033:
        return exitLoginServerOlder;
    default:
        return exitLoginRefused;
    }
}

/// The time that a job waits for its server: a third of the duration of the login (C15).
std::chrono::milliseconds pauseAfter(steady_clock::duration login) {
    constexpr double longest = 5000.0;
    const double pause = std::chrono::duration<double>(login).count() * 1000.0 / 3.0;
    return std::chrono::milliseconds(static_cast<int>(std::min(pause, longest)));
}

/// Writes a file for the viewer. Logs a failure.
bool writeForViewer(const wxString& path, const std::wstring& text, const char* complaint) {
    const std::string bytes = measure::pathBytes(path);
    const bool written = base::writeTextInPlace(bytes, text) && measure::fileExists(path);
    if (!written) {
        CLogger::GetLogger()->Log("Resulting %s file not found = %s", complaint, bytes.c_str());
    }
    return written;
}

/// Whether there is a regular file of this name. If not, logs a line about it.
bool isThere(const wxString& path, const char* complaint) {
    const bool found = measure::fileExists(path);
    if (!found) {
        CLogger::GetLogger()->Log("%s file not found = %s", complaint,
                                  measure::pathBytes(path).c_str());
    }
    return found;
}

/// A running viewer is terminated first (C18).
int showResult(KZJobDataStruct& job, const std::wstring& json) {
    if (!writeForViewer(job.tempDir + "/output.json", json, "json")) {
        return exitResultNotWritten;
    }
    const wxString meta = job.tempDir + "/meta.json";
    if (!writeForViewer(meta, getJsonMetaFileString(&job), "json meta")) {
        return exitMetaNotWritten;
    }
    CLogger::GetLogger()->Log("LaunchNerovaVerify");
    int result = exitDone;
    if (!Helper::LaunchNerovaVerify(result, false, " -detail -meta " + meta, true)) {
        CLogger::GetLogger()->Log("Nerova Verify.exe allready running");
        return exitViewerNotStarted;
    }
    return result;
}

} // namespace

// A job id that is not a number ends the process with an uncaught exception (C8).
int KZVerifyJobProcessor::VerifyKZJob(std::wstring host, std::wstring user, std::wstring password,
                                      std::wstring jobID, std::wstring strip, std::wstring language,
                                      bool remeasure) {
    if (jobID.empty()) {
        return exitWrongArguments;
    }
    const int id = std::stoi(jobID);
    if (id == -1) {
        int result = exitDone;
        Helper::LaunchNerovaVerify(result, false, wxString(), true);
        return result;
    }
    const std::optional<int> stripNumber = jobkeys::stripSelectorOf(strip);
    if (host.empty() || user.empty() || !stripNumber) {
        return exitWrongArguments;
    }

    const auto start = steady_clock::now();
    m_connector =
        ConnectToKZWithLoginCredentials(host, user, password, jobkeys::verifierApplication, true);
    const auto pause = pauseAfter(steady_clock::now() - start);
    const std::string server = wstringToString(host);
    if (m_connector == nullptr) {
        const int result = loginFailure(m_lastRetCode);
        CLogger::GetLogger()->Log("Not able to connect to = %s last ComGui error = %d",
                                  server.c_str(), result);
        return result;
    }

    KZJobDataStruct job;
    std::wstring address;
    std::wstring name;
    job.jobID = id;
    job.secondStrip = *stripNumber;
    job.language = language;
    m_connector->GetServerInfo(&address, &name);
    job.serverName = textOf(name);
    job.serverHost = textOf(host);
    job.userName = textOf(user);
    job.password = textOf(password);
    CLogger::GetLogger()->Log("Logged in to = %s", server.c_str());
    if (!IsListed(id, remeasure)) {
        return exitJobNotListed;
    }

    // Every log has this spelling (C17).
    CLogger::GetLogger()->Log("Veryfing Job ID = %s", wstringToString(jobID).c_str());
    int result = LoadKZJobData(id, &job);
    const base::Malloced<int[]> children(job.childJobIDs);
    // wxMilliSleep would be interrupted by SIGCHLD.
    std::this_thread::sleep_for(pause);
    CLogger::GetLogger()->Log("LoadKZJobData returns = %d", result);
    if (result == exitDone) {
        result = VerifyLoadedJob(&job, remeasure);
    }
    CLogger::GetLogger()->Log("Overall result = %d", result);
    FreeMeasurementData(job);
    return result;
}

bool KZVerifyJobProcessor::IsListed(int jobID, bool remeasure) {
    int* listed = nullptr;
    int count = 0;
    const int code = m_connector->GetVerifierJobTicketIDs(&listed, &count, remeasure);
    const base::Malloced<int[]> ids(listed);
    return code == 0 && ids != nullptr &&
           std::find(listed, listed + count, jobID) != listed + count;
}

int KZVerifyJobProcessor::VerifyLoadedJob(KZJobDataStruct* job, bool remeasure) {
    int result =
        parsePresetParameterXMLFile(job->tolerance.filePath.ToStdWstring(), &job->tolerance, true);
    result = result == 0 ? exitDone : exitPresetFailed;
    CLogger::GetLogger()->Log("parsePresetParameterXMLFile returns = %d", result);
    if (result != exitDone) {
        return result;
    }
    CLogger::GetLogger()->Log("m_jobType is = %d", job->jobType);
    std::wstring json;
    if (IsToBeCompared(*job, remeasure)) {
        result = CompareStoredData(job, &json);
        return result == exitDone ? showResult(*job, json) : result;
    }
    analyseResultsRecord results;
    result = MeasureJob(job, &results, &json);
    if (result == exitDone) {
        WriteBackResults(job->jobID, *job, results, remeasure);
        result = showResult(*job, json);
        job->measurement = measurementDataRecord(); // The write-back has freed its arrays.
    }
    return result;
}

bool KZVerifyJobProcessor::IsToBeCompared(const KZJobDataStruct& job, bool remeasure) {
    constexpr int inlineDevices[] = {40, 45, 46, 47}; // Not all inline devices (C22).
    const bool isMeasured =
        job.jobType == 2 || job.jobType == 3 ||
        (job.secondStrip == 1 &&
         std::count(std::begin(inlineDevices), std::end(inlineDevices), job.deviceID) != 0);
    return !remeasure && isMeasured;
}

// A missing reference file is logged but does not end the run here: the analysis reports it (C19).
int KZVerifyJobProcessor::CompareStoredData(KZJobDataStruct* job, std::wstring* json) {
    CLogger::GetLogger()->Log("Comparing existing data");
    const int loaded = LoadKZJobMeasurements(job);
    CLogger::GetLogger()->Log("LoadKZJobMeasurements returns = %d", loaded);
    if (loaded != 0) {
        return exitStoredDataFailed;
    }
    isThere(job->referenceFile, "Reference");
    if (WriteTemporarySampleFile(*job, false) != 0) {
        CLogger::GetLogger()->Log("Measurement file not found = %s",
                                  measure::pathBytes(job->sampleFile).c_str());
        return exitSampleMissing;
    }
    return isThere(job->sampleFile, "Measurement") ? AnalyzeJob(job, nullptr, json)
                                                   : exitSampleMissing;
}

// A missing reference file ends the run here, unlike with stored measurements. If both files are
// missing, the code of the measurement is returned (C19).
int KZVerifyJobProcessor::MeasureJob(KZJobDataStruct* job, analyseResultsRecord* results,
                                     std::wstring* json) {
    CLogger::GetLogger()->Log("Veryfing existing measurement job");
    const int launched = ConfigureAndLaunchNerovaMeasure(job);
    CLogger::GetLogger()->Log("ConfigureAndLaunchNerovaMeasure returns = %d", launched);
    if (launched != 0) {
        return exitMeasuringFailed; // For every failure (C20).
    }
    int result = exitDone;
    if (!isThere(job->referenceFile, "Reference")) {
        result = exitReferenceMissing;
    }
    if (!isThere(job->sampleFile, "Measurement")) {
        result = exitSampleMissing;
    }
    return result == exitDone ? AnalyzeJob(job, results, json) : result;
}

int KZVerifyJobProcessor::AnalyzeJob(KZJobDataStruct* job, analyseResultsRecord* results,
                                     std::wstring* json) {
    CLogger::GetLogger()->Log("Reference file = %s",
                              measure::pathBytes(job->referenceFile).c_str());
    CLogger::GetLogger()->Log("Measurement file = %s", measure::pathBytes(job->sampleFile).c_str());
    const int result =
        analyzeMeasurements(job->referenceFile.ToStdWstring(), job->sampleFile.ToStdWstring(),
                            std::wstring(), job->tolerance, results, json, job);
    CLogger::GetLogger()->Log("analyzeMeasurements returns = %d", result);
    return result;
}
