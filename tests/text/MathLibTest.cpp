// SPDX-License-Identifier: Apache-2.0
#include "text/MathLib.h"

#include <cmath>

#include <gtest/gtest.h>

#include "Csv.h"

using namespace MathLib;

namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();

double fromBits(const std::string& hex) {
    return std::bit_cast<double>(std::stoull(hex, nullptr, 16));
}

} // namespace

TEST(MathLib, RoundsAndConvertsLikeExactArithmetic) {
    for (const auto& row : support::readCsv("text/numbers.csv")) {
        const double value = fromBits(row[0]);
        SCOPED_TRACE(row[0]);
        EXPECT_EQ(Round(value), fromBits(row[1]));
        EXPECT_EQ(RoundToInt(value), std::stoi(row[3]));
        EXPECT_EQ(RoundToUnsigned(value), std::stoul(row[4]));
        EXPECT_EQ(RoundToI64(value), std::stoll(row[5]));
        EXPECT_EQ(RoundToU64(value), std::stoull(row[6]));
    }
    for (const auto& row : support::readCsv("text/integers.csv")) {
        EXPECT_EQ(U64ToDouble(std::stoull(row[0])), fromBits(row[1])) << row[0];
    }
    // Adding a half rounds up to 1, although it is nearer to 0.
    EXPECT_EQ(Round(0.49999999999999994), 1.0);
}

TEST(MathLib, KeepsConversionsWithinTheirLimits) {
    for (const double value : {-infinity, -1e300, double(NAN)}) {
        EXPECT_EQ(cast_value<int>(value), INT_MIN);
        EXPECT_EQ(cast_value<unsigned int>(value), 0U);
        EXPECT_EQ(cast_value<long long>(value), LLONG_MIN);
    }
    for (const double value : {infinity, 1e300, 0x1p63}) {
        EXPECT_EQ(cast_value<int>(value), INT_MAX);
        EXPECT_EQ(cast_value<long long>(value), LLONG_MAX);
    }
    EXPECT_EQ(DoubleToU64(-1.0), 0U);
    for (const double value : {1e30, infinity, -infinity, double(NAN)}) {
        EXPECT_EQ(DoubleToU64(value), ULLONG_MAX);
        EXPECT_NE(IsNotANumber(value), value == 1e30);
        EXPECT_NE(IsNotANumber(static_cast<float>(value)), value == 1e30);
    }
}

TEST(MathLib, RoundsToGranularitiesAndWithinTolerances) {
    EXPECT_EQ(RoundToBigGranularity(7.4, 0), 7.4);
    EXPECT_EQ(RoundToBigGranularity(-7.5, 5), -10.0);
    EXPECT_EQ(RoundToSmallGranularity(1.26, 10), 1.3);

    EXPECT_EQ(EpsilonFloor(999999.5, 1e-6), 1000000.0);
    EXPECT_EQ(EpsilonCeilToInt(1000000.5, 1e-6), 1000000);
    EXPECT_TRUE(EpsilonEqual(90.0, 100.0, 0.1));  // 10 within a tenth of 100,
    EXPECT_FALSE(EpsilonEqual(100.0, 90.0, 0.1)); // but not of 90
    EXPECT_EQ(MagneticInt(1e-9, 1e-6), 0.0);
    EXPECT_EQ(MagneticInt(0.5, 1e-6), 0.5);
    EXPECT_EQ(MagneticInt(1000000.5, 1e-6), 1000001.0);

    EXPECT_EQ(ResolutionToEncoderGranularity(300.0, 1000.0), 1000.0 / 3);
    EXPECT_TRUE(std::isnan(ResolutionToEncoderGranularity(2000.0, 1000.0)));
}

TEST(Round_, GivesPercentWithTwoDecimals) {
    for (const auto& row : support::readCsv("text/percent.csv")) {
        EXPECT_NEAR(round_(std::stod(row[0]) / 2.55, 2), std::stod(row[1]), 2e-14) << row[0];
    }
    EXPECT_EQ(round_(-2.5, 0), -2.0);
    EXPECT_EQ(round_(1250.0, -2), 1300.0);
}
