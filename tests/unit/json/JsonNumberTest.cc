// Numbers are what the stream's own extraction of a double makes of them.

#include <gtest/gtest.h>

#include <limits>

#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::Failed;
using support::NumberOf;
using support::Show;
using support::ValueOf;

TEST(JsonNumberTest, SignFractionAndExponent) {
    EXPECT_EQ(NumberOf("0"), Accepted("0"));
    EXPECT_EQ(NumberOf("42"), Accepted("42"));
    EXPECT_EQ(NumberOf("-42"), Accepted("-42"));
    EXPECT_EQ(NumberOf("1.5"), Accepted("1.5"));
    EXPECT_EQ(NumberOf("-0.25e2"), Accepted("-25"));
    EXPECT_EQ(NumberOf("5E+3"), Accepted("5000"));
    EXPECT_EQ(NumberOf("5e-1"), Accepted("0.5"));
    EXPECT_EQ(NumberOf("-0"), Accepted("-0"));
}

TEST(JsonNumberTest, StopsAtTheFirstByteThatCannotContinueIt) {
    EXPECT_EQ(NumberOf("1,2"), Accepted("1", ",2"));
    EXPECT_EQ(NumberOf("1]"), Accepted("1", "]"));
    EXPECT_EQ(NumberOf("1 2"), Accepted("1", " 2"));
    EXPECT_EQ(NumberOf("1/2"), Accepted("1", "/2"));
    EXPECT_EQ(NumberOf("1-2"), Accepted("1", "-2"));
    EXPECT_EQ(NumberOf("1.5.2"), Accepted("1.5", ".2"));
    EXPECT_EQ(NumberOf("1e2e3"), Accepted("100", "e3"));
    EXPECT_EQ(NumberOf("1e2.5"), Accepted("100", ".5"));
    EXPECT_EQ(NumberOf("12x"), Accepted("12", "x"));
    EXPECT_EQ(NumberOf("1\xff"), Accepted("1", "\xff"));
}

TEST(JsonNumberTest, LeadingZerosAreDigits) {
    EXPECT_EQ(NumberOf("007"), Accepted("7"));
    EXPECT_EQ(NumberOf("-00.5"), Accepted("-0.5"));
    EXPECT_EQ(NumberOf("010"), Accepted("10"));
}

TEST(JsonNumberTest, HexadecimalEndsAfterItsZero) {
    EXPECT_EQ(NumberOf("0x1p3"), Accepted("0", "x1p3"));
}

TEST(JsonNumberTest, PointNeedsADigitOnOneSideOnly) {
    EXPECT_EQ(NumberOf("1."), Accepted("1"));
    EXPECT_EQ(ValueOf("[1.]"), Accepted("[1]"));
    EXPECT_EQ(ValueOf("-.5"), Accepted("-0.5"));
}

TEST(JsonNumberTest, NumberWithoutDigitsFails) {
    EXPECT_EQ(NumberOf("-"), Failed("0"));
    EXPECT_EQ(NumberOf("-]"), Failed("0", "]"));
    EXPECT_EQ(NumberOf("--1"), Failed("0", "-1"));
    EXPECT_EQ(NumberOf("-x"), Failed("0", "x"));
    EXPECT_EQ(NumberOf("-."), Failed("0"));
}

TEST(JsonNumberTest, ExponentWithoutDigitsFails) {
    EXPECT_EQ(NumberOf("1e"), Failed("0"));
    EXPECT_EQ(NumberOf("1e]"), Failed("0", "]"));
    EXPECT_EQ(NumberOf("1e+"), Failed("0"));
    EXPECT_EQ(NumberOf("1e-x"), Failed("0", "x"));
}

TEST(JsonNumberTest, EmptyInputFailsAndLeavesTheOutput) {
    EXPECT_EQ(NumberOf(""), Failed("7"));
    EXPECT_EQ(NumberOf(" "), Failed("7"));
}

TEST(JsonNumberTest, LargestMagnitudes) {
    EXPECT_EQ(NumberOf("1e300"), Accepted(Show(1e300)));
    EXPECT_EQ(NumberOf("-1e300"), Accepted(Show(-1e300)));
    EXPECT_EQ(NumberOf("1.7976931348623157e308"),
              Accepted(Show(std::numeric_limits<double>::max())));
}

TEST(JsonNumberTest, OverflowFailsWithTheNearestLimit) {
    EXPECT_EQ(NumberOf("1e999]"), Failed(Show(std::numeric_limits<double>::max()), "]"));
    EXPECT_EQ(NumberOf("-1e999"), Failed(Show(std::numeric_limits<double>::lowest())));
    EXPECT_EQ(ValueOf("1e999"), Failed("none"));
    EXPECT_EQ(ValueOf("[-1e999]"), Failed("none", "]"));
}

TEST(JsonNumberTest, UnderflowIsZero) { EXPECT_EQ(NumberOf("1e-999"), Accepted("0")); }

TEST(JsonNumberTest, ManyDigitsAreRounded) {
    EXPECT_EQ(NumberOf(std::string(400, '9') + "e-400"), Accepted("1"));
    EXPECT_EQ(NumberOf("0." + std::string(5000, '0') + "1e5001"), Accepted("1"));
}

// The extraction itself takes white space and a plus sign; no value begins with either.
TEST(JsonNumberTest, ExtractionOnItsOwnTakesMoreThanAValueMay) {
    EXPECT_EQ(NumberOf(" \n+1"), Accepted("1"));
    EXPECT_EQ(NumberOf(".5"), Accepted("0.5"));
    EXPECT_EQ(ValueOf("+1"), Accepted("none", "1"));
    EXPECT_EQ(ValueOf(".5"), Accepted("none", "5"));
}

TEST(JsonNumberTest, ValueOfTheNumberKind) {
    for (const std::string digit : {"0", "1", "2", "3", "4", "5", "6", "7", "8", "9"}) {
        EXPECT_EQ(ValueOf(digit + " x"), Accepted(digit, " x"));
    }
    EXPECT_EQ(ValueOf("-3.5e1,"), Accepted("-35", ","));
    EXPECT_EQ(ValueOf("-"), Failed("none"));
    EXPECT_EQ(ValueOf("[1e]"), Failed("none", "]"));
}

}  // namespace

}  // namespace vantor
