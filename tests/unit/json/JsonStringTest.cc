#include <gtest/gtest.h>

#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::Failed;
using support::Show;
using support::StringOf;
using support::ValueOf;

TEST(JsonStringTest, BytesBetweenTheQuotesAreTheText) {
    EXPECT_EQ(StringOf("\"\"x"), Accepted("\"\"", "x"));
    EXPECT_EQ(StringOf("\"some text\", x"), Accepted("\"some text\"", ", x"));
}

TEST(JsonStringTest, AnotherFirstByteFailsAndIsConsumed) {
    EXPECT_EQ(StringOf("ab"), Failed("\"old\"", "b"));
    EXPECT_EQ(StringOf(" \"a\""), Failed("\"old\"", "\"a\""));
    EXPECT_EQ(StringOf("'a'"), Failed("\"old\"", "a'"));
    EXPECT_EQ(StringOf("\xff\"a\""), Failed("\"old\"", "\"a\""));
}

TEST(JsonStringTest, EmptyInputFails) { EXPECT_EQ(StringOf(""), Failed("\"old\"")); }

TEST(JsonStringTest, KnownEscapesGiveTheirByte) {
    EXPECT_EQ(StringOf(R"("\"\/\\")"), Accepted(R"(""/\")"));
    EXPECT_EQ(StringOf(R"("\b\f\n\r\t")"), Accepted(R"("\x08\x0c\x0a\x0d\x09")"));
    EXPECT_EQ(StringOf(R"("a\tb")"), Accepted(R"("a\x09b")"));
}

TEST(JsonStringTest, UnicodeEscapeGivesItsDigitsAsOrdinaryBytes) {
    EXPECT_EQ(StringOf(R"("\u00e9")"), Accepted(R"("00e9")"));
    EXPECT_EQ(StringOf(R"("\u0041")"), Accepted(R"("0041")"));
    EXPECT_EQ(StringOf(R"("\u")"), Accepted(R"("")"));
    EXPECT_EQ(StringOf(R"("\uu\u\"")"), Accepted(R"("u"")"));
}

TEST(JsonStringTest, UnknownEscapeKeepsItsBackslash) {
    EXPECT_EQ(StringOf(R"("\q")"), Accepted(R"("\q")"));
    EXPECT_EQ(StringOf(R"("\B\0\a\U\'\ ")"), Accepted(R"("\B\0\a\U\'\ ")"));
    EXPECT_EQ(StringOf("\"\\\n\\\xc3\""), Accepted(R"("\\x0a\\xc3")"));
    EXPECT_EQ(StringOf(std::string("\"\\\0\"", 4)), Accepted(R"("\\x00")"));
}

TEST(JsonStringTest, EveryByteButQuoteAndBackslashIsTakenAsItIs) {
    std::string all;
    for (int byte = 0; byte < 256; ++byte) {
        if (byte != '"' && byte != '\\') {
            all += static_cast<char>(byte);
        }
    }
    EXPECT_EQ(StringOf("\"" + all + "\"x"), Accepted(Show(all), "x"));
}

// However far the end of a run of plain bytes is looked for at a time.
TEST(JsonStringTest, TextOfAnyLengthMayStandBeforeAQuoteOrAnEscape) {
    for (std::size_t length = 0; length <= 1100; length += length % 64 < 3 ? 1 : 61) {
        const std::string plain(length, 'x');
        EXPECT_EQ(StringOf("\"" + plain + "\" y"), Accepted("\"" + plain + "\"", " y"));
        EXPECT_EQ(StringOf("\"" + plain + "\\\"" + plain + "\\q\""),
                  Accepted("\"" + plain + "\"" + plain + "\\q\""));
        EXPECT_EQ(StringOf("\"" + plain), Failed("\"old\""));
    }
}

TEST(JsonStringTest, LineEndsMayStandInAString) {
    EXPECT_EQ(StringOf("\"a\nb\rc\""), Accepted(R"("a\x0ab\x0dc")"));
}

TEST(JsonStringTest, NoEncodingIsChecked) {
    EXPECT_EQ(StringOf("\"\xc3\xa9\xed\xa0\x80\xfe\""), Accepted(R"("\xc3\xa9\xed\xa0\x80\xfe")"));
}

TEST(JsonStringTest, MissingClosingQuoteFailsAndLeavesTheOutput) {
    EXPECT_EQ(StringOf("\""), Failed("\"old\""));
    EXPECT_EQ(StringOf("\"abc"), Failed("\"old\""));
    EXPECT_EQ(StringOf("\"abc\\\""), Failed("\"old\""));
}

TEST(JsonStringTest, BackslashAtTheEndOfTheInputFails) {
    EXPECT_EQ(StringOf("\"abc\\"), Failed("\"old\""));
    EXPECT_EQ(StringOf("\"\\u"), Failed("\"old\""));
}

TEST(JsonStringTest, ValueOfTheStringKind) {
    EXPECT_EQ(ValueOf(" \"a\\nb\" x"), Accepted(R"("a\x0ab")", " x"));
    EXPECT_EQ(ValueOf("\"a"), Failed("none"));
}

}  // namespace

}  // namespace vantor
