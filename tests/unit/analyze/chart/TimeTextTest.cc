#include "chart/TimeText.h"

#include <gtest/gtest.h>

#include <limits>

namespace vantor::analyze {
namespace {

constexpr Microseconds second = 1000000;

TEST(RoundedTimeTest, HasThreeDigitsOrSoInAUnitThatSuits) {
    EXPECT_EQ(RoundedTime(0), "0 µs");
    EXPECT_EQ(RoundedTime(999), "999 µs");
    EXPECT_EQ(RoundedTime(1000), "1.00 ms");
    EXPECT_EQ(RoundedTime(12345), "12.3 ms");
    EXPECT_EQ(RoundedTime(123456), "123 ms");
    EXPECT_EQ(RoundedTime(1250000), "1.25 s");
    EXPECT_EQ(RoundedTime(59 * second), "59.0 s");
    EXPECT_EQ(RoundedTime(125 * second), "2 min 05 s");
    EXPECT_EQ(RoundedTime((3 * 3600 + 7 * 60) * second), "3 h 07 min");
    EXPECT_EQ(RoundedTime((12 * 24 + 4) * 3600 * second), "12 d 4 h");
}

TEST(RoundedTimeTest, TakesAnyValue) {
    EXPECT_EQ(RoundedTime(-1250000), "-1.25 s");
    EXPECT_EQ(RoundedTime(std::numeric_limits<Microseconds>::min()), "-106751991 d 4 h");
    EXPECT_EQ(RoundedTime(std::numeric_limits<Microseconds>::max()), "106751991 d 4 h");
}

TEST(ExactTimeTest, HasEveryMicrosecond) {
    EXPECT_EQ(ExactTime(0), "0.000 ms");
    EXPECT_EQ(ExactTime(12345), "12.345 ms");
    EXPECT_EQ(ExactTime(65000250), "65.000250 s");
    EXPECT_EQ(ExactTime(-42), "-0.042 ms");
    EXPECT_EQ(ExactTime(std::numeric_limits<Microseconds>::min()), "-9223372036854.775808 s");
}

}  // namespace
}  // namespace vantor::analyze
