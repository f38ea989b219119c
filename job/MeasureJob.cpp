// SPDX-License-Identifier: Apache-2.0
// Measuring a job: passes its record to the measuring tool and to the writers of its text files.
#include "job/KZVerifyJobProcessor.h"
#include "measure/DefinitionFile.h"
#include "measure/MeasuringTool.h"
#include "measure/SampleFile.h"
#include "measure/StripLines.h"

int KZVerifyJobProcessor::GetDeviceIDFromIt8ControlStripFileEx(wxString path, int* deviceID) {
    return measure::readDeviceID(path, deviceID);
}

int KZVerifyJobProcessor::WriteTemporarySampleFile(KZJobDataStruct job, bool reference) {
    return measure::writeSampleFile(reference ? job.referenceFile : job.sampleFile,
                                    job.illuminationMode, job.measurement);
}

wxString KZVerifyJobProcessor::WriteTemporaryMeasurementDefinitionFile(wxString path,
                                                                       KZJobDataStruct* job) {
    return measure::writeDefinition(path, *job);
}

int KZVerifyJobProcessor::ConfigureAndLaunchNerovaMeasure(KZJobDataStruct* job) {
    return measure::measureStrip(*job);
}
