// SPDX-License-Identifier: Apache-2.0
// Presets from any bytes: read or refused, without any other effect.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "ExitCodes.h"
#include "analysis/Presets.h"

namespace {

void require(bool condition) {
    if (!condition) {
        std::abort();
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    tolerancePresetParameterRecord record;
    record.presetID = -5;
    record.name = "before";
    record.presetValues[0] = 0.5;
    const int status = analysis::parsePreset(bytes, false, record);
    if (status != exitDone) {
        require(status >= exitPresetNotXml && status <= exitPresetUnknownEntry);
        require(record.presetID == -5 && record.name == "before" && record.presetValues[0] == 0.5);
        return 0;
    }
    require(record.presetID >= 0 && !record.name.empty());
    for (const double value : record.presetValues) {
        require(value >= 0 && value <= 1000);
    }
    for (const double value : record.psdPresetValues) {
        require(value >= 0 && value <= 1000);
    }
    for (const int places : record.decimalPlaces) {
        require(places >= 0 && places <= 10);
    }
    return 0;
}
