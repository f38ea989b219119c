// SPDX-License-Identifier: Apache-2.0
// Loads the values that a job's ticket has for one of its strips, measured or reference, into the
// record: one array of a key in the ticket is one column of the record.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <span>
#include <string>
#include <string_view>
#include <utility>

#include "base/Malloc.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/PatchArrays.h"
#include "jobkeys/StripKeys.h"

using namespace jobkeys;

namespace {

using Columns = std::span<const char* const>;

/// Rows of zeros. Null if memory runs out.
template<class T>
base::Malloced<T[]> makeRows(int patches, std::size_t width) {
    const std::size_t count = static_cast<std::size_t>(patches) * std::max<std::size_t>(width, 1);
    return base::Malloced<T[]>(
        patches > mostPatches ? nullptr : static_cast<T*>(std::calloc(count, sizeof(T))));
}

/// One data set of a job's strip.
class StoredSet {
  public:
    StoredSet(CKZConnector* connector, const KZJobDataStruct& job, std::string_view folder)
        : m_ticket(connector, job.jobID), m_root(measurementKey(stripOf(job.secondStrip), folder)) {
    }

    int read(const char* name, int* value) const { return m_ticket.read(m_root + name, 0, value); }

    template<class T>
    int readArray(const char* name, int maximum, T* values) const {
        return m_ticket.readArray(m_root + name, maximum, values);
    }

  private:
    const JobTicket m_ticket;
    const std::string m_root;
};

template<class T>
void freeArray(T*& values) {
    std::free(std::exchange(values, nullptr));
}

/// Empties the record and reads the number of patches into it, or 0 if there is none.
int startRecord(const StoredSet& stored, measurementDataRecord* record) {
    freeArray(record->spectral);
    freeArray(record->xyz);
    freeArray(record->lab);
    freeArray(record->cmyk);
    record->hasSpectral = 0;
    record->numPatches = 0;
    int count = 0;
    const int code = stored.read("Numpatches", &count);
    if (code == 0 && count > 0) {
        record->numPatches = count;
    }
    return code;
}

/// Fills all rows; the first one contains the range. False if the ticket has fewer values.
bool fillSpectra(const StoredSet& stored, int patches, spectralRow* rows) {
    const spectralRow& first = rows[0];
    const int count = patches * first.length;
    const auto values = makeRows<double>(patches, static_cast<std::size_t>(first.length));
    if (values == nullptr || stored.readArray(spectralArray, count, values.get()) != count) {
        return false;
    }
    const double* next = values.get();
    for (spectralRow& row : std::span(rows, static_cast<std::size_t>(patches))) {
        row.base = first.base;
        row.stepsize = first.stepsize;
        row.length = first.length;
        std::copy_n(next, first.length, row.values);
        next += first.length;
    }
    return true;
}

/// Returns the code of the first failed read; the values after it are not read and stay 0. Unless
/// all values of all spectra are present, only the first row's range is set (C45).
int loadSpectra(const StoredSet& stored, measurementDataRecord* record) {
    auto rows = makeRows<spectralRow>(record->numPatches, 1);
    if (rows == nullptr) {
        return 0;
    }
    constexpr std::pair<const char*, int spectralRow::*> range[] = {
        {"SpectralValues/Base", &spectralRow::base},
        {"SpectralValues/Length", &spectralRow::length},
        {"SpectralValues/Stepsize", &spectralRow::stepsize},
    };
    int code = 0;
    for (const auto& [name, member] : range) {
        if (code == 0) {
            code = stored.read(name, &(rows[0].*member));
        }
    }
    if (rows[0].length < 0 || rows[0].length > spectralValueCount) {
        return code; // Does not fit a row, so there are no spectra.
    }
    if (code == 0 && fillSpectra(stored, record->numPatches, rows.get())) {
        record->hasSpectral = 1;
    }
    record->spectral = rows.release();
    return code;
}

double rowValue(double stored) {
    return stored;
}

/// Reference device values are stored as 0 to 255 but used in whole percent (C46).
double rowValue(int stored) {
    const auto percent = static_cast<std::int64_t>(std::floor(stored / 2.55 + 0.5));
    return static_cast<std::uint16_t>(percent);
}

/// Rows with one value per column. Missing values stay 0 (C44); without mayRead, all of them.
template<class Stored>
double* loadRows(const StoredSet& stored, Columns columns, int patches, bool mayRead) {
    auto rows = makeRows<double>(patches, columns.size());
    const auto values = makeRows<Stored>(patches, 1);
    if (mayRead && rows != nullptr && values != nullptr) {
        for (std::size_t i = 0; i < columns.size(); ++i) {
            const int count = stored.readArray(columns[i], patches, values.get());
            double* to = &rows[i];
            for (int patch = 0; patch < count; ++patch, to += columns.size()) {
                *to = rowValue(values[static_cast<std::size_t>(patch)]);
            }
        }
    }
    return rows.release();
}

template<class StoredDevice>
void loadColumns(const StoredSet& stored, measurementDataRecord* record, bool mayRead) {
    const int patches = record->numPatches;
    record->xyz = loadRows<double>(stored, xyzArrays, patches, mayRead);
    record->lab = loadRows<double>(stored, labArrays, patches, mayRead);
    record->cmyk = loadRows<StoredDevice>(stored, cmykArrays, patches, mayRead);
}

} // namespace

int KZVerifyJobProcessor::LoadKZJobMeasurements(KZJobDataStruct* job) {
    if (job->jobID < 0) {
        return 0;
    }
    const StoredSet stored(m_connector, *job, "");
    int code = startRecord(stored, &job->measurement);
    if (job->measurement.numPatches > 0) {
        code = loadSpectra(stored, &job->measurement);
        loadColumns<double>(stored, &job->measurement, code == 0);
    }
    return code;
}

int KZVerifyJobProcessor::LoadKZJobReferences(KZJobDataStruct* job) {
    if (job->jobID < 0) {
        return 0;
    }
    const StoredSet stored(m_connector, *job, "Reference/");
    const int code = startRecord(stored, &job->measurement);
    if (job->measurement.numPatches > 0) {
        loadColumns<int>(stored, &job->measurement, true);
    }
    return code;
}

void KZVerifyJobProcessor::FreeMeasurementData(KZJobDataStruct job) {
    measurementDataRecord& measurement = job.measurement;
    freeArray(measurement.spectral);
    freeArray(measurement.xyz);
    freeArray(measurement.lab);
    freeArray(measurement.cmyk);
    freeArray(measurement.reservedValues);
}
