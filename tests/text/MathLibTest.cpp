#include "text/MathLib.h"

#include <cmath>

#include <gtest/gtest.h>

#include "Csv.h"

namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();

double fromBits(const std::string& hex) {
    return std::bit_cast<double>(std::stoull(hex, nullptr, 16));
}

TEST(MathLib, RoundsAndConvertsLikeExactArithmetic) {
    for (const auto& row : support::readCsv("text/numbers.csv")) {
        const double value = fromBits(row[0]);
        SCOPED_TRACE(row[0]);
        EXPECT_EQ(MathLib::Round(value), fromBits(row[1]));
        EXPECT_EQ(MathLib::RoundToInt(value), std::stoi(row[3]));
        EXPECT_EQ(MathLib::RoundToUnsigned(value), std::stoul(row[4]));
        EXPECT_EQ(MathLib::RoundToI64(value), std::stoll(row[5]));
        EXPECT_EQ(MathLib::RoundToU64(value), std::stoull(row[6]));
        if (std::fabs(value) < 0x1p63) {
            EXPECT_EQ(MathLib::cast_value<long long>(value), std::stoll(row[2]));
        }
    }
    // Adding a half carries it over, though it is nearer to 0.
    EXPECT_EQ(MathLib::Round(0.49999999999999994), 1.0);
    EXPECT_FALSE(std::signbit(MathLib::Round(-0.0)));
}

TEST(MathLib, ConvertsUnsignedIntegersToTheNearestDouble) {
    for (const auto& row : support::readCsv("text/integers.csv")) {
        EXPECT_EQ(MathLib::U64ToDouble(std::stoull(row[0])), fromBits(row[1])) << row[0];
    }
}

TEST(MathLib, KeepsConversionsWithinTheirLimits) {
    for (const double value : {-infinity, -1e300, double(NAN)}) {
        EXPECT_EQ(MathLib::cast_value<int>(value), INT_MIN);
        EXPECT_EQ(MathLib::cast_value<unsigned int>(value), 0U);
        EXPECT_EQ(MathLib::cast_value<long long>(value), LLONG_MIN);
    }
    for (const double value : {infinity, 1e300, 0x1p63}) {
        EXPECT_EQ(MathLib::cast_value<int>(value), INT_MAX);
        EXPECT_EQ(MathLib::cast_value<unsigned int>(value), UINT_MAX);
        EXPECT_EQ(MathLib::cast_value<long long>(value), LLONG_MAX);
    }
    EXPECT_EQ(MathLib::cast_value<unsigned int>(-0.5), 0U);
    EXPECT_EQ(MathLib::DoubleToU64(-1.0), 0U);
    for (const double value : {1e30, infinity, -infinity, double(NAN)}) {
        EXPECT_EQ(MathLib::DoubleToU64(value), ULLONG_MAX);
    }
    EXPECT_EQ(MathLib::EpsilonFloorToUnsigned(-3.5, 1e-6), 0U);
    EXPECT_EQ(MathLib::EpsilonCeilToInt(1e10, 1e-6), INT_MAX);
}

TEST(MathLib, TellsNumbersFromWhatIsNone) {
    for (const double value : {infinity, -infinity, double(NAN), MathLib::NotANumber<double>()}) {
        EXPECT_TRUE(MathLib::IsNotANumber(value));
        EXPECT_TRUE(MathLib::IsNotANumber(static_cast<float>(value)));
    }
    for (const double value : {0.0, -1.0, 1.7976931348623157e308, 5e-324}) {
        EXPECT_FALSE(MathLib::IsNotANumber(value));
    }
    EXPECT_EQ(std::bit_cast<std::uint64_t>(MathLib::NOT_A_DOUBLE_NUMBER), 0x7FF8000000000000U);
    EXPECT_EQ(std::bit_cast<std::uint32_t>(MathLib::NOT_A_FLOAT_NUMBER), 0x7FC00000U);
}

TEST(MathLib, RoundsToGranularitiesAndWithinTolerances) {
    EXPECT_EQ(MathLib::RoundToBigGranularity(7.4, 0), 7.4);
    EXPECT_EQ(MathLib::RoundToBigGranularity(-7.5, 5), -10.0);
    EXPECT_EQ(MathLib::RoundToSmallGranularity(1.26, 10), 1.3);
    EXPECT_EQ(MathLib::RoundToSmallGranularity(1.26, 0), 1.26);

    EXPECT_EQ(MathLib::EpsilonFloor(2.9999999, 1e-6), 3.0);
    EXPECT_EQ(MathLib::EpsilonFloor(-3.0000001, 1e-6), -3.0);
    EXPECT_EQ(MathLib::EpsilonCeilToInt(3.0000001, 1e-6), 3);
    EXPECT_TRUE(MathLib::EpsilonEqual(90.0, 100.0, 0.1));  // 10 within a tenth of 100,
    EXPECT_FALSE(MathLib::EpsilonEqual(100.0, 90.0, 0.1)); // but not of 90
    EXPECT_FALSE(MathLib::ExplicitEpsilonEqual(1.0, 1.5, 0.25));
    EXPECT_EQ(MathLib::MagneticInt(1e-9, 1e-6), 0.0);
    EXPECT_EQ(MathLib::MagneticInt(1000000.5, 1e-6), 1000001.0);
    EXPECT_EQ(MathLib::MagneticInt(0.5, 1e-6), 0.5);

    EXPECT_EQ(MathLib::ResolutionToEncoderGranularity(300.0, 1000.0), 1000.0 / 3);
    EXPECT_TRUE(std::isnan(MathLib::ResolutionToEncoderGranularity(2000.0, 1000.0)));
    EXPECT_TRUE(std::isnan(MathLib::ResolutionToEncoderGranularity(-1.0, 1.0)));
}

TEST(Round_, GivesPercentWithTwoDecimals) {
    for (const auto& row : support::readCsv("text/percent.csv")) {
        EXPECT_NEAR(round_(std::stod(row[0]) / 2.55, 2), std::stod(row[1]), 2e-14) << row[0];
    }
    EXPECT_EQ(round_(-2.5, 0), -2.0);
    EXPECT_EQ(round_(2.5, 0), 3.0);
    EXPECT_EQ(round_(1250.0, -2), 1300.0);
}

} // namespace
