// SPDX-License-Identifier: Apache-2.0
// For any bytes: no crash, no hang, and a data set that is complete, finite and survives writing.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "Require.h"
#include "colour/CgatsText.h"

using namespace colour;

namespace {

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

    const auto finite = [](double value) { return std::isfinite(value); };
    require(std::all_of(set.device.begin(), set.device.end(), finite), "finite device values");
    require(std::all_of(set.spectra.begin(), set.spectra.end(), finite), "finite spectra");
    for (std::size_t i = 0; i < set.lab.size(); ++i) {
        const Lab& lab = set.lab[i];
        const Xyz& xyz = set.xyz[i];
        require(finite(lab.L) && finite(lab.a) && finite(lab.b), "finite Lab");
        require(finite(xyz.X) && finite(xyz.Y) && finite(xyz.Z), "finite XYZ");
    }
}

void checkWriting(const DataSet& set) {
    DataSet back;
    const Failure failure = readCgats(writeCgats(set), {}, back);
    // Derived values may exceed the range that a file may state.
    const bool isLarge = std::any_of(set.xyz.begin(), set.xyz.end(), [](const Xyz& xyz) {
        return std::abs(xyz.X) > 1e9 || std::abs(xyz.Y) > 1e9 || std::abs(xyz.Z) > 1e9;
    });
    require(failure == Failure::None || isLarge, "reading back");
    if (failure != Failure::None) {
        return;
    }
    require(back.patchCount == set.patchCount, "patches read back");
    require(back.channels == set.channels && back.device == set.device, "device read back");
    require(set.ids.empty() || back.ids == set.ids, "ids read back");
    require(back.names == set.names, "names read back");
    // If statements cancelled out, the one that is written may now be the only one.
    const auto kept = [](const std::string& before, const std::string& after) {
        return before.empty() || before == after;
    };
    require((set.calculated || kept(set.conditions.illuminant, back.conditions.illuminant)) &&
                (set.calculated || kept(set.conditions.observer, back.conditions.observer)) &&
                kept(set.conditions.measurement, back.conditions.measurement),
            "conditions read back");
    require(back.originator == set.originator && back.created == set.created, "texts read back");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    DataSet all;
    const Failure failure = readCgats(bytes, {}, all);
    if (failure == Failure::None) {
        checkWhole(all);
        checkWriting(all);
        require(looksLikeCgats(bytes), "recognised");
    }
    DataSet some;
    if (readCgats(bytes, {false}, some) == Failure::None) {
        checkWhole(some);
    }
    cgatsKeyword(bytes, "DEVICE");
    return 0;
}
