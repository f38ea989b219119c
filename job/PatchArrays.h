// The arrays in which a ticket holds a strip's patches: below the root of the measurement, or of
// its references, one key for each column, with one element for each patch.
#pragma once

/// Arrays of more patches count as memory that is not there.
inline constexpr int mostPatches = 1'000'000;

inline constexpr const char* xyzArrays[] = {"XYZValues/XValues", "XYZValues/YValues",
                                            "XYZValues/ZValues"};
inline constexpr const char* labArrays[] = {"LabValues/LValues", "LabValues/AValues",
                                            "LabValues/BValues"};
inline constexpr const char* cmykArrays[] = {"CMYKValues/CValues", "CMYKValues/MValues",
                                             "CMYKValues/YValues", "CMYKValues/KValues"};
inline constexpr const char* spectralArray = "SpectralValues/DValues"; ///< Patch after patch.
