// SPDX-License-Identifier: Apache-2.0
// Writes a measurement and its result into a job's JDF file.
#pragma once

#include <wx/string.h>

#include "jdf/JdfMeasurement.h"
#include "job/JobRecords.h"

/// Has no data.
class JdfHandler {
  public:
    /// Sets print date and time to now, no measuring date and the formula "CMC". Everything else
    /// becomes empty, zero or false, except secondStrip and measurement, which are unchanged.
    static void SetJDFMeasurementHeaderDefaults(JDFMeasurementHeader* header);

    /// Updates the file at job.jdfLocalFile: stamps the print date and time on the header's party,
    /// ensures the resource link and the resource for measurements, and appends the job's
    /// measurement to that resource. With `replace`, old measurements are deleted first. Since that
    /// delete does not work (see JdfBuffer.h), it damages a file that has old measurements (C71).
    ///
    /// Returns a code of JdfBuffer.h. Only code 0 changes the file, and then completely: a new file
    /// in the same folder is renamed.
    static int AppendJDFFileData(KZJobDataStruct job, wxString comment,
                                 JDFMeasurementHeader* header, bool replace);
};
