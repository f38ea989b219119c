// SPDX-License-Identifier: Apache-2.0
// Rounding, comparing with a tolerance, and turning doubles into integers without overflow (C168).
#pragma once

#include <bit>
#include <concepts>
#include <cstdint>
#include <limits>

namespace MathLib {

/// What stands for a missing number. Their addresses are handed out, and are the same for all.
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

/// Truncates toward zero, within the limits of T: what lies outside gives the nearer limit, and a
/// NaN the smallest T (a processor would choose by itself).
template<std::integral T>
constexpr T cast_value(double value) {
    using Limits = std::numeric_limits<T>;
    // The largest 64-bit number becomes 2^63 as a double, one more than fits: hence >= and not >.
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

/// To the nearest multiple of granularity; one below 1 leaves the value as it is.
double RoundToBigGranularity(double value, int granularity);
/// To the nearest multiple of 1 / granularity; one below 1 leaves the value as it is.
double RoundToSmallGranularity(double value, int granularity);

// A value that misses a whole number by less than epsilon, relative to the value, counts as it.
double EpsilonFloor(double value, double epsilon);
double EpsilonCeil(double value, double epsilon);
int EpsilonFloorToInt(double value, double epsilon);
int EpsilonCeilToInt(double value, double epsilon);
unsigned int EpsilonFloorToUnsigned(double value, double epsilon);
unsigned int EpsilonCeilToUnsigned(double value, double epsilon);

/// Relative to b alone, so not symmetric (C157).
bool EpsilonEqual(double a, double b, double epsilon);
/// Absolute.
bool ExplicitEpsilonEqual(double a, double b, double epsilon);

/// The nearest whole number where the value is within epsilon of it (relative, except at 0), else
/// the value.
double MagneticInt(double value, double epsilon);

/// Truncates; negative values give 0, values from 2^64 on and all that is no number the largest.
unsigned long long DoubleToU64(double value);
/// The nearest double; halves between two doubles go up.
double U64ToDouble(unsigned long long value);

/// The resolution nearest to the wanted one that divides the encoder's in whole steps. Not a number
/// where either is 0 or less, or the resolution is above the encoder's.
double ResolutionToEncoderGranularity(double resolution, double encoder);

} // namespace MathLib

/// To `digits` decimals, halves up, for negative values too: -2.5 gives -2. The result is the
/// product with a power of ten and keeps that product's binary remainder (C157). Not to be merged
/// with MathLib::RoundToSmallGranularity, which rounds halves away from zero and divides.
double round_(double value, int digits);
