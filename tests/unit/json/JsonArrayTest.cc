#include <gtest/gtest.h>

#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::ArrayOf;
using support::Failed;
using support::ValueOf;

TEST(JsonArrayTest, EmptyArray) {
    EXPECT_EQ(ArrayOf("[]"), Accepted("[]"));
    EXPECT_EQ(ArrayOf("[ /**/ ]x"), Accepted("[]", "x"));
}

TEST(JsonArrayTest, ElementsStandInDocumentOrder) {
    EXPECT_EQ(ArrayOf(R"([3,"b",1,"a",[2,[]],{"k":[]},true,false,null,3])"),
              Accepted(R"([3, "b", 1, "a", [2, []], {"k": []}, true, false, null, 3])"));
}

TEST(JsonArrayTest, AnotherFirstByteFailsAndIsConsumed) {
    EXPECT_EQ(ArrayOf("x[]"), Failed("[none]", "[]"));
    EXPECT_EQ(ArrayOf(" []"), Failed("[none]", "[]"));
    EXPECT_EQ(ArrayOf(""), Failed("[none]"));
}

TEST(JsonArrayTest, OneCommaMayFollowTheBracketAtOnce) {
    EXPECT_EQ(ArrayOf("[,]"), Accepted("[]"));
    EXPECT_EQ(ArrayOf("[, 1]"), Accepted("[1]"));
}

TEST(JsonArrayTest, OneCommaMayFollowACommaAtOnce) {
    EXPECT_EQ(ArrayOf("[1,,2]"), Accepted("[1, 2]"));
    EXPECT_EQ(ArrayOf("[1,,]"), Accepted("[1]"));
    EXPECT_EQ(ArrayOf("[1 ,, 2]"), Accepted("[1, 2]"));
}

TEST(JsonArrayTest, TrailingCommaIsAccepted) {
    EXPECT_EQ(ArrayOf("[1,]"), Accepted("[1]"));
    EXPECT_EQ(ArrayOf("[1 , ]x"), Accepted("[1]", "x"));
}

// A comma too many is an element without a kind, and that wants a comma behind it in turn.
TEST(JsonArrayTest, CommaAfterABlankIsAnElementWithoutAKind) {
    EXPECT_EQ(ArrayOf("[1, ,]"), Accepted("[1, none]"));
    EXPECT_EQ(ArrayOf("[1, ,,2]"), Accepted("[1, none, 2]"));
    EXPECT_EQ(ArrayOf("[ ,]"), Accepted("[none]"));
    EXPECT_EQ(ArrayOf("[1,/**/,]"), Accepted("[1, none]"));
    EXPECT_EQ(ArrayOf("[1, ,2]"), Failed("[none]", "]"));
}

TEST(JsonArrayTest, ThirdCommaInARowIsAnElementWithoutAKind) {
    EXPECT_EQ(ArrayOf("[1,,,]"), Accepted("[1, none]"));
    EXPECT_EQ(ArrayOf("[,,]"), Accepted("[none]"));
    EXPECT_EQ(ArrayOf("[1,,,2]"), Failed("[none]", "]"));
    EXPECT_EQ(ArrayOf("[,,2]"), Failed("[none]", "]"));
}

TEST(JsonArrayTest, ElementThatBeginsNoValueHasNoKind) {
    EXPECT_EQ(ArrayOf("[1, }]"), Accepted("[1, none]"));
    EXPECT_EQ(ArrayOf("[x]"), Accepted("[none]"));
    EXPECT_EQ(ArrayOf("[:,+,.,}]"), Accepted("[none, none, none, none]"));
    EXPECT_EQ(ArrayOf("[xy]"), Failed("[none]", "]"));
}

TEST(JsonArrayTest, MissingCommaFailsAtTheNextElement) {
    EXPECT_EQ(ArrayOf("[1 2]"), Failed("[none]", "]"));
    EXPECT_EQ(ArrayOf("[\"a\"\"b\"]"), Failed("[none]", "b\"]"));
}

TEST(JsonArrayTest, AnotherClosingByteFailsAndIsConsumed) {
    EXPECT_EQ(ArrayOf("[1}x"), Failed("[none]", "x"));
    EXPECT_EQ(ArrayOf("[1:2]"), Failed("[none]", "2]"));
}

TEST(JsonArrayTest, LeavesItsOutputWhenItFails) {
    EXPECT_EQ(ArrayOf("["), Failed("[none]"));
    EXPECT_EQ(ArrayOf("[1"), Failed("[none]"));
    EXPECT_EQ(ArrayOf("[1,"), Failed("[none]"));
    EXPECT_EQ(ArrayOf("[1, nul"), Failed("[none]"));
    EXPECT_EQ(ArrayOf("[[1]"), Failed("[none]"));
}

TEST(JsonArrayTest, NothingBehindTheClosingBracketIsRead) {
    EXPECT_EQ(ValueOf("[]]garbage"), Accepted("[]", "]garbage"));
}

TEST(JsonArrayTest, FailedReadLeavesAValueWithoutAKind) {
    EXPECT_EQ(ValueOf("[1"), Failed("none"));
    EXPECT_EQ(ValueOf("[1 2]"), Failed("none", "]"));
}

}  // namespace

}  // namespace vantor
