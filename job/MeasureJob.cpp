// SPDX-License-Identifier: Apache-2.0
// The steps that only jobs to be measured need: measuring, and writing the result back.
#include <cstdlib>
#include <utility>

#include "ExitCodes.h"
#include "cli/CLogger.h"
#include "job/FileExists.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

template<class T>
void freeArray(T*& values) {
    std::free(std::exchange(values, nullptr));
}

} // namespace

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

// An open nested job is one of its parent's jobs. The parent comes last (C23). The run ignores
// which of the writes succeed (C24).
void KZVerifyJobProcessor::WriteBackResults(int jobID, const KZJobDataStruct& job,
                                            const analyseResultsRecord& results, bool remeasure) {
    const auto writeTo = [&](int id) {
        CopyResulDataToJobTicket(id, job, results, remeasure);
        SetJobStatus(id, results.overallPassed);
    };
    if (job.childJobIDs != nullptr && job.parentID > 0) {
        CLogger::GetLogger()->Log("Copying resulting data to child jobs and parent");
        for (int i = 0; i < job.childJobCount; ++i) {
            writeTo(job.childJobIDs[i]);
        }
        writeTo(job.parentID);
    } else {
        CLogger::GetLogger()->Log("Copying resulting data to job ticket");
        writeTo(jobID);
    }
    FreeMeasurementData(job);
}

void KZVerifyJobProcessor::FreeMeasurementData(KZJobDataStruct job) {
    measurementDataRecord& measurement = job.measurement;
    freeArray(measurement.spectral);
    freeArray(measurement.xyz);
    freeArray(measurement.lab);
    freeArray(measurement.cmyk);
    freeArray(measurement.reservedValues);
}
