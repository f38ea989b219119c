// SPDX-License-Identifier: Apache-2.0
// The object that carries one job of a print server from its arguments to its result code.
#pragma once

#include <string>

#include <wx/string.h>

#include "job/AnalysisLibrary.h"
#include "job/JobRecords.h"

class CKZConnector;

/// One object per process: it makes one pass, and its working folder is found only once.
///
/// The sources follow the steps of that pass: login (this name), Verification, LoadJob with
/// StripSources, StoredData, MeasureJob, WriteBack, JobStatus. Integer results are 0 or a code of
/// docs/exit-codes.csv, unless stated otherwise.
///
/// REQUIRES for all that reads or writes tickets or files of the server: m_connector is not null.
class KZVerifyJobProcessor {
  public:
    /// Makes the working folder and opens the job's log in it.
    KZVerifyJobProcessor();
    /// Closes the log first, and logs out after that.
    ~KZVerifyJobProcessor();
    KZVerifyJobProcessor(const KZVerifyJobProcessor&) = delete;
    KZVerifyJobProcessor& operator=(const KZVerifyJobProcessor&) = delete;

    /// Finds the program's folder in the temporary folder, making it where it is missing. Where
    /// that is a link or somebody else's, a name below which nothing can be made: what a job writes
    /// holds passwords. Only the first call in a process looks; a later one returns an empty text
    /// (C13).
    wxString SetWorkingDir();
    /// m_workingDir as bytes.
    std::string GetNerovaKZJobDataDir() const;

    /// Logs in. Null if that failed, with the reason in m_lastRetCode. The caller owns the result.
    CKZConnector* ConnectToKZWithLoginCredentials(std::wstring host, std::wstring user,
                                                  std::wstring password, int applicationID,
                                                  bool flag);

    /// Verifies one job; the result is the process's exit code. With job id -1 it starts the viewer
    /// and does nothing else (C14). `strip` is 1 for the second strip.
    int VerifyKZJob(std::wstring host, std::wstring user, std::wstring password, std::wstring jobID,
                    std::wstring strip, std::wstring language, bool remeasure);

    /// Fills the record from the job's ticket and the job's folder from the server.
    /// REQUIRES: secondStrip of the record is set.
    int LoadKZJobData(int jobID, KZJobDataStruct* job);
    /// Fills childJobIDs (from malloc, freed by VerifyKZJob) with all jobs to verify that name this
    /// job's parent, itself included (C41).
    void GetChildJobIDsFromParent(KZJobDataStruct* job);
    /// Fills jdfServerFile, or empties it and returns the code of the read that failed.
    int GetJobJDFFileName(KZJobDataStruct* job);

    /// Puts the values that the ticket holds for the record's strip into its measurement: arrays
    /// from malloc, in place of those that were there. A missing array is no failure.
    int LoadKZJobMeasurements(KZJobDataStruct* job);
    /// The same for the stored references, CMYK in whole percent, never with spectra.
    int LoadKZJobReferences(KZJobDataStruct* job);

    /// The instrument of a control-strip file, 0 where it names none (C49). Returns 10 if there
    /// is no such file.
    int GetDeviceIDFromIt8ControlStripFileEx(wxString path, int* deviceID);

    /// Writes the record's measurement as CGATS text to its referenceFile or sampleFile. -1 without
    /// device values; a file that can't be opened is not reported (C48).
    int WriteTemporarySampleFile(KZJobDataStruct job, bool reference);

    /// Makes the measuring tool's definition from a control-strip file, in the same folder. Returns
    /// its path, or an empty text, in which case a partial file can remain.
    wxString WriteTemporaryMeasurementDefinitionFile(wxString path, KZJobDataStruct* job);

    /// Has the measuring tool measure the job's control strip, and waits for it. 0, or -1 if it was
    /// running already, -2 if it could not be started, -3 without a control strip, -4 or -5
    /// (C65) if there is no definition.
    int ConfigureAndLaunchNerovaMeasure(KZJobDataStruct* job);

    /// Writes a result and its measurement to a job's JDF and ticket (C84). Returns the code of
    /// the last write that counts (C86).
    int CopyResulDataToJobTicket(int jobID, KZJobDataStruct job, analyseResultsRecord results,
                                 bool remeasure);
    /// Adds an error to a job's messages (C93). Returns the code of the write.
    int WrietErrorToJobTicket(int errorCode, int jobID);
    /// Closes a job, unless it has two strips and one of them still lacks a result. 0, or the code
    /// of the read that should have told the number of strips.
    int SetJobStatus(int jobID, bool approved);

    /// Frees the arrays of the job's measurement. The caller's pointers to them stay set (C25).
    void FreeMeasurementData(KZJobDataStruct job);

    wxString m_workingDir;
    CKZConnector* m_connector = nullptr; ///< Owned; null until a login has succeeded.
    int m_lastRetCode = 0;               ///< Last return code of the connector.

    /// Whether the loaded job's ticket contains the measurement to compare. If not, or if a new
    /// measurement is asked for, the job is measured.
    static bool IsToBeCompared(const KZJobDataStruct& job, bool remeasure);
    /// Compares the measurement that the ticket holds. Writes nothing to the ticket (C21).
    int CompareStoredData(KZJobDataStruct* job, std::wstring* json);

  private:
    /// Whether the server lists the job among those to be verified or remeasured.
    bool IsListed(int jobID, bool remeasure);
    /// All that follows once a job is loaded.
    int VerifyLoadedJob(KZJobDataStruct* job, bool remeasure);
    /// Compares referenceFile with sampleFile. *results may be null.
    int AnalyzeJob(KZJobDataStruct* job, analyseResultsRecord* results, std::wstring* json);
    /// A new measurement and its comparison.
    int MeasureJob(KZJobDataStruct* job, analyseResultsRecord* results, std::wstring* json);
    /// To the job, or to all jobs of its parent and the parent. The arrays of the job's measurement
    /// are gone afterwards.
    void WriteBackResults(int jobID, const KZJobDataStruct& job,
                          const analyseResultsRecord& results, bool remeasure);
};

/// Does what KZVerifyJobProcessor::SetWorkingDir does, once per process as well (C13). Nothing
/// in the flow calls it (C171).
wxString myMkTmpDirName();
