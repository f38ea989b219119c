// SPDX-License-Identifier: Apache-2.0
// Rounding, comparison with a tolerance, safe conversion of doubles to integers (C168).
#pragma once

#include <bit>
#include <concepts>
#include <cstdint>
#include <limits>

namespace MathLib {

/// Represent a missing number. Their addresses are handed out and are the same everywhere.
inline constexpr double NOT_A_DOUBLE_NUMBER =
    std::bit_cast<double>(std::uint64_t{0x7FF8000000000000});
inline constexpr float NOT_A_FLOAT_NUMBER = std::bit_cast<float>(std::uint32_t{0x7FC00000});

/// True for NaNs and for both infinities (C156).
bool IsNotANumber(double value);
bool IsNotANumber(float value);

template<class T>
T NotANumber();
template<>
double NotANumber<double>();

/// Truncates toward zero and clamps to the range of T. A NaN gives the smallest T, so that the
/// result does not depend on the processor.
template<std::integral T>
constexpr T cast_value(double value) {
    using Limits = std::numeric_limits<T>;
    // As a double, the largest 64-bit integer becomes 2^63, one more than fits: hence >=.
    if (value >= static_cast<double>(Limits::max())) {
        return Limits::max();
    }
    if (!(value >= static_cast<double>(Limits::min()))) {
        return Limits::min();
    }
    return static_cast<T>(value);
}

/// To the nearest whole number, halves away from zero. -0.0 becomes 0.0.
double Round(double value);

int RoundToInt(double value);
unsigned int RoundToUnsigned(double value);
long long RoundToI64(double value);
unsigned long long RoundToU64(double value);

/// To the nearest multiple of granularity. If granularity is below 1, returns the value unchanged.
double RoundToBigGranularity(double value, int granularity);
/// To the nearest multiple of 1 / granularity. Same exception.
double RoundToSmallGranularity(double value, int granularity);

// A value within epsilon (relative to the value) of a whole number counts as that number.
double EpsilonFloor(double value, double epsilon);
double EpsilonCeil(double value, double epsilon);
int EpsilonFloorToInt(double value, double epsilon);
int EpsilonCeilToInt(double value, double epsilon);
unsigned int EpsilonFloorToUnsigned(double value, double epsilon);
unsigned int EpsilonCeilToUnsigned(double value, double epsilon);

/// The tolerance is relative to b alone, so the comparison is not symmetric (C157).
bool EpsilonEqual(double a, double b, double epsilon);
/// The tolerance is absolute.
bool ExplicitEpsilonEqual(double a, double b, double epsilon);

/// The nearest whole number if the value is within epsilon of it (a relative distance, but absolute
/// for 0), otherwise the value.
double MagneticInt(double value, double epsilon);

/// Truncates. Negative values give 0; 2^64 or more, infinities and NaNs the largest number.
unsigned long long DoubleToU64(double value);
/// The nearest double. Ties are rounded up.
double U64ToDouble(unsigned long long value);

/// The resolution nearest to the requested one that divides the encoder's resolution into whole
/// steps. Returns NaN if either is 0 or less, or if the requested resolution exceeds the encoder's.
double ResolutionToEncoderGranularity(double resolution, double encoder);

} // namespace MathLib

/// Rounds to `digits` decimals, halves up even for negative values: -2.5 gives -2. The result is
/// the product with a power of ten and keeps that product's binary remainder (C157). Don't merge it
/// with MathLib::RoundToSmallGranularity, which rounds halves away from zero and divides.
double round_(double value, int digits);
