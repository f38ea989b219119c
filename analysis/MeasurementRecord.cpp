// SPDX-License-Identifier: Apache-2.0
#include "analysis/MeasurementRecord.h"

#include <algorithm>
#include <cstdlib>
#include <new>
#include <utility>

namespace analysis {
namespace {

using colour::DataSet;
using colour::SpectralAxis;

/// Zeroed memory for an array that will be freed with free().
template<class T>
base::Malloced<T[]> allocate(std::size_t count) {
    auto* const memory = static_cast<T*>(std::calloc(std::max<std::size_t>(count, 1), sizeof(T)));
    if (!memory) {
        throw std::bad_alloc();
    }
    return base::Malloced<T[]>(memory);
}

/// Which values of a long spectrum make a short one.
struct Thinned {
    int first = 0;
    int every = 1;
    SpectralAxis axis; ///< length 0: no way to fit.
};

Thinned thinned(const SpectralAxis& axis) {
    if (axis.length <= spectralValueCount) {
        return {.axis = axis};
    }
    constexpr int from = 380;
    constexpr int to = 730;
    constexpr int step = 10;
    if (axis.step <= 0 || step % axis.step != 0) {
        return {};
    }
    const int end = axis.base + (axis.length - 1) * axis.step;
    // The first wavelength in range that is a whole ten.
    const int base = std::max(from, (axis.base + step - 1) / step * step);
    if ((base - axis.base) % axis.step != 0 || base > end) {
        return {};
    }
    const int length = (std::min(end, to) - base) / step + 1;
    return {.first = (base - axis.base) / axis.step,
            .every = step / axis.step,
            .axis = {.base = base, .step = step, .length = length}};
}

/// Where a row of the record comes from.
struct Origin {
    std::uint32_t row = noRow;   ///< Of the measurement's set; noRow where that is a profile.
    std::uint32_t patch = noRow; ///< Of the comparison; noRow where it was compared with nothing.
};

std::vector<Origin> originsOf(const Comparison& c) {
    const bool isSet = c.measurement.file.set != nullptr;
    const bool asCompared = !isSet || c.selection == &c.patchSet;
    std::vector<Origin> origins(asCompared ? c.patchCount() : c.measurement.file.set->patchCount);
    if (!asCompared) {
        for (std::uint32_t row = 0; row < origins.size(); ++row) {
            origins[row].row = row;
        }
    }
    for (std::uint32_t patch = 0; patch < c.patchCount(); ++patch) {
        const std::uint32_t row = isSet ? c.measurement.rows[patch] : noRow;
        origins[asCompared ? patch : row] = {row, patch};
    }
    for (const FurtherReading& reading : c.furtherReadings) {
        if (asCompared) {
            origins.push_back({reading.row, reading.patch});
        } else {
            origins[reading.row].patch = reading.patch;
        }
    }
    return origins;
}

void fillColours(const Comparison& c, const std::vector<Origin>& origins, double* xyz,
                 double* lab) {
    for (const Origin& origin : origins) {
        const bool isSet = origin.row != noRow;
        const colour::Lab from =
            isSet ? c.measurement.file.set->lab[origin.row] : c.measuredAsIs(origin.patch);
        const colour::Xyz tristimulus =
            isSet ? c.measurement.file.set->xyz[origin.row] : colour::xyzFromLab(from);
        *xyz++ = tristimulus.X;
        *xyz++ = tristimulus.Y;
        *xyz++ = tristimulus.Z;
        *lab++ = from.L;
        *lab++ = from.a;
        *lab++ = from.b;
    }
}

/// Process colours of a row: the measurement's own, else those that it was compared under.
const double* processColours(const Comparison& c, const Origin& origin) {
    if (origin.row != noRow && c.measurement.file.set->hasCmyk()) {
        return &c.measurement.file.set
                    ->device[origin.row * c.measurement.file.set->channels.size()];
    }
    if (origin.patch != noRow && c.devices && c.devices->file.set->hasCmyk()) {
        return c.deviceOf(origin.patch);
    }
    return nullptr;
}

void fillCmyk(const Comparison& c, const std::vector<Origin>& origins, double* cmyk) {
    for (const Origin& origin : origins) {
        if (const double* const device = processColours(c, origin)) {
            std::transform(device, device + 4, cmyk, [](double value) { return value * 2.55; });
        }
        cmyk += 4;
    }
}

void fillSpectra(const DataSet& set, const Thinned& spectra, const std::vector<Origin>& origins,
                 spectralRow* rows) {
    const auto length = static_cast<std::size_t>(set.axis.length);
    for (const Origin& origin : origins) {
        spectralRow& row = *rows++;
        row.base = spectra.axis.base;
        row.stepsize = spectra.axis.step;
        row.length = spectra.axis.length;
        const double* const from = &set.spectra[origin.row * length];
        for (int i = 0; i < row.length; ++i) {
            row.values[i] = from[spectra.first + i * spectra.every];
        }
    }
}

} // namespace

MeasuredPatches measuredPatches(const Comparison& c) {
    const std::vector<Origin> origins = originsOf(c);
    MeasuredPatches patches;
    patches.count = static_cast<int>(origins.size());
    patches.xyz = allocate<double>(origins.size() * 3);
    patches.lab = allocate<double>(origins.size() * 3);
    patches.cmyk = allocate<double>(origins.size() * 4);
    fillColours(c, origins, patches.xyz.get(), patches.lab.get());
    fillCmyk(c, origins, patches.cmyk.get());

    if (!c.measurement.file.set) {
        return patches;
    }
    const DataSet& set = *c.measurement.file.set;
    if (const Thinned spectra = thinned(set.axis); spectra.axis.length > 0) {
        patches.spectral = allocate<spectralRow>(origins.size());
        fillSpectra(set, spectra, origins, patches.spectral.get());
    }
    return patches;
}

void storeMeasurement(MeasuredPatches patches, int deltaEType, measurementDataRecord& record) {
    std::free(record.xyz);
    std::free(record.lab);
    std::free(record.cmyk);
    std::free(record.spectral);
    std::free(std::exchange(record.reservedValues, nullptr));
    record.numPatches = patches.count;
    record.hasSpectral = patches.spectral ? 1 : 0;
    record.xyz = patches.xyz.release();
    record.lab = patches.lab.release();
    record.cmyk = patches.cmyk.release();
    record.spectral = patches.spectral.release();
    record.deltaEType = deltaEType;
}

} // namespace analysis
