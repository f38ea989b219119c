// SPDX-License-Identifier: Apache-2.0
#include "colour/DataSet.h"

#include <utility>

namespace colour {

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
