// SPDX-License-Identifier: Apache-2.0
// Writing a measurement and its result into a job's JDF file.
#pragma once

#include <wx/string.h>

#include "jdf/JdfMeasurement.h"
#include "job/JobRecords.h"

/// Holds no data.
class JdfHandler {
  public:
    /// Print date and time of now, no date of measuring, formula "CMC", and all else empty, zero or
    /// false, except for secondStrip and measurement, which stay as they are.
    static void SetJDFMeasurementHeaderDefaults(JDFMeasurementHeader* header);

    /// Updates the file at job.jdfLocalFile: stamps the print date and time on the header's party,
    /// sees to the resource link and the resource that hold measurements, and appends the job's
    /// measurement to that resource. With replace, old measurements are to go first; since the
    /// delete is none (see JdfBuffer.h), a file that has some is damaged (C71).
    ///
    /// Returns a code of JdfBuffer.h. The file changes only with code 0, and then as a whole: it is
    /// written under another name in the same folder and renamed.
    static int AppendJDFFileData(KZJobDataStruct job, wxString comment,
                                 JDFMeasurementHeader* header, bool replace);
};
