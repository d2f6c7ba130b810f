// Numbers are what the stream's own extraction of a double makes of them.

#include <gtest/gtest.h>

#include <cstring>
#include <limits>
#include <locale>
#include <random>
#include <sstream>

#include "json/JsonReader.h"
#include "json/JsonText.h"
#include "json/TestBuffers.h"

namespace vantor {

namespace {

using support::Accepted;
using support::Failed;
using support::NumberOf;
using support::RestOf;
using support::Show;
using support::StateOf;
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

// What a read of the text leaves: the number's own bytes, the stream's state, the place in it.
template <typename Operation>
std::string TraceOf(const std::string& text, const std::locale& locale, Operation read) {
    std::istringstream stream(text);
    stream.imbue(locale);
    double number = 7.0;
    read(stream, number);
    std::string trace(sizeof number, '\0');
    std::memcpy(trace.data(), &number, sizeof number);
    trace += stream.eof() ? " end " : " ";
    return trace + StateOf(stream) + " before " + RestOf(*stream.rdbuf());
}

void ExpectAsExtracted(const std::string& text, const std::locale& locale) {
    const auto extract = [](std::istream& stream, double& number) { stream >> number; };
    EXPECT_EQ(TraceOf(text, locale, ReadNumber), TraceOf(text, locale, extract)) << text;
}

// Numbers, near numbers and what may follow them, mixed from the bytes that matter.
TEST(JsonNumberTest, AnyTextGivesWhatTheExtractionGives) {
    constexpr int rounds = 200'000;
    const std::string bytes = "0123456789012345678900..-+eE, ]x";
    std::mt19937 random(20'240'517);
    for (int round = 0; round < rounds && !::testing::Test::HasFailure(); ++round) {
        std::string text(1 + random() % 24, '\0');
        for (char& byte : text) {
            byte = bytes[random() % bytes.size()];
        }
        ExpectAsExtracted(text, std::locale::classic());
    }
}

// As many digits as tell one double from the next, and more: the rounding is the same.
TEST(JsonNumberTest, AnyDoubleGivesWhatTheExtractionGives) {
    constexpr int rounds = 100'000;
    std::mt19937_64 random(20'240'517);
    for (int round = 0; round < rounds && !::testing::Test::HasFailure(); ++round) {
        const std::uint64_t bits = random();
        double number = 0.0;
        std::memcpy(&number, &bits, sizeof number);
        std::ostringstream text;
        text.precision(static_cast<int>(1 + random() % 25));
        text << number << ",";
        ExpectAsExtracted(text.str(), std::locale::classic());
    }
}

TEST(JsonNumberTest, TextOfEveryLengthGivesWhatTheExtractionGives) {
    for (int exponent = -400; exponent <= 400; ++exponent) {
        ExpectAsExtracted("-1e" + std::to_string(exponent) + ",", std::locale::classic());
        ExpectAsExtracted("4.9406564584124654e" + std::to_string(exponent) + "]",
                          std::locale::classic());
    }
    for (std::size_t length = 1; length <= 1000; ++length) {
        ExpectAsExtracted(std::string(length, '9') + " ", std::locale::classic());
        ExpectAsExtracted("0." + std::string(length, '0') + "12345678901234567 ",
                          std::locale::classic());
    }
}

// A stream with a locale of its own reads its numbers by it.
TEST(JsonNumberTest, LocaleOfTheStreamIsTheExtractionsOwn) {
    struct Punctuation : std::numpunct<char> {
        char do_decimal_point() const override { return ','; }
        char do_thousands_sep() const override { return '.'; }
        std::string do_grouping() const override { return "\3"; }
    };
    const std::locale locale(std::locale::classic(), new Punctuation);
    std::istringstream stream("1.234,5 ");
    stream.imbue(locale);
    double number = 0.0;
    ReadNumber(stream, number);
    EXPECT_EQ(number, 1234.5);
    for (const std::string text : {"1,5]", "1.5]", "12.34 ", "1.234.567,25 ", "-1,e2 "}) {
        ExpectAsExtracted(text, locale);
    }
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
