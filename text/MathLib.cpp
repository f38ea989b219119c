// SPDX-License-Identifier: Apache-2.0
#include "text/MathLib.h"

#include <cmath>

namespace MathLib {

bool IsNotANumber(double value) {
    constexpr std::uint64_t exponent = 0x7FF0000000000000;
    return (std::bit_cast<std::uint64_t>(value) & exponent) == exponent;
}

bool IsNotANumber(float value) {
    constexpr std::uint32_t exponent = 0x7F800000;
    return (std::bit_cast<std::uint32_t>(value) & exponent) == exponent;
}

template<>
double NotANumber<double>() {
    return NOT_A_DOUBLE_NUMBER;
}

double Round(double value) {
    constexpr double lastWithFraction = 4503599627370495.0; // 2^52 - 1
    if (std::fabs(value) > lastWithFraction) {
        return value;
    }
    if (value == 0.0) {
        return 0.0;
    }
    return value > 0.0 ? std::floor(0.5 + value) : -std::floor(-value + 0.5);
}

int RoundToInt(double value) {
    return cast_value<int>(Round(value));
}

unsigned int RoundToUnsigned(double value) {
    return cast_value<unsigned int>(Round(value));
}

long long RoundToI64(double value) {
    return cast_value<long long>(Round(value));
}

unsigned long long RoundToU64(double value) {
    return DoubleToU64(Round(value));
}

double RoundToBigGranularity(double value, int granularity) {
    return granularity < 1 ? value : Round(value / granularity) * granularity;
}

double RoundToSmallGranularity(double value, int granularity) {
    return granularity < 1 ? value : Round(value * granularity) / granularity;
}

double EpsilonFloor(double value, double epsilon) {
    return std::floor(value + std::fabs(value * epsilon));
}

double EpsilonCeil(double value, double epsilon) {
    return std::ceil(value - std::fabs(value * epsilon));
}

int EpsilonFloorToInt(double value, double epsilon) {
    return cast_value<int>(EpsilonFloor(value, epsilon));
}

int EpsilonCeilToInt(double value, double epsilon) {
    return cast_value<int>(EpsilonCeil(value, epsilon));
}

unsigned int EpsilonFloorToUnsigned(double value, double epsilon) {
    return cast_value<unsigned int>(EpsilonFloor(value, epsilon));
}

unsigned int EpsilonCeilToUnsigned(double value, double epsilon) {
    return cast_value<unsigned int>(EpsilonCeil(value, epsilon));
}

bool EpsilonEqual(double a, double b, double epsilon) {
    return std::fabs(a - b) <= std::fabs(b) * epsilon;
}

bool ExplicitEpsilonEqual(double a, double b, double epsilon) {
    return std::fabs(a - b) <= epsilon;
}

double MagneticInt(double value, double epsilon) {
    const double nearest = Round(value);
    // At 0 a relative distance has no meaning.
    const bool near = nearest == 0.0 ? ExplicitEpsilonEqual(value, nearest, epsilon)
                                     : EpsilonEqual(value, nearest, epsilon);
    return near ? nearest : value;
}

unsigned long long DoubleToU64(double value) {
    constexpr double lastBelow2To64 = 18446744073709549568.0;
    constexpr double lastBelow2To63 = 9223372036854774784.0;
    if (IsNotANumber(value)) {
        return ~0ULL;
    }
    if (value < 0.0) {
        return 0;
    }
    if (value > lastBelow2To64) {
        return ~0ULL;
    }
    if (value > lastBelow2To63) {
        // From 2^63 on, the mantissa with its hidden bit is the upper 53 bits of the number.
        return std::bit_cast<std::uint64_t>(value) << 11 | 0x8000000000000000;
    }
    return static_cast<unsigned long long>(static_cast<long long>(value));
}

double U64ToDouble(unsigned long long value) {
    constexpr std::uint64_t topBit = 0x8000000000000000;
    if (value < topBit) {
        return static_cast<double>(static_cast<long long>(value));
    }
    // The lower 63 bits, rounded to the 52 bits of a mantissa without a carry into the exponent.
    const std::uint64_t lower = value & ~topBit;
    const std::uint64_t rounded = lower >= 0x7FFFFFFFFFFFFC00 ? ~topBit : lower + 1024;
    return std::bit_cast<double>(rounded >> 11 | 0x43E0000000000000);
}

double ResolutionToEncoderGranularity(double resolution, double encoder) {
    if (resolution <= 0.0 || encoder <= 0.0 || resolution > encoder) {
        return NotANumber<double>();
    }
    return encoder / RoundToInt(encoder / resolution);
}

} // namespace MathLib

double round_(double value, int digits) {
    return std::floor(value * std::pow(10, digits) + 0.5) * std::pow(10, -digits);
}
