// SPDX-License-Identifier: Apache-2.0
// For any bytes: no crash, no hang, and a data set that is complete and finite.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "Require.h"
#include "colour/Cxf.h"

using namespace colour;

namespace {

bool allFinite(const std::vector<double>& values) {
    return std::all_of(values.begin(), values.end(),
                       [](double value) { return std::isfinite(value); });
}

void checkWhole(const DataSet& set) {
    const std::size_t count = set.patchCount;
    const auto fits = [&](std::size_t size) { return size == 0 || size == count; };
    require(count > 0, "patches");
    require(set.hasColour() || set.hasDevice(), "values");
    require(fits(set.ids.size()) && fits(set.names.size()), "labels");
    require(fits(set.lab.size()) && set.xyz.size() == set.lab.size(), "colours");
    require(set.device.size() == count * set.channels.size(), "device values");
    require(set.spectra.size() == count * static_cast<std::size_t>(set.axis.length), "spectra");
    require(set.hasDevice() != set.channels.empty(), "channels");
    require(!set.hasCmyk() || set.channels.size() >= 4, "process channels");
    require(allFinite(set.device) && allFinite(set.spectra), "finite values");
    for (const Lab& lab : set.lab) {
        require(std::isfinite(lab.L) && std::isfinite(lab.a) && std::isfinite(lab.b),
                "finite L*a*b*");
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    for (const CgatsWants& wants :
         {CgatsWants{}, CgatsWants{.spectra = false, .condition = "M2"}}) {
        DataSet set;
        if (readCxf(bytes, wants, set) == Failure::None) {
            checkWhole(set);
            require(looksLikeCxf(bytes), "recognised");
        }
    }
    return 0;
}
