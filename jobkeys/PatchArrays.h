// SPDX-License-Identifier: Apache-2.0
// The arrays in which a ticket stores a strip's patches, below the root of the measurement or of
// its references. Each key is one column with one element per patch.
#pragma once

namespace jobkeys {

/// The maximum length of an array. A larger number counts as a failed allocation.
inline constexpr int mostPatches = 1'000'000;

inline constexpr const char* xyzArrays[] = {"XYZValues/XValues", "XYZValues/YValues",
                                            "XYZValues/ZValues"};
inline constexpr const char* labArrays[] = {"LabValues/LValues", "LabValues/AValues",
                                            "LabValues/BValues"};
inline constexpr const char* cmykArrays[] = {"CMYKValues/CValues", "CMYKValues/MValues",
                                             "CMYKValues/YValues", "CMYKValues/KValues"};
inline constexpr const char* spectralArray = "SpectralValues/DValues"; ///< Patch after patch.

} // namespace jobkeys
