// SPDX-License-Identifier: Apache-2.0
// Screen colours.
#pragma once

#include <cstdint>

#include "colour/DataSet.h"

namespace report {

struct Swatch {
    std::uint8_t red = 0;
    std::uint8_t green = 0;
    std::uint8_t blue = 0;
    bool clipped = false; ///< The colour is outside sRGB; this is the nearest by channel.
};

/// sRGB (IEC 61966-2-1) of a colour under D50: CIELAB to XYZ with the white of ICC profiles, then
/// the linear Bradford adaptation to D65 and the primaries of sRGB in one matrix (from Bruce
/// Lindbloom's tables). A colour counts as outside if a channel is out of range by more than half a
/// step of 255. A colour that is not finite gives clipped black.
Swatch swatch(const colour::Lab& lab);

} // namespace report
