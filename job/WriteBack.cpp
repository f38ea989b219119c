// SPDX-License-Identifier: Apache-2.0
// Writes the result of one strip to its job: into the JDF, if the job's workflow requires it, and
// into the ticket, under the keys of the strip.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <new>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <wx/datetime.h>

#include "cli/CLogger.h"
#include "jdf/JdfHandler.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/PatchArrays.h"
#include "jobkeys/ResultPositions.h"
#include "jobkeys/StripKeys.h"
#include "jobkeys/Tickets.h"
#include "text/CharSets.h"
#include "text/MathLib.h"

using namespace jobkeys;

namespace {

constexpr int workflowWithJdf = 3; ///< Value of KZJobDataStruct::measurementWorkflow.

constexpr int paperWhite = 4;    ///< Index in analyseResultsRecord::approvals.
constexpr int averageDeltaE = 5; ///< Index in analyseResultsRecord::values.
constexpr int maximumDeltaE = 6;

/// A job's ticket, below the root of one of its strips.
class StripTicket {
  public:
    StripTicket(CKZConnector* connector, int jobID, Strip strip)
        : m_ticket(connector, jobID), m_strip(strip) {}

    Strip strip() const { return m_strip; }

    template<class T>
    int write(std::string_view name, const T& value) const {
        return m_ticket.write(measurementKey(m_strip, name), value);
    }

    template<class T>
    void writeArray(std::string_view name, int count, const T* values) const {
        m_ticket.writeArray(measurementKey(m_strip, name), count, values);
    }

  private:
    const JobTicket m_ticket;
    const Strip m_strip;
};

std::string commentOf(Strip strip) {
    return strip == Strip::First ? "Remote confirmation M1" : "Remote confirmation M2";
}

/// The formula's name in the JDF.
const char* formulaName(int deltaEType) {
    switch (deltaEType) {
    case 2:
        return "CIECMC";
    case 3:
        return "CIE94";
    case 4:
        return "CIE2000";
    case 5:
        return "CIECMC_2_1";
    default:
        return "CIE76";
    }
}

/// Converts a device value of 0 to 255 to percent: with two decimals for the first strip, as a
/// 16-bit integer for the second (C85).
double percentOf(double value, Strip strip) {
    if (strip == Strip::First) {
        return round_(value / 2.55, 2);
    }
    const auto whole = MathLib::cast_value<std::int64_t>(std::floor(value / 2.55 + 0.5));
    return static_cast<std::uint16_t>(whole);
}

using Bytes = std::array<unsigned char, presetValueCount>;

/// Copies the flags as bytes: another vendor's library may store other values than 0 and 1.
Bytes bytesOf(const bool (&flags)[presetValueCount]) {
    static_assert(sizeof flags == sizeof(Bytes));
    Bytes bytes;
    std::memcpy(bytes.data(), flags, sizeof flags);
    return bytes;
}

/// The JDF marks every measurement as approved (C82). Another attribute shows whether it passed.
JDFMeasurementHeader headerOf(KZJobDataStruct& job, const analyseResultsRecord& results) {
    JDFMeasurementHeader header;
    JdfHandler::SetJDFMeasurementHeaderDefaults(&header);
    header.secondStrip = stripOf(job.secondStrip) == Strip::First ? 0 : 1;
    header.party = job.jobType != 0 ? 2 : 1;
    CharSets::stracpy(header.deltaEType, formulaName(job.measurement.deltaEType),
                      sizeof header.deltaEType);
    header.approval = true;
    header.totalPass = results.overallPassed;
    header.paperWhitePass = bytesOf(results.approvals)[paperWhite] != 0;
    header.maxTolerance = job.tolerance.presetValues[1];
    header.maxDeltaE = results.values[maximumDeltaE];
    header.averageTolerance = job.tolerance.presetValues[0];
    header.averageDeltaE = results.values[averageDeltaE];
    header.writePatchDefinitions = true;
    header.measurement = &job.measurement;
    return header;
}

/// Failures here do not affect the other steps (C83).
void updateJdf(CKZConnector& connector, KZJobDataStruct& job, const analyseResultsRecord& results) {
    JDFMeasurementHeader header = headerOf(job, results);
    JdfHandler::AppendJDFFileData(job, commentOf(stripOf(job.secondStrip)), &header, true);
    connector.UploadFile(job.jdfLocalFile, job.jdfServerFile);
}

int oneMore(int count) {
    return static_cast<int>(static_cast<unsigned>(count) + 1U); // Wraps around (C89).
}

/// Writes the verdict and its date and time. These are read one after the other, so midnight can
/// fall between them. Returns the code of the last write (C86).
int writeVerdict(const StripTicket& ticket, bool passed) {
    ticket.write("Approval", passed ? 1 : 0);
    ticket.write("Comment", commentOf(ticket.strip()));
    const wxString date = wxDateTime::Now().FormatISODate();
    ticket.write("Date", std::string(date.mb_str(wxConvLibc)));
    const wxString time = wxDateTime::Now().FormatISOTime();
    return ticket.write("Time", std::string(time.mb_str(wxConvLibc)));
}

/// A number of samples that does not fit a row is invalid.
bool hasSpectra(const measurementDataRecord& measurement) {
    return measurement.spectral != nullptr && measurement.numPatches > 0 &&
           measurement.spectral->length >= 0 && measurement.spectral->length <= spectralValueCount;
}

/// Writes the columns of one of the record's arrays, with `convert` applied to each value. `values`
/// is a buffer for one column.
template<class Convert>
void writeColumns(const StripTicket& ticket, std::span<const char* const> names, const double* rows,
                  int patches, double* values, Convert convert) {
    if (rows == nullptr) {
        return;
    }
    for (std::size_t column = 0; column < names.size(); ++column) {
        const double* value = rows + column;
        for (int i = 0; i < patches; ++i, value += names.size()) {
            values[i] = convert(*value);
        }
        ticket.writeArray(names[column], patches, values);
    }
}

/// Patches, including XYZ, Lab and device values, are written only if the measurement has spectra
/// (C88). The first patch determines the range of all spectra.
void writePatches(const StripTicket& ticket, const measurementDataRecord& measurement) {
    const spectralRow& first = measurement.spectral[0];
    const int patches = measurement.numPatches;
    ticket.write("SpectralValues/Stepsize", first.stepsize);
    ticket.write("SpectralValues/Base", first.base);
    ticket.write("SpectralValues/Length", first.length);
    ticket.write("Numpatches", patches);
    if (patches > mostPatches) {
        return;
    }
    const std::size_t count = static_cast<std::size_t>(patches) * std::max(first.length, 1);
    const std::unique_ptr<double[]> values(new (std::nothrow) double[count]);
    if (values == nullptr) {
        return;
    }
    double* end = values.get();
    for (int i = 0; i < patches; ++i) {
        end = std::copy_n(measurement.spectral[i].values, first.length, end);
    }
    ticket.writeArray(spectralArray, static_cast<int>(end - values.get()), values.get());

    const auto write = [&](std::span<const char* const> names, const double* rows, auto convert) {
        writeColumns(ticket, names, rows, patches, values.get(), convert);
    };
    write(xyzArrays, measurement.xyz, std::identity());
    write(labArrays, measurement.lab, std::identity());
    write(cmykArrays, measurement.cmyk,
          [&](double value) { return percentOf(value, ticket.strip()); });
}

void writeMeasured(const StripTicket& ticket, const tolerancePresetParameterRecord& tolerance,
                   const double (&results)[resultValueCount]) {
    const bool showsSpotMaximum =
        tolerance.fograPSDPreset == 0 || tolerance.usedForPSDResult[psdSpotMaximum] == 1;
    double measured[positionCount];
    for (int i = 0; i < positionCount; ++i) {
        const int value = valueAt(i, showsSpotMaximum);
        measured[i] = value == noValue ? -1.0 : results[value];
    }
    ticket.writeArray("Values/Measured", positionCount, measured);
}

/// Writes approvals or decimals. Those of a PSD preset have their own key and order.
void writeVerdicts(const StripTicket& ticket, const std::string& name, bool isPsd,
                   const Bytes& verdicts) {
    int numbers[positionCount];
    const int count = verdictCount(isPsd);
    for (int i = 0; i < count; ++i) {
        numbers[i] = verdicts[static_cast<std::size_t>(verdictAt(i, isPsd))];
    }
    ticket.writeArray((isPsd ? "Values/PSD" : "Values/") + name, count, numbers);
}

} // namespace

// Failed writes are skipped: the job continues without them (C90).
int KZVerifyJobProcessor::CopyResulDataToJobTicket(int jobID, KZJobDataStruct job,
                                                   analyseResultsRecord results, bool remeasure) {
    if (jobID < 0 || (job.secondStrip != 0 && job.secondStrip != 1)) {
        return 0;
    }
    const StripTicket ticket(m_connector, jobID, stripOf(job.secondStrip));
    if (job.measurementWorkflow == workflowWithJdf) {
        updateJdf(*m_connector, job, results);
    }
    if (!remeasure) {
        job.measurementStatus = oneMore(job.measurementStatus);
        ticket.write("Status", job.measurementStatus);
    }
    const int result = writeVerdict(ticket, results.overallPassed);
    if (hasSpectra(job.measurement)) {
        writePatches(ticket, job.measurement);
    }
    writeMeasured(ticket, job.tolerance, results.values);
    const bool isPsd = job.tolerance.fograPSDPreset != 0;
    writeVerdicts(ticket, "Approval", isPsd, bytesOf(results.approvals));
    writeVerdicts(ticket, "Decimal", isPsd, bytesOf(results.decimals));
    return result;
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

int KZVerifyJobProcessor::WrietErrorToJobTicket(int errorCode, int jobID) {
    constexpr const char* key = "Process/ErrorMessage";
    std::vector<std::string> messages;
    m_connector->GetJobTicketStringArray(jobType, jobID, key, &messages);
    std::string message = "k_TintgateError: " + std::to_string(errorCode);
    return m_connector->SetJobTicketKeyValue(jobType, jobID, key, PARAM_STRING, message.data(),
                                             static_cast<int>(messages.size()));
}
