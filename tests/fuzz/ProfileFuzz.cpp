// SPDX-License-Identifier: Apache-2.0
// Profiles from any bytes: opened or refused. An opened one gives colours or a failure.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "colour/Profile.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string bytes(reinterpret_cast<const char*>(data), size);
    if (bytes.size() >= 128) { // repairs the header, so that damage reaches the tags
        bytes.replace(36, 4, "acsp").replace(12, 8, "prtrCMYK");
        for (std::size_t i = 0; i < 4; ++i) {
            bytes[i] = static_cast<char>(size >> (24 - 8 * i));
        }
    }
    colour::Profile profile;
    if (profile.open(bytes) != colour::Failure::None) {
        return 0;
    }
    const double inks[] = {0, 0, 0, 0, 100, 0, 0, 0, 33, 77, 12.5, 1, 100, 100, 100, 100};
    colour::Lab labs[4];
    if (profile.evaluate(inks, 4, 4, labs) != colour::Failure::None) {
        return 0;
    }
    for (const colour::Lab& lab : labs) {
        if (!(std::abs(lab.L) < 1e5 && std::abs(lab.a) < 1e5 && std::abs(lab.b) < 1e5)) {
            std::abort();
        }
    }
    return 0;
}
