// true, false and null.

#include <gtest/gtest.h>

#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::BoolOf;
using support::Failed;
using support::NullOf;
using support::ValueOf;

TEST(JsonBoolTest, TrueLeavesTheFifthByteInTheStream) {
    EXPECT_EQ(BoolOf("true,", false), Accepted("true", ","));
    EXPECT_EQ(BoolOf("truex", false), Accepted("true", "x"));
    EXPECT_EQ(BoolOf("true\xff", false), Accepted("true", "\xff"));
    EXPECT_EQ(BoolOf("truetrue", false), Accepted("true", "true"));
}

TEST(JsonBoolTest, FalseConsumesItsFiveBytes) {
    EXPECT_EQ(BoolOf("false", true), Accepted("false"));
    EXPECT_EQ(BoolOf("falsex", true), Accepted("false", "x"));
}

TEST(JsonBoolTest, TrueAtTheEndOfTheInputFails) {
    EXPECT_EQ(BoolOf("true", false), Failed("false"));
    EXPECT_EQ(ValueOf("true"), Failed("none"));
    EXPECT_EQ(ValueOf("[true"), Failed("none"));
}

TEST(JsonBoolTest, FewerThanFiveBytesFail) {
    for (const std::string text : {"", "t", "tru", "f", "fals"}) {
        EXPECT_EQ(BoolOf(text, true), Failed("true")) << text;
        EXPECT_EQ(BoolOf(text, false), Failed("false")) << text;
    }
}

TEST(JsonBoolTest, AnyOtherFiveBytesAreConsumedAndFail) {
    for (const std::string text : {"trux,", "falsy", "False", "TRUE,", "t1111", " true", "xtrue"}) {
        EXPECT_EQ(BoolOf(text + "rest", true), Failed("true", "rest")) << text;
        EXPECT_EQ(BoolOf(text + "rest", false), Failed("false", "rest")) << text;
    }
    EXPECT_EQ(BoolOf("nulls", false), Failed("false"));
}

TEST(JsonBoolTest, ValueOfTheBooleanKind) {
    EXPECT_EQ(ValueOf(" truex"), Accepted("true", "x"));
    EXPECT_EQ(ValueOf(" false"), Accepted("false"));
    EXPECT_EQ(ValueOf("tries on"), Failed("none", " on"));
    EXPECT_EQ(ValueOf("[true,false,true]"), Accepted("[true, false, true]"));
}

TEST(JsonNullTest, ReadsFourBytes) {
    EXPECT_EQ(NullOf("null"), Accepted(""));
    EXPECT_EQ(NullOf("nullx"), Accepted("", "x"));
}

TEST(JsonNullTest, FewerThanFourBytesFail) {
    for (const std::string text : {"", "n", "nul"}) {
        EXPECT_EQ(NullOf(text), Failed("")) << text;
    }
}

TEST(JsonNullTest, AnyOtherFourBytesAreConsumedAndFail) {
    for (const std::string text : {"nulx", "NULL", " nul", "true", "nil,"}) {
        EXPECT_EQ(NullOf(text + "rest"), Failed("", "rest")) << text;
    }
}

TEST(JsonNullTest, ValueOfTheNullKind) {
    EXPECT_EQ(ValueOf(" null"), Accepted("null"));
    EXPECT_EQ(ValueOf("nullnull"), Accepted("null", "null"));
    EXPECT_EQ(ValueOf("nul"), Failed("none"));
    EXPECT_EQ(ValueOf("[nul]"), Failed("none"));
    EXPECT_EQ(ValueOf("[null,null]"), Accepted("[null, null]"));
}

}  // namespace

}  // namespace vantor
