// SPDX-License-Identifier: Apache-2.0
// Takes one job of a print server from the arguments to the result code.
#pragma once

#include <string>

#include <wx/string.h>

#include "job/AnalysisLibrary.h"
#include "job/JobRecords.h"

class CKZConnector;

/// Use one object per process: it makes one pass, and it finds its working folder only once.
///
/// The sources follow the steps of that pass: login (this name), Verification, LoadJob with
/// StripSources, StoredData, MeasureJob, WriteBack, JobStatus. Integer results are 0 or a code of
/// docs/exit-codes.csv, unless stated otherwise.
///
/// REQUIRES m_connector not null for everything that reads or writes tickets or server files.
class KZVerifyJobProcessor {
  public:
    /// Creates the working folder and opens the job's log in it.
    KZVerifyJobProcessor();
    /// Closes the log, then logs out.
    ~KZVerifyJobProcessor();
    KZVerifyJobProcessor(const KZVerifyJobProcessor&) = delete;
    KZVerifyJobProcessor& operator=(const KZVerifyJobProcessor&) = delete;

    /// Returns the program's folder in the temporary folder and creates it if it is missing. If
    /// that path is a symlink or belongs to another user, returns a path under /dev/null, so that
    /// nothing can be created there: a job writes passwords. Only the first call in a process does
    /// this; later calls return an empty text (C13).
    wxString SetWorkingDir();
    /// m_workingDir as bytes.
    std::string GetNerovaKZJobDataDir() const;

    /// Logs in. On failure returns null and sets m_lastRetCode. The caller owns the result.
    CKZConnector* ConnectToKZWithLoginCredentials(std::wstring host, std::wstring user,
                                                  std::wstring password, int applicationID,
                                                  bool flag);

    /// Verifies one job and returns the exit code of the process. For job id -1 it only starts the
    /// viewer (C14). `strip` is 1 for the second strip.
    int VerifyKZJob(std::wstring host, std::wstring user, std::wstring password, std::wstring jobID,
                    std::wstring strip, std::wstring language, bool remeasure);

    /// Fills the record from the job's ticket and downloads the job's files to its folder.
    /// REQUIRES: secondStrip of the record is set.
    int LoadKZJobData(int jobID, KZJobDataStruct* job);
    /// Fills childJobIDs (from malloc, freed by VerifyKZJob) with all jobs to verify that have this
    /// job's parent, including the job itself (C41).
    void GetChildJobIDsFromParent(KZJobDataStruct* job);
    /// Fills jdfServerFile. On failure empties it and returns the code of the failed read.
    int GetJobJDFFileName(KZJobDataStruct* job);

    /// Replaces the arrays of the record's measurement by the ticket's values for the record's
    /// strip. The new arrays come from malloc. A missing array is not a failure.
    int LoadKZJobMeasurements(KZJobDataStruct* job);
    /// Same for the stored references: CMYK in whole percent, never with spectra.
    int LoadKZJobReferences(KZJobDataStruct* job);

    /// The instrument of a control-strip file, or 0 if it names none (C49). Returns 10 if there is
    /// no such file.
    int GetDeviceIDFromIt8ControlStripFileEx(wxString path, int* deviceID);

    /// Writes the record's measurement as CGATS text to its referenceFile or sampleFile. Returns -1
    /// if there are no device values. Does not report a file that can't be opened (C48).
    int WriteTemporarySampleFile(KZJobDataStruct job, bool reference);

    /// Creates the measuring tool's definition from a control-strip file, in the same folder, and
    /// returns its path. On failure returns an empty text and can leave a partial file.
    wxString WriteTemporaryMeasurementDefinitionFile(wxString path, KZJobDataStruct* job);

    /// Runs the measuring tool on the job's control strip and waits for it. Returns 0, or -1 if the
    /// tool was already running, -2 if it could not be started, -3 if there is no control strip, -4
    /// or -5 (C65) if there is no definition.
    int ConfigureAndLaunchNerovaMeasure(KZJobDataStruct* job);

    /// Writes a result and its measurement to a job's JDF and ticket (C84). Returns the code of the
    /// last relevant write (C86).
    int CopyResulDataToJobTicket(int jobID, KZJobDataStruct job, analyseResultsRecord results,
                                 bool remeasure);
    /// Appends an error to a job's messages (C93). Returns the code of the write.
    int WrietErrorToJobTicket(int errorCode, int jobID);
    /// Closes a job, unless it has two strips and one of them has no result yet. Returns 0, or the
    /// code of the read of the number of strips if that failed.
    int SetJobStatus(int jobID, bool approved);

    /// Frees the arrays of the job's measurement but does not reset the caller's pointers (C25).
    void FreeMeasurementData(KZJobDataStruct job);

    wxString m_workingDir;
    CKZConnector* m_connector = nullptr; ///< Owned; null until a login has succeeded.
    int m_lastRetCode = 0;               ///< Last return code of the connector.

    /// Whether to compare the measurement in the loaded job's ticket. If false, which it always is
    /// with remeasure, the job is measured.
    static bool IsToBeCompared(const KZJobDataStruct& job, bool remeasure);
    /// Compares the measurement in the ticket. Writes nothing to the ticket (C21).
    int CompareStoredData(KZJobDataStruct* job, std::wstring* json);

  private:
    /// Whether the server lists the job among those to be verified or remeasured.
    bool IsListed(int jobID, bool remeasure);
    /// All steps after a job was loaded.
    int VerifyLoadedJob(KZJobDataStruct* job, bool remeasure);
    /// Compares referenceFile with sampleFile. *results may be null.
    int AnalyzeJob(KZJobDataStruct* job, analyseResultsRecord* results, std::wstring* json);
    /// Measures the job and compares the result.
    int MeasureJob(KZJobDataStruct* job, analyseResultsRecord* results, std::wstring* json);
    /// Writes to the job, or to all jobs of its parent and to the parent. Afterwards the arrays of
    /// the job's measurement are freed.
    void WriteBackResults(int jobID, const KZJobDataStruct& job,
                          const analyseResultsRecord& results, bool remeasure);
};

/// Same as KZVerifyJobProcessor::SetWorkingDir, also once per process (C13). Not called in the flow
/// (C171).
wxString myMkTmpDirName();
