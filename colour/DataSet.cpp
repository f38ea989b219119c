// SPDX-License-Identifier: Apache-2.0
#include "colour/DataSet.h"

#include <algorithm>
#include <utility>

namespace colour {

const double* DataSet::spectrumOf(std::size_t row) const {
    if (spectra.empty()) {
        return nullptr;
    }
    if (!spectrumRows.empty()) {
        const auto at = std::lower_bound(spectrumRows.begin(), spectrumRows.end(), row);
        if (at == spectrumRows.end() || *at != row) {
            return nullptr;
        }
        row = static_cast<std::size_t>(at - spectrumRows.begin());
    }
    return &spectra[row * static_cast<std::size_t>(axis.length)];
}

DataSet chartOf(DataSet set) {
    DataSet chart;
    chart.patchCount = set.patchCount;
    chart.ids = std::move(set.ids);
    chart.names = std::move(set.names);
    chart.deviceSpace = set.deviceSpace;
    chart.channels = std::move(set.channels);
    chart.device = std::move(set.device);
    return chart;
}

} // namespace colour
